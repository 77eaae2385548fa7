#include "evidence/story.h"

#include "evidence/statements.h"
#include "kiv/socket.h"
#include "language/words.h"
#include "seen/observed.h"

#include <algorithm>
#include <array>
#include <chrono>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <map>

namespace
{
constexpr int64_t US_PER_MS = 1000;
constexpr int64_t US_PER_S = 1'000'000;
constexpr int64_t LATE_US = 20'000; // as late as a device's timer may be
constexpr const char *MISSING = "missing";

// A value of the device as a statement sets it: "nv battery_value=", "sensor 3 ".
struct setting {
    std::string statement;
    std::string value;
};

struct telling {
    const recording &trace;
    std::string text;
    std::map<std::string, std::string> device; // values, by statement, as the scenario has left them
    int64_t now_us = 0;                        // of the scenario
    int64_t wall_offset_us = INT64_MIN;        // the wall clock at time 0, once it is known
    int64_t relights = 0;                      // on their way
    bool runs = false;
    std::map<int, std::array<uint32_t, 4>> registered; // masks, by module
    bool exact = true;                                 // virtual time, whose moments are full milliseconds
    std::vector<bool> wakes;                           // by entry: its thread has slept, or a timer has run
    observed state;
};

void say(telling &in, const std::string &statement)
{
    in.text += statement + "\n";
}

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
            return setting{"cfg " + item + " ", MISSING};
        }
        const bool text = entry.result.find('"') != std::string::npos;
        return setting{"cfg " + item + "=", text ? answer_text(entry) : entry.result.substr(behind + 2)};
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

std::string initial(const std::string &statement)
{
    return statement == "cfg 531=" ? "1" : MISSING;
}

std::string value_in(const telling &in, const std::string &statement)
{
    const auto known = in.device.find(statement);
    return known == in.device.end() ? initial(statement) : known->second;
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
std::optional<int64_t> clock_for(const telling &in, const trace_entry &entry, int64_t moment_us)
{
    if (entry.call != "time") {
        return std::nullopt;
    }
    const int64_t found_s = parse_number(entry.result, 0, INT64_MAX / US_PER_S).value_or(0);
    const int64_t shown_s = (in.wall_offset_us + entry.time_us) / US_PER_S;
    if (in.wall_offset_us != INT64_MIN && std::abs(found_s - shown_s) <= 1) {
        return std::nullopt;
    }
    return found_s - (entry.time_us - moment_us) / US_PER_S;
}

std::string clock_statement(int64_t seconds)
{
    const std::chrono::sys_seconds moment{std::chrono::seconds(seconds)};
    const auto day = std::chrono::floor<std::chrono::days>(moment);
    const std::chrono::year_month_day date(day);
    const int64_t of_day = (moment - day).count();
    std::array<char, 64> text;
    snprintf(text.data(), text.size(), "clock %04d-%02u-%02u %02lld:%02lld:%02lld", static_cast<int>(date.year()),
             static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()),
             static_cast<long long>(of_day / 3600), static_cast<long long>(of_day / 60 % 60),
             static_cast<long long>(of_day % 60));
    return text.data();
}

std::string statement_of(const setting &one)
{
    for (const product_name &product : all_products()) {
        if (one.statement == "cfg 6000=" && one.value == product.cfg_text) {
            return "product " + std::string(product.name);
        }
    }
    return one.statement + one.value;
}

// Everything that the entries from..to read is set as they read it; the first reading counts.
void set_device(telling &in, size_t from, size_t to, int64_t now_us)
{
    std::map<std::string, int> faults;
    std::vector<std::string> seen;
    for (size_t at = from; at < to; at++) {
        const trace_entry &entry = in.trace.entries[at];
        if (is_fault(entry)) {
            const std::string match = entry.arguments.substr(0, entry.arguments.find('\''));
            faults["fail " + entry.call + " " + scenario_word(match.empty() ? "*" : match) + " " +
                   entry.result.substr(0, entry.result.find(','))]++;
        }
        if (const auto seconds = clock_for(in, entry, now_us)) {
            say(in, clock_statement(*seconds));
            in.wall_offset_us = *seconds * US_PER_S - now_us;
        }
        const std::optional<setting> read = setting_of(entry);
        if (!read || std::find(seen.begin(), seen.end(), read->statement) != seen.end()) {
            continue;
        }
        seen.push_back(read->statement);
        if (value_in(in, read->statement) != read->value) {
            say(in, statement_of(*read));
            in.device[read->statement] = read->value;
        }
    }
    for (const auto &[statement, times] : faults) {
        say(in, statement + " " + std::to_string(times));
    }
}

