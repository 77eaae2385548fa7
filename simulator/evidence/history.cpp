#include "evidence/history.h"

#include "evidence/statements.h"
#include "language/words.h"

#include <deque>

namespace
{
struct reading {
    history told;
    std::map<std::string, size_t> current; // activity, by thread
    std::map<int64_t, size_t> timers;      // the entry that started it, by handle
    std::deque<size_t> relights;           // entries that asked for one, not yet taken
};

int64_t number_of(const std::string &text)
{
    return parse_number(std::string_view(text).substr(0, text.find_first_not_of("0123456789")), 0, INT32_MAX)
        .value_or(0);
}

void ask(reading &in, activity &doing, size_t entry)
{
    doing.asked_for = entry;
    doing.asked_in = in.told.activity_of[entry];
}

// What an entry begins. None when it goes on with what its thread was doing.
std::optional<activity> begun_by(reading &in, const trace_entry &entry, size_t at)
{
    activity doing = {.what = cause::MESSAGE, .entry = at, .asked_for = at};
    if (is_own_relight(entry) && !in.relights.empty()) {
        doing.what = cause::OWN_RELIGHT;
        ask(in, doing, in.relights.front());
        in.relights.pop_front();
        return doing;
    }
    if (entry.call == "kiv_timer_fire") {
        doing.what = cause::TIMER;
        doing.timer = number_of(entry.arguments);
        if (const auto started = in.timers.find(doing.timer); started != in.timers.end()) {
            ask(in, doing, started->second);
        }
        return doing;
    }
    if (entry.call == "kiv_bsp_ind") {
        doing.what = cause::INDICATION;
        return doing;
    }
    if (entry.call == "kiv_recv_msg" && entry.thread != "main") {
        return doing;
    }
    if (!in.current.contains(entry.thread)) {
        doing.what = entry.thread == "main" ? cause::START : cause::THREAD;
        return doing;
    }
    return std::nullopt;
}

void take(reading &in, const trace_entry &entry, size_t at)
{
    if (is_head(entry)) {
        in.current.clear();
        in.timers.clear();
        in.relights.clear();
    }
    if (const std::optional<activity> begun = begun_by(in, entry, at)) {
        in.current[entry.thread] = in.told.activities.size();
        in.told.activities.push_back(*begun);
    }
    in.told.activity_of.push_back(in.current[entry.thread]);
    if (entry.call == "kiv_timer") {
        in.timers[number_of(entry.result)] = at;
    }
    if (entry.call == "kiv_lib_led_relight_msg" && entry.result == "0") {
        in.relights.push_back(at);
    }
}

std::string timer_name(const history &told, int64_t handle)
{
    return told.from_log ? told.timer_names[static_cast<size_t>(handle) - 1] : "timer " + std::to_string(handle);
}

std::string started_by(const history &told, const activity &doing)
{
    const activity &other = told.activities[doing.asked_in];
    if (other.what == cause::TIMER) {
        return timer_name(told, other.timer);
    }
    return other.what == cause::OWN_RELIGHT ? "command RELIGHT" : describe(told, doing.asked_in);
}

std::string describe_timer(const history &told, const activity &doing)
{
    const trace_entry &start = told.trace->entries[doing.asked_for];
    std::string text = timer_name(told, doing.timer);
    if (start.call != "kiv_timer") {
        return text + (told.from_log ? "" : ", started before the trace begins");
    }
    const std::string ms = start.arguments.substr(0, start.arguments.find(','));
    const bool repeats = start.arguments.ends_with("repeat");
    text += repeats ? " (every " + ms + " ms)" : " (" + ms + " ms, once)";
    return text + ", started at " + when(told, doing.asked_for) + " by " + started_by(told, doing);
}

std::string describe_relight(const history &told, const activity &doing)
{
    return "command RELIGHT, asked for at " + when(told, doing.asked_for) + " by " + started_by(told, doing);
}
} // namespace

history history_of(const recording &trace)
{
    reading in;
    in.told.trace = &trace;
    for (size_t at = 0; at < trace.entries.size(); at++) {
        take(in, trace.entries[at], at);
    }
    return std::move(in.told);
}

std::vector<led_change> changes_of(const history &told, int led)
{
    std::vector<led_change> changes;
    led_look now;
    for (size_t at = 0; at < told.trace->entries.size(); at++) {
        const trace_entry &entry = told.trace->entries[at];
        const std::optional<led_wanted> request = led_request_of(entry);
        if (!request || request->led != led) {
            continue;
        }
        const size_t in = told.activity_of[at];
        if (changes.empty() || changes.back().in != in) {
            changes.push_back({.before = now, .after = now, .in = in});
        }
        changes.back().request = at;
        changes.back().failed = entry.result != "0";
        now = changes.back().failed ? now : request->look;
        changes.back().after = now;
    }
    return changes;
}

std::string describe(const history &told, size_t activity_index)
{
    const activity &doing = told.activities[activity_index];
    const trace_entry &entry = told.trace->entries[doing.entry];
    switch (doing.what) {
    case cause::START:
        return "start-up";
    case cause::MESSAGE: {
        const std::string text = shortened(stimulus_of(entry));
        return !text.empty() ? text : told.from_log ? "a message that it does not name" : "a receive that failed";
    }
    case cause::OWN_RELIGHT:
        return describe_relight(told, doing);
    case cause::TIMER:
        return describe_timer(told, doing);
    case cause::INDICATION:
        return stimulus_of(entry);
    case cause::THREAD:
        break;
    }
    if (told.from_log) {
        return entry.call == "kiv_trace" ? "start-up" : "what had begun before the log does";
    }
    return "start-up, in thread " + entry.thread;
}

std::string when(const history &told, size_t entry)
{
    return told.from_log ? told.moments[entry] : moment(told.trace->entries[entry].time_us);
}

std::string log_text(const trace_entry &entry)
{
    if (entry.call != "kiv_syslog_append") {
        return {};
    }
    const std::vector<std::string> texts = quoted_texts(entry.arguments);
    std::string text = texts.size() < 2 ? std::string() : texts.back();
    text.erase(text.find_last_not_of(" \n") + 1);
    text.erase(0, text.find_first_not_of(' '));
    return text;
}
