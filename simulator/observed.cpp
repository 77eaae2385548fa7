#include "observed.h"

#include "words.h"

namespace
{
constexpr size_t LAST_LINES = 10;

int64_t leading_number(const std::string &text)
{
    return parse_number(std::string_view(text).substr(0, text.find_first_not_of("0123456789")), 0, INT32_MAX)
        .value_or(0);
}

void observe_timer(observed &state, const trace_entry &entry)
{
    const int64_t made = leading_number(entry.result);
    const int64_t named = leading_number(entry.arguments);
    if (entry.call == "kiv_timer" && made > 0)
        state.timers[made] = {named, entry.arguments.ends_with("repeat")};
    if (entry.call == "kiv_delete_timer" && entry.result == "0" && state.timers.erase(named) > 0)
        state.timer_deleted_in_step = true;
    if (entry.call == "kiv_timer_fire" && state.timers.contains(named) && !state.timers[named].repeats)
        state.timers.erase(named);
}
} // namespace

void observe(observed &state, const trace_entry &entry)
{
    if (entry.call == "kiv_bsp_set_leds_sync")
        state.requests_in_step++;
    const std::optional<led_wanted> request = led_request_of(entry);
    // A request that failed has changed nothing.
    if (request && entry.result == "0")
        state.leds[static_cast<size_t>(request->led)] = request->look;
    observe_timer(state, entry);
    state.step.push_back(entry);
    state.last_lines.push_back(entry.line);
    if (state.last_lines.size() > LAST_LINES)
        state.last_lines.pop_front();
}

void begin_step(observed &state)
{
    state.step.clear();
    state.requests_in_step = 0;
    state.timer_deleted_in_step = false;
}

void forget_process(observed &state)
{
    state.timers.clear();
}

std::string describe(const led_look &look)
{
    switch (look.mode) {
    case led_mode::OFF:
        return "off";
    case led_mode::ON:
        return "on " + std::to_string(look.brightness);
    case led_mode::BLINK:
        break;
    }
    return "blink " + std::to_string(look.blink_time1) + "/" + std::to_string(look.blink_time2) + " " +
           std::to_string(look.brightness);
}
