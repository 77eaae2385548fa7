#include "evidence/story.h"

#include "evidence/statements.h"
#include "evidence/told_device.h"
#include "kiv/socket.h"
#include "language/words.h"
#include "seen/observed.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstring>
#include <map>

namespace
{
constexpr int64_t US_PER_MS = 1000;
constexpr int64_t LATE_US = 20'000; // as late as a device's timer may be

struct telling {
    explicit telling(const recording &of) : trace(of) {}
    const recording &trace;
    std::string text;
    told_device device;
    int64_t now_us = 0;   // of the scenario
    int64_t relights = 0; // on their way
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
        take_effect(in.device, in.trace.entries[at]);
    }
}

// The LEDs that show something else than before, or that nothing was asked for.
void expect(telling &in, size_t from, size_t to)
{
    const led_looks before = in.state.leds;
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
        told_device tried = in.device;
        const bool changed = !settings_for(tried, in.trace, from, behind, moment_us).empty();
        if (changed && moment_us - US_PER_MS > in.now_us) {
            pass_time(in, moment_us - US_PER_MS);
            expect(in, told, from);
            told = from;
        }
        in.text += settings_for(in.device, in.trace, from, behind, in.now_us);
        for (size_t at = from; at < behind; at++) {
            take_effect(in.device, in.trace.entries[at]);
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
    in.text += settings_for(in.device, in.trace, from, at_once, in.now_us);
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
    telling in(trace);
    in.text = opening(trace);
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
