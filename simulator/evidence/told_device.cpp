#include "evidence/told_device.h"

#include "evidence/statements.h"
#include "language/names.h"
#include "language/words.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <set>

namespace
{
constexpr int64_t US_PER_S = 1'000'000;
constexpr const char *MISSING = "missing";
constexpr const char *MISSING_ITEM = " missing";

// A value of the device as a statement sets it: "nv battery_value=" and "80", "cfg 6000" and "=80" or " missing".
struct setting {
    std::string statement;
    std::string value;
};

std::string scenario_text(const std::string &text)
{
    return text == MISSING ? "\"missing\"" : scenario_word(text);
}

std::string answer_numbers(const trace_entry &entry)
{
    return entry.result.starts_with("0, ") ? entry.result.substr(3) : MISSING;
}

std::string answer_text(const trace_entry &entry)
{
    const size_t text = entry.result.find('"');
    return text == std::string::npos ? MISSING : scenario_text(quoted_texts(entry.result)[0]);
}

// What an entry says of the device that a scenario can set. None when it says nothing.
std::optional<setting> setting_of(const trace_entry &entry)
{
    const std::vector<std::string> texts = quoted_texts(entry.arguments);
    if (entry.call == "kiv_nvconfig_read" && !texts.empty()) {
        return setting{"nv " + texts[0] + "=", answer_text(entry)};
    }
    if (entry.call == "kiv_cfg_get_item") {
        const std::string item = entry.arguments.substr(0, entry.arguments.find(','));
        const size_t behind = entry.result.find(", ");
        if (behind == std::string::npos) {
            return setting{"cfg " + item, MISSING_ITEM};
        }
        const bool text = entry.result.find('"') != std::string::npos;
        return setting{"cfg " + item, "=" + (text ? answer_text(entry) : entry.result.substr(behind + 2))};
    }
    if (entry.call == "kiv_bsp_get_sensor_temp_sync") {
        return setting{"sensor " + entry.arguments + " ", answer_numbers(entry)};
    }
    if (entry.call == "kiv_bsp_get_charger_connect_status_sync") {
        return setting{"charger ", answer_numbers(entry)};
    }
    if (entry.call == "kiv_bsp_get_battery_online_status_sync") {
        return setting{"battery ", answer_numbers(entry)};
    }
    if (entry.call == "open" && entry.result.starts_with("-")) {
        return setting{"sys led:rolling_leds ", MISSING};
    }
    if (entry.call == "read") {
        const std::vector<std::string> told = quoted_texts(entry.result);
        return setting{"sys led:rolling_leds ", told.empty() ? MISSING : std::to_string(atoi(told[0].c_str()))};
    }
    return std::nullopt;
}

std::string value_in(const told_device &device, const std::string &statement)
{
    const auto known = device.values.find(statement);
    if (known != device.values.end()) {
        return known->second;
    }
    return statement == "cfg 531" ? "=1" : statement.starts_with("cfg ") ? MISSING_ITEM : MISSING;
}

// The statement that makes a call fail as an entry did.
std::string fail_statement(const trace_entry &entry)
{
    const std::string match = entry.arguments.substr(0, entry.arguments.find('\''));
    return "fail " + entry.call + " " + scenario_word(match.empty() ? "*" : match) + " " +
           entry.result.substr(0, entry.result.find(','));
}

// A result that is a failure and not an answer of the device's own.
bool is_fault(const trace_entry &entry)
{
    constexpr std::array reads = {"kiv_nvconfig_read",
                                  "kiv_bsp_get_sensor_temp_sync",
                                  "kiv_cfg_get_item",
                                  "system",
                                  "kiv_bsp_get_charger_connect_status_sync",
                                  "kiv_bsp_get_battery_online_status_sync",
                                  "open",
                                  "read",
                                  "time",
                                  "pthread_self",
                                  "pthread_create"};
    if (entry.result.empty() || std::find(reads.begin(), reads.end(), entry.call) != reads.end()) {
        return false;
    }
    if (entry.call == "kiv_timer") {
        return entry.result == "0";
    }
    return entry.call == "kiv_reg_proc" ? entry.result != "1" : entry.result[0] == '-';
}

// What the wall clock must show at a moment, so that an entry finds what it found. None when it does anyhow; by how
// much of a second it was past the full one, nobody knows.
std::optional<int64_t> clock_for(const told_device &device, const trace_entry &entry, int64_t moment_us)
{
    if (entry.call != "time") {
        return std::nullopt;
    }
    const int64_t found_s = parse_number(entry.result, 0, INT64_MAX / US_PER_S).value_or(0);
    const int64_t shown_s = (device.wall_offset_us + entry.time_us) / US_PER_S;
    if (device.wall_offset_us != INT64_MIN && std::abs(found_s - shown_s) <= 1) {
        return std::nullopt;
    }
    return found_s - (entry.time_us - moment_us) / US_PER_S;
}

std::string clock_statement(int64_t seconds)
{
    std::array<char, 64> text;
    std::tm utc = {};
    const auto moment = static_cast<std::time_t>(seconds);
    gmtime_r(&moment, &utc);
    strftime(text.data(), text.size(), "clock %Y-%m-%d %H:%M:%S\n", &utc);
    return text.data();
}

std::string statement_of(const setting &one)
{
    for (const product_name &product : all_products()) {
        if (one.statement == "cfg 6000" && one.value == "=" + std::string(product.cfg_text)) {
            return "product " + std::string(product.name);
        }
    }
    return one.statement + one.value;
}
} // namespace

std::string settings_for(told_device &device, const recording &trace, size_t from, size_t to, int64_t now_us)
{
    std::string text;
    std::map<std::string, int> faults;
    std::set<std::string> seen;
    for (size_t at = from; at < to; at++) {
        const trace_entry &entry = trace.entries[at];
        if (is_fault(entry)) {
            faults[fail_statement(entry)]++;
        }
        if (const auto seconds = clock_for(device, entry, now_us)) {
            text += clock_statement(*seconds);
            device.wall_offset_us = *seconds * US_PER_S - now_us;
        }
        const std::optional<setting> read = setting_of(entry);
        if (read && seen.insert(read->statement).second && value_in(device, read->statement) != read->value) {
            text += statement_of(*read) + "\n";
            device.values[read->statement] = read->value;
        }
    }
    for (const auto &[statement, times] : faults) {
        text += statement + " " + std::to_string(times) + "\n";
    }
    return text;
}

void take_effect(told_device &device, const trace_entry &entry)
{
    const std::vector<std::string> texts = quoted_texts(entry.arguments);
    if (entry.call == "kiv_nvconfig_write" && entry.result == "0" && texts.size() == 2) {
        device.values["nv " + texts[0] + "="] = scenario_text(texts[1]);
    }
    if (entry.call == "system" && !texts.empty() && texts[0].find("rolling_leds") != std::string::npos) {
        device.values["sys led:rolling_leds "] = "1";
    }
}
