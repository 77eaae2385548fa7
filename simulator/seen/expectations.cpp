#include "seen/expectations.h"

#include "world/device.h"

#include <algorithm>
#include <set>

namespace
{
bool led_holds(const led_wanted &wanted, const observed &state, std::string &shown)
{
    const led_look &look = state.leds[static_cast<size_t>(wanted.led)];
    shown = std::string(led_name(wanted.led)) + " " + describe(look);
    return look == wanted.look;
}

bool only_holds(const expectation &wanted, const observed &state, std::string &shown)
{
    std::array<led_look, LED_ID_COUNT> all = {};
    bool same = true;
    for (const led_wanted &one : wanted.looks) {
        all[static_cast<size_t>(one.led)] = one.look;
    }
    for (size_t led = 0; led < all.size(); led++) {
        same &= seen(all[led]) == seen(state.leds[led]);
    }
    shown = lit_leds(state.leds);
    return same;
}

// A word for each LED that changed, as it is now.
bool nothing_changed(const surroundings &around, std::string &shown)
{
    std::set<int> changed;
    for (const led_event &change : around.changes) {
        changed.insert(change.led);
    }
    shown.clear();
    for (const int led : changed) {
        const led_look &look = around.state.leds[static_cast<size_t>(led)];
        shown += (shown.empty() ? "" : " and ") + std::string(led_name(led)) + " " + describe(look);
    }
    return changed.empty();
}

// The argument before the first comma: a log line's level.
bool has_level(const trace_entry &entry, int64_t level)
{
    return level < 0 || entry.arguments.starts_with(std::to_string(level) + ",");
}

bool logged(const expectation &wanted, const observed &state, std::string &shown)
{
    shown = "no such line";
    for (const trace_entry &entry : state.step) {
        if (entry.call != "kiv_syslog_append") {
            continue;
        }
        const std::vector<std::string> texts = quoted_texts(entry.arguments);
        if (texts.empty() || texts.back().find(wanted.text) == std::string::npos) {
            continue;
        }
        shown = entry.line;
        if (has_level(entry, wanted.number)) {
            return true;
        }
    }
    return false;
}

bool sent(const expectation &wanted, const observed &state, std::string &shown)
{
    const std::string to = "dest " + std::to_string(wanted.number) + " ";
    shown = "nothing was sent";
    for (const trace_entry &entry : state.step) {
        if (entry.call != "kiv_msg_send") {
            continue;
        }
        shown = entry.line;
        const std::vector<std::string> texts = quoted_texts(entry.arguments);
        if (entry.result == "0" && entry.arguments.starts_with(to) && !texts.empty() && texts[0] == wanted.text) {
            return true;
        }
    }
    return false;
}

bool nv_holds(const expectation &wanted, const surroundings &around, std::string &shown)
{
    std::string text;
    const bool there = read_device_text(around.device, "nv/" + wanted.key, text);
    shown = wanted.key + (there ? "=\"" + text + "\"" : "=missing");
    return wanted.what == subject::NV_MISSING ? !there : there && text == wanted.text;
}

bool nv_written(const expectation &wanted, const observed &state, std::string &shown)
{
    shown = wanted.key + " was not written";
    for (const trace_entry &entry : state.step) {
        const std::vector<std::string> texts = quoted_texts(entry.arguments);
        if (entry.call != "kiv_nvconfig_write" || texts.size() != 2 || texts[0] != wanted.key) {
            continue;
        }
        shown = entry.line;
        if (entry.result == "0" && texts[1] == wanted.text) {
            return true;
        }
    }
    return false;
}

std::string running_timers(const observed &state)
{
    std::string list = std::to_string(state.timers.size()) + " timers";
    for (const auto &[handle, timer] : state.timers) {
        list += ", " + std::to_string(timer.period_ms) + (timer.repeats ? " repeat" : " once");
    }
    return list;
}

bool timer_runs(const expectation &wanted, const observed &state, std::string &shown)
{
    shown = running_timers(state);
    for (const auto &[handle, timer] : state.timers) {
        if (timer.period_ms == wanted.number && timer.repeats == wanted.repeats) {
            return true;
        }
    }
    return false;
}

bool ran(const expectation &wanted, const observed &state, std::string &shown)
{
    shown = "no shell command";
    for (const trace_entry &entry : state.step) {
        if (entry.call != "system") {
            continue;
        }
        shown = entry.line;
        const std::vector<std::string> texts = quoted_texts(entry.arguments);
        if (!texts.empty() && texts[0].find(wanted.text) != std::string::npos) {
            return true;
        }
    }
    return false;
}

bool contains(const std::string &text, const expectation &wanted, std::string &shown)
{
    shown = "\"" + text + "\"";
    return text.find(wanted.text) != std::string::npos;
}

bool published(const expectation &wanted, const surroundings &around, std::string &shown)
{
    std::string text;
    if (read_device_text(around.device, "tr181/" + wanted.key, text)) {
        return contains(text, wanted, shown);
    }
    shown = wanted.key + " does not exist";
    return false;
}
} // namespace

bool holds(const expectation &wanted, const surroundings &around, std::string &shown)
{
    const observed &state = around.state;
    switch (wanted.what) {
    case subject::LED:
        return led_holds(wanted.looks[0], state, shown);
    case subject::ONLY:
        return only_holds(wanted, state, shown);
    case subject::NO_CHANGE:
        return nothing_changed(around, shown);
    case subject::REQUESTS:
        shown = std::to_string(state.requests_in_step) + " LED requests";
        return state.requests_in_step == wanted.number;
    case subject::LOG:
        return logged(wanted, state, shown);
    case subject::NO_LOG:
        return !logged(wanted, state, shown);
    case subject::SENT:
        return sent(wanted, state, shown);
    case subject::NV:
    case subject::NV_MISSING:
        return nv_holds(wanted, around, shown);
    case subject::NV_WRITTEN:
        return nv_written(wanted, state, shown);
    case subject::TIMER:
        return timer_runs(wanted, state, shown);
    case subject::TIMER_COUNT:
        shown = running_timers(state);
        return static_cast<int64_t>(state.timers.size()) == wanted.number;
    case subject::TIMER_DELETED:
        shown = "no timer was deleted";
        return state.timer_deleted_in_step;
    case subject::RAN:
        return ran(wanted, state, shown);
    case subject::TR181:
        return published(wanted, around, shown);
    case subject::OUTPUT:
        return contains(around.printed, wanted, shown);
    case subject::ALIVE:
        shown = "the daemon has ended";
        return around.alive;
    case subject::ENDED:
        shown = "the daemon runs";
        return !around.alive;
    }
    return false;
}

std::vector<int> leds_that_differ(const expectation &wanted, const surroundings &around)
{
    std::set<int> leds;
    switch (wanted.what) {
    case subject::LED:
        leds.insert(wanted.looks[0].led);
        break;
    case subject::ONLY:
        for (int led = 0; led < LED_ID_COUNT; led++) {
            const auto one = std::find_if(wanted.looks.rbegin(), wanted.looks.rend(),
                                          [led](const led_wanted &look) { return look.led == led; });
            const led_look look = one == wanted.looks.rend() ? led_look{} : one->look;
            if (seen(look) != seen(around.state.leds[static_cast<size_t>(led)])) {
                leds.insert(led);
            }
        }
        break;
    case subject::NO_CHANGE:
    case subject::REQUESTS:
        for (const led_event &event : wanted.what == subject::NO_CHANGE ? around.changes : around.requests) {
            leds.insert(event.led);
        }
        break;
    default:
        break;
    }
    return {leds.begin(), leds.end()};
}
