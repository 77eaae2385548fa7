#include "timeline.h"

namespace
{
void print_change(const timeline &line, int64_t time_us, int led, const std::string &look)
{
    if (time_us == line.stimulus_us)
        fprintf(line.out, "%9s    ", "");
    else
        fprintf(line.out, "%5lld.%03lld    ", static_cast<long long>(time_us / 1'000'000),
                static_cast<long long>(time_us / 1000 % 1000));
    const std::string name(led_name(led));
    fprintf(line.out, "%-14s %s\n", name.c_str(), look.c_str());
}
} // namespace

void timeline_stimulus(timeline &line, int64_t now_us, const std::string &text)
{
    line.stimulus_us = now_us;
    if (line.out)
        fprintf(line.out, "%5lld.%03lld  %s\n", static_cast<long long>(now_us / 1'000'000),
                static_cast<long long>(now_us / 1000 % 1000), text.c_str());
}

void timeline_entry(timeline &line, const observed &state, const trace_entry &entry)
{
    if (entry.time_us - line.moment_us > line.moment_length_us) {
        timeline_flush(line, state);
        line.moment_us = entry.time_us;
    }
    const std::optional<led_wanted> request = led_request_of(entry);
    if (!line.out || !line.every_request || !request)
        return;
    print_change(line, entry.time_us, request->led,
                 describe(request->look) + (entry.result == "0" ? "" : "  fails with " + entry.result));
}

void timeline_flush(timeline &line, const observed &state)
{
    for (int led = 0; line.out && !line.every_request && led < LED_ID_COUNT; led++) {
        const auto at = static_cast<size_t>(led);
        if (line.before[at] != state.leds[at])
            print_change(line, line.moment_us, led, describe(state.leds[at]));
    }
    line.before = state.leds;
}
