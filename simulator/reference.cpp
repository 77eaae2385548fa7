#include "reference.h"

#include "language/vocabulary.h"
#include "table.h"

#include <algorithm>
#include <cstdio>
#include <map>

namespace
{
// What sets the daemon to work, and what products make of it.
struct stimulus {
    int module_id; // 0 for commands and indications, which nobody registers for
    uint32_t event;
    std::string statement;
    std::string name;
    std::string text;
};

struct found {
    unsigned heard_by = 0;
    std::map<std::string, unsigned> reads; // NV key, and the products that read it
};

// On and awake, with a full store of messages, so that nothing keeps a handler from looking at its values, and done
// with what the last stimulus has begun.
constexpr std::string_view BEFORE = "after 10s\n"
                                    "notify unregistered MAIN POWERON\n"
                                    "notify unregistered SLEEP 0\n"
                                    "notify unregistered SMS MEMORY_FULL\n";

std::string module_name_of(int module_id)
{
    for (const module_row &row : module_rows) {
        if (row.module_id == module_id) {
            return row.name;
        }
    }
    return {};
}

// With a text that means something; a device must sleep in order to wake up.
std::string spoken(const std::string &notification, const text_word *word)
{
    if (!word || !word->only.empty()) {
        return notification + (word ? " \"PHONE BLINK\"" : "");
    }
    if (word->module_id == KIV_MODULE_SLEEP) {
        return notification + " 1\n" + notification + " 5\n" + notification + " 0";
    }
    return notification + " 1";
}

std::vector<stimulus> all_stimuli()
{
    std::vector<stimulus> all;
    for (const event_name &event : all_events()) {
        const std::string module = module_name_of(event.module_id);
        const std::string name = module + " " + event_word(event.module_id, event.value);
        const text_word *word = find_text_word(event.module_id, event.value);
        all.push_back({event.module_id, event.value, spoken("notify unregistered " + name, word), "notify " + name,
                       word ? std::string(word->meaning) : ""});
    }
    for (const command_name &command : all_commands()) {
        const std::string statement = "command " + std::string(command.name);
        all.push_back({0, 0, statement, statement, ""});
    }
    for (int id = INDICATION_FIRST; id <= INDICATION_LAST; id++) {
        const std::string statement = "indication " + std::to_string(id);
        all.push_back({0, 0, statement, statement, std::string(indication_meaning(id))});
    }
    return all;
}

bool play_text(player &p, const std::string &text)
{
    scenario story;
    std::string error;
    const auto no_include = [](const std::string &, std::string &) { return false; };
    if (!parse_scenario(text, "words", no_include, story, error)) {
        fprintf(stderr, "%s\n", error.c_str());
        return false;
    }
    for (const statement &s : story.statements) {
        const played did = play_statement(p, story, s);
        if (did.result != PLAY_HELD) {
            fputs(did.failure.c_str(), stderr);
            return false;
        }
    }
    return true;
}

bool is_log_line(const trace_entry &entry)
{
    return entry.call == "kiv_syslog_append";
}

bool ask(player &p, const product_name &product, const std::vector<stimulus> &stimuli, std::vector<found> &all)
{
    if (!play_text(p, switched_on(product) + "nv night_mode_switch=1\n")) {
        return false;
    }
    for (size_t at = 0; at < stimuli.size(); at++) {
        const stimulus &s = stimuli[at];
        observed &seen = p.device.state;
        if (!play_text(p, std::string(BEFORE))) {
            return false;
        }
        seen.nv_read.clear();
        begin_step(seen);
        if (!play_text(p, s.statement)) {
            return false;
        }
        const bool logged = std::any_of(seen.step.begin(), seen.step.end(), is_log_line);
        if (s.module_id != 0 ? is_heard(p.device.wires, s.module_id, s.event) : logged) {
            all[at].heard_by |= product.mask;
        }
        for (const std::string &key : seen.nv_read) {
            all[at].reads[key] |= product.mask & all[at].heard_by;
        }
    }
    return true;
}

bool ask_all(unsigned asked, const daemon_options &options, const std::vector<stimulus> &stimuli,
             std::vector<found> &all)
{
    for (const product_name &product : all_products()) {
        if (!(asked & product.mask)) {
            continue;
        }
        player p;
        player_options how;
        std::string error;
        how.process = options;
        const bool asked_it = set_up_player(p, how, error) && ask(p, product, stimuli, all);
        take_down_player(p, false);
        if (!asked_it) {
            fputs(error.c_str(), stderr);
            return false;
        }
    }
    return true;
}

// The products of a mask; that they are all goes without saying.
std::string names_of(unsigned mask, unsigned all)
{
    std::string list;
    for (const product_name &product : all_products()) {
        if (mask != all && (mask & product.mask)) {
            list += (list.empty() ? "" : ", ") + std::string(product.name);
        }
    }
    return list;
}

std::string list_of(const found &stimulus)
{
    std::string list;
    for (const auto &[key, mask] : stimulus.reads) {
        if (mask == 0) {
            continue;
        }
        const std::string products = names_of(mask, stimulus.heard_by);
        list += (list.empty() ? "" : ", ") + key + (products.empty() ? "" : " (" + products + ")");
    }
    return list;
}

void print_stimuli(unsigned asked, const std::vector<stimulus> &stimuli, const std::vector<found> &all)
{
    printf("## What happens to the daemon\n\n| statement | its text | heard by | makes it read |\n| --- | --- | --- | "
           "--- |\n");
    for (size_t at = 0; at < stimuli.size(); at++) {
        const std::string products = names_of(all[at].heard_by, asked);
        if (all[at].heard_by != 0) {
            printf("| `%s` | %s | %s | %s |\n", stimuli[at].name.c_str(), stimuli[at].text.c_str(),
                   products.empty() ? "all" : products.c_str(), list_of(all[at]).c_str());
        }
    }
}

void print_words()
{
    printf("\n## NV values\n\n| key | value |\n| --- | --- |\n");
    for (const nv_word &word : nv_words()) {
        printf("| `%s` | %s |\n", std::string(word.key).c_str(), std::string(word.meaning).c_str());
    }
    printf("\n## Network names\n\n| `network_type` | shown as |\n| --- | --- |\n");
    for (const network_word &word : network_words()) {
        printf("| `%s` | %s |\n", std::string(word.name).c_str(), std::string(word.shown_as).c_str());
    }
    printf("\n## LEDs\n\n%s\n\n## Sources in the log\n\n", led_names().c_str());
    for (const std::string_view source : log_sources()) {
        printf("- %s\n", std::string(source).c_str());
    }
}
} // namespace

int print_reference(const product_name *only, const daemon_options &options)
{
    const unsigned asked = only ? only->mask : product_set::EVERY_PRODUCT;
    const std::vector<stimulus> stimuli = all_stimuli();
    std::vector<found> all(stimuli.size());
    if (!ask_all(asked, options, stimuli, all)) {
        return PLAY_FAILED;
    }
    printf("# The words of a scenario%s%s\n\n", only ? ", on " : "", only ? std::string(only->name).c_str() : "");
    printf(
        "Printed by `kiv_led_sim words%s%s`. What is heard and read was asked of the daemon itself: on, awake, with a\n"
        "full store of messages.\n\n",
        only ? " " : "", only ? std::string(only->name).c_str() : "");
    print_stimuli(asked, stimuli, all);
    print_words();
    return 0;
}
