#include "seen/observed.h"

#include "language/words.h"

namespace
{
constexpr size_t LAST_REQUESTS = 3;
constexpr std::string_view OUTPUT_LAYER = "\"kiv_mirta_led_operation\""; // logs what is done, not why

int64_t leading_number(const std::string &text)
{
    return parse_number(std::string_view(text).substr(0, text.find_first_not_of("0123456789")), 0, INT32_MAX)
        .value_or(0);
}

void observe_timer(observed &state, const trace_entry &entry)
{
    const int64_t made = leading_number(entry.result);
    const int64_t named = leading_number(entry.arguments);
    if (entry.call == "kiv_timer" && made > 0) {
        state.timers[made] = {named, entry.arguments.ends_with("repeat")};
    }
    if (entry.call == "kiv_delete_timer" && entry.result == "0" && state.timers.erase(named) > 0) {
        state.timer_deleted_in_step = true;
    }
    if (entry.call == "kiv_timer_fire" && state.timers.contains(named) && !state.timers[named].repeats) {
        state.timers.erase(named);
    }
}

bool is_start_record(const std::string &received)
{
    return received.find(", record 2 ") != std::string::npos;
}

void observe_thread(observed &state, const trace_entry &entry)
{
    if (entry.call == "kiv_syslog_append") {
        if (entry.arguments.find(OUTPUT_LAYER) == std::string::npos) {
            state.threads[entry.thread].decision = entry.arguments;
        }
    } else if (entry.call == "kiv_recv_msg" || entry.call == "kiv_bsp_ind") {
        state.threads[entry.thread] = {entry.line, 0, {}};
    } else if (entry.call == "kiv_timer_fire") {
        const auto timer = state.timers.find(leading_number(entry.arguments));
        state.threads[entry.thread] = {entry.line, timer == state.timers.end() ? 0 : timer->second.period_ms, {}};
    }
}

void observe_request(observed &state, const trace_entry &entry, const led_wanted &request)
{
    const auto led = static_cast<size_t>(request.led);
    std::deque<led_request_story> &last = state.last_requests[led];
    // A request that failed has changed nothing.
    if (entry.result == "0") {
        state.leds[led] = request.look;
    }
    last.push_back({entry.time_us, request.look, entry.result, state.threads[entry.thread]});
    if (last.size() > LAST_REQUESTS) {
        last.pop_front();
    }
}

// The result of a fault stands alone, behind the arguments that it matched.
void observe_surroundings(observed &state, const trace_entry &entry)
{
    if (entry.call == "kiv_nvconfig_read") {
        const size_t end = entry.arguments.find('"', 1);
        state.nv_read.insert(entry.arguments.substr(1, end - 1));
    }
    for (watched_fault &fault : state.faults) {
        fault.hit |= fault.call == entry.call && fault.result == entry.result &&
                     (fault.match == "*" || entry.arguments.find(fault.match) != std::string::npos);
    }
}
} // namespace

void observe(observed &state, const trace_entry &entry)
{
    if (entry.call == "kiv_bsp_set_leds_sync") {
        state.requests_in_step++;
    }
    observe_thread(state, entry);
    if (const std::optional<led_wanted> request = led_request_of(entry)) {
        observe_request(state, entry, *request);
    }
    observe_timer(state, entry);
    if (entry.call == "kiv_reg_table_init") { // a process begins so
        forget_process(state);
    }
    state.started |= entry.thread == "main" && entry.call == "kiv_recv_msg" && is_start_record(entry.result);
    observe_surroundings(state, entry);
    if (entry.call == "time") { // each is another one, and nobody expects it
        return;
    }
    if (state.step_calls.insert(entry.call + "(" + entry.arguments + ")" + entry.result).second) {
        state.step.push_back(entry);
    }
}

void begin_step(observed &state)
{
    state.step.clear();
    state.step_calls.clear();
    state.requests_in_step = 0;
    state.timer_deleted_in_step = false;
}

void forget_process(observed &state)
{
    state.timers.clear();
    state.threads.clear();
    state.started = false;
}

led_look seen(const led_look &look)
{
    return look.brightness == 0 ? led_look{} : look;
}

std::string lit_leds(const led_looks &leds)
{
    std::string list;
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const led_look look = seen(leds[static_cast<size_t>(led)]);
        if (look.mode != led_mode::OFF) {
            list += (list.empty() ? "" : " and ") + std::string(led_name(led)) + " " + describe(look);
        }
    }
    return list.empty() ? "dark" : list;
}

std::string expect_lit(const led_looks &leds)
{
    const std::string lit = lit_leds(leds);
    return lit == "dark" ? "expect dark" : "expect only " + lit;
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