// What the daemon itself does to the device.
void take_effect(telling &in, const trace_entry &entry)
{
    const std::vector<std::string> texts = quoted_texts(entry.arguments);
    if (entry.call == "kiv_nvconfig_write" && entry.result == "0" && texts.size() == 2) {
        in.device["nv " + texts[0] + "="] = scenario_text(texts[1]);
    }
    if (entry.call == "system" && !texts.empty() && texts[0].find("rolling_leds") != std::string::npos) {
        in.device["sys led:rolling_leds "] = "1";
    }
}

bool shows_something(const recording &trace, size_t from, size_t to)
{
    for (; from < to; from++) {
        if (led_request_of(trace.entries[from])) {
            return true;
        }
    }
    return false;
}

void observe_all(telling &in, size_t from, size_t to)
{
    begin_step(in.state);
    for (size_t at = from; at < to; at++) {
        observe(in.state, in.trace.entries[at]);
        take_effect(in, in.trace.entries[at]);
    }
}

// The LEDs that show something else than before, or that nothing was asked for.
void expect(telling &in, size_t from, size_t to)
{
    const std::array<led_look, LED_ID_COUNT> before = in.state.leds;
    bool changed = false;
    observe_all(in, from, to);
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const led_look &look = in.state.leds[static_cast<size_t>(led)];
        if (look != before[static_cast<size_t>(led)]) {
            say(in, "expect " + std::string(led_name(led)) + " " + describe(look));
            changed = true;
        }
    }
    if (!changed && in.state.requests_in_step == 0) {
        say(in, "expect nothing changed");
    }
}

void pass_time(telling &in, int64_t until_us)
{
    const int64_t ms = until_us / US_PER_MS - in.now_us / US_PER_MS;
    if (ms > 0) {
        say(in, ms % 1000 == 0 ? "after " + std::to_string(ms / 1000) + "s" : "after " + std::to_string(ms) + "ms");
        in.now_us += ms * US_PER_MS;
    }
}

void take_registration(telling &in, const trace_entry &entry)
{
    int module_id = 0;
    std::array<uint32_t, 4> masks = {};
    if (entry.call == "kiv_reg_func" && entry.result == "0" &&
        sscanf(entry.arguments.c_str(), "%d, %*d, %x %x %x %x", &module_id, &masks[0], &masks[1], &masks[2],
               &masks[3]) == 5) {
        in.registered[module_id] = masks;
    }
}

// A notification that the daemon had not asked for has to say so.
std::string heard_or_not(const telling &in, const std::string &statement, const std::string &bytes)
{
    constexpr uint32_t SECOND_MASK = 1U << 30;
    svc_msg message = {};
    if (!statement.starts_with("notify ")) {
        return statement;
    }
    memcpy(&message, bytes.data(), std::min(bytes.size(), sizeof message));
    const auto known = in.registered.find(message.us_source_module_id);
    const uint32_t event = message.ul_event_mask;
    const bool heard =
        message.us_source_module_id == KIV_MODULE_SLEEP ||
        (known != in.registered.end() && event != 0 && (known->second[event & SECOND_MASK ? 1 : 0] & event) == event);
    return heard ? statement : "notify unregistered" + statement.substr(strlen("notify"));
}

// The statement with which an entry begins a step. Empty when the entry is part of one.
std::string step_at(telling &in, size_t at)
{
    const trace_entry &entry = in.trace.entries[at];
    take_registration(in, entry);
    in.relights += entry.call == "kiv_lib_led_relight_msg" && entry.result == "0" ? 1 : 0;
    if (at == 0 || is_head(entry)) {
        in.relights = 0;
        in.registered.clear();
        return in.runs ? "kill\nlaunch" : "launch";
    }
    if (is_own_relight(entry) && in.relights > 0) {
        in.relights--;
        return {};
    }
    const std::optional<std::string> bytes =
        entry.call == "kiv_recv_msg" ? received_message(entry) : std::optional<std::string>();
    if (!bytes) {
        return stimulus_of(entry);
    }
    return bytes->empty() ? "" : heard_or_not(in, message_statement(*bytes), *bytes);
}

