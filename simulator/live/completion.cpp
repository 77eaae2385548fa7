#include "live/completion.h"

#include "language/names.h"
#include "live/help.h"

#include <algorithm>
#include <filesystem>
#include <sstream>

namespace fs = std::filesystem;

namespace
{
using words = std::vector<std::string>;

// Of a list as the names are told: "MAIN, PPP, SMS".
words split_list(const std::string &list)
{
    words names;
    std::string name;
    for (std::istringstream in(list); std::getline(in, name, ',');) {
        names.push_back(name.substr(name.find_first_not_of(' ')));
    }
    return names;
}

words all_leds()
{
    words names;
    for (const led_row &led : led_rows) {
        names.emplace_back(led.name);
    }
    return names;
}

void add_once(words &list, std::string_view word)
{
    if (!word.empty() && std::find(list.begin(), list.end(), word) == list.end()) {
        list.emplace_back(word);
    }
}

// The words that help shows behind that one; behind none, the statements themselves.
words from_help(std::string_view statement)
{
    words list;
    for (const help_row &row : help_rows()) {
        std::istringstream in{std::string(row.example)};
        std::string first;
        std::string second;
        in >> first >> second;
        if (statement.empty()) {
            add_once(list, first);
        } else if (first == statement && !find_led(second)) {
            add_once(list, second);
        }
    }
    return list;
}

// The shortest tail of each name that still means it.
words events_of(std::string_view module_name)
{
    words list;
    const module_row *module = find_module(module_name);
    if (!module) {
        return list;
    }
    for (const std::string &name : split_list(event_names(module->module_id))) {
        std::string_view tail = name;
        for (size_t at = name.rfind('_'); at != std::string::npos && at > 0; at = name.rfind('_', at - 1)) {
            if (find_event(module->module_id, name.substr(at + 1))) {
                tail = std::string_view(name).substr(at + 1);
                break;
            }
        }
        list.emplace_back(tail);
    }
    return list;
}

words files_of(const std::string &folder, const std::string &behind)
{
    words list;
    std::error_code failure;
    for (const fs::directory_entry &entry : fs::directory_iterator(folder, failure)) {
        const std::string name = entry.path().filename().string();
        if (!name.starts_with('.')) {
            list.push_back(name + behind);
        }
    }
    std::sort(list.begin(), list.end());
    return list;
}

words looks_or_leds(const std::string &last)
{
    return find_led(last) ? words{"on", "off", "blink"} : all_leds();
}

words expected(const words &said, const std::string &device)
{
    if (said.size() == 1) {
        words list = from_help("expect");
        const words leds = all_leds();
        list.insert(list.end(), leds.begin(), leds.end());
        return list;
    }
    if (said[1] == "nv") {
        return files_of(device + "/nv", "=");
    }
    if (said[1] == "sent") {
        return split_list(module_names());
    }
    const bool of_leds = said[1] == "only" || find_led(said[1]);
    return of_leds ? looks_or_leds(said.back()) : words{};
}
} // namespace

std::vector<std::string> candidates(std::string_view before, const std::string &device)
{
    words said;
    std::istringstream in{std::string(before)};
    for (std::string word; in >> word;) {
        said.push_back(word);
    }
    if (!said.empty() && !before.ends_with(' ')) {
        said.pop_back(); // it is the one to be completed
    }
    if (said.empty()) {
        words list = from_help("");
        list.insert(list.end(), {"help", "leds", "quit"});
        return list;
    }
    const std::string &statement = said[0];
    if (statement == "expect") {
        return expected(said, device);
    }
    if (statement == "notify") {
        return said.size() == 1 ? split_list(module_names()) : said.size() == 2 ? events_of(said[1]) : words{};
    }
    if (statement == "nv") {
        return files_of(device + "/nv", "=");
    }
    if (said.size() > 1) {
        return {};
    }
    if (statement == "help") {
        return from_help("");
    }
    return statement == "command"   ? split_list(command_names())
           : statement == "product" ? split_list(product_names())
                                    : from_help(statement);
}