// Whether the entries from..to need the device to be otherwise than it is now.
bool needs_setting(telling &in, size_t from, size_t to)
{
    telling tried = in;
    tried.text.clear();
    set_device(tried, from, to, in.trace.entries[from].time_us);
    return !tried.text.empty();
}

// Behind what belongs to the moment of the entry from: in virtual time what happens in the same one, on a device what
// nobody has waited for.
size_t end_of_moment(const telling &in, size_t from, size_t end)
{
    const int64_t begin_ms = in.trace.entries[from].time_us / US_PER_MS;
    for (from++; from < end; from++) {
        const bool later = in.trace.entries[from].time_us / US_PER_MS > begin_ms;
        if (later && (in.exact || in.wakes[from])) {
            break;
        }
    }
    return from;
}

// The time of the entry before end, and a little more on a device, whose timers are not exact.
int64_t settled_us(const telling &in, size_t end)
{
    const std::vector<trace_entry> &entries = in.trace.entries;
    const int64_t late_us = entries[end - 1].time_us + (in.exact ? 0 : LATE_US);
    return end < entries.size() && !in.exact ? std::min(late_us, entries[end].time_us - US_PER_MS) : late_us;
}

// What the device does by itself: time passes up to each moment at which it finds something changed.
void tell_time(telling &in, size_t from, size_t end)
{
    size_t told = from;
    while (from < end) {
        const size_t behind = end_of_moment(in, from, end);
        const int64_t moment_us = in.trace.entries[from].time_us;
        if (needs_setting(in, from, behind) && moment_us - US_PER_MS > in.now_us) {
            pass_time(in, moment_us - US_PER_MS);
            expect(in, told, from);
            told = from;
        }
        set_device(in, from, behind, in.now_us);
        for (size_t at = from; at < behind; at++) {
            take_effect(in, in.trace.entries[at]);
        }
        from = behind;
    }
    if (told == end) {
        return;
    }
    if (shows_something(in.trace, told, end)) {
        pass_time(in, settled_us(in, end));
        expect(in, told, end);
    } else {
        observe_all(in, told, end);
    }
}

// One stimulus, and all that came of it up to the next one.
void tell_step(telling &in, const std::string &statement, size_t from, size_t end)
{
    const size_t at_once = end_of_moment(in, from, end);
    pass_time(in, in.trace.entries[from].time_us);
    set_device(in, from, at_once, in.now_us);
    say(in, statement);
    in.runs = true;
    expect(in, from, at_once);
    tell_time(in, at_once, end);
}

void find_wakes(telling &in)
{
    std::map<std::string, bool> sleeps;
    for (const trace_entry &entry : in.trace.entries) {
        in.wakes.push_back(sleeps[entry.thread] || entry.call == "kiv_timer_fire");
        sleeps[entry.thread] = entry.call == "sleep" || entry.call == "usleep";
    }
}

std::string opening(const recording &trace)
{
    return "# Told from " + trace.name + ", whose first line is of " + moment(trace.entries[0].time_us) + " s.\n";
}
} // namespace

std::string story_of(const recording &trace)
{
    telling in = {.trace = trace, .text = opening(trace), .device = {}, .registered = {}, .wakes = {}, .state = {}};
    in.now_us = trace.entries[0].time_us;
    in.exact = std::all_of(trace.entries.begin(), trace.entries.end(),
                           [](const trace_entry &entry) { return entry.time_us % US_PER_MS == 0; });
    find_wakes(in);
    std::string statement = step_at(in, 0);
    size_t from = 0;
    for (size_t at = 1; at < trace.entries.size(); at++) {
        const std::string next = step_at(in, at);
        if (!next.empty()) {
            tell_step(in, statement, from, at);
            statement = next;
            from = at;
        }
    }
    tell_step(in, statement, from, trace.entries.size());
    return in.text;
}
