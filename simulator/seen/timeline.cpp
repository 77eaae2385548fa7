#include "seen/timeline.h"

#include <algorithm>

namespace
{
// Device time, and the wall clock beside it once a scenario has set that.
void print_time(const timeline &line, int64_t time_us)
{
    fprintf(line.out, "%5lld.%03lld", static_cast<long long>(time_us / 1'000'000),
            static_cast<long long>(time_us / 1000 % 1000));
    if (line.wall_offset_us >= 0) {
        const int64_t second = (time_us + line.wall_offset_us) / 1'000'000 % 86'400;
        fprintf(line.out, " %02d:%02d:%02d", static_cast<int>(second / 3600), static_cast<int>(second / 60 % 60),
                static_cast<int>(second % 60));
    }
}

void print_change(const timeline &line, int64_t time_us, int led, const std::string &look)
{
    if (time_us == line.stimulus_us) {
        fprintf(line.out, "%*s    ", line.wall_offset_us >= 0 ? 18 : 9, "");
    } else {
        print_time(line, time_us);
        fputs("    ", line.out);
    }
    const std::string name(led_name(led));
    fprintf(line.out, "%-14s %s\n", name.c_str(), look.c_str());
}

// LEVEL, "SOURCE", LINE, ID, "TEXT"
void print_log(const timeline &line, const trace_entry &entry)
{
    const std::vector<std::string> texts = quoted_texts(entry.arguments);
    std::string text = texts.empty() ? std::string() : texts.back();
    std::replace(text.begin(), text.end(), '\n', ' ');
    text.erase(text.find_last_not_of(' ') + 1);
    print_time(line, entry.time_us);
    fprintf(line.out, "      %s %s: %s\n", entry.arguments.starts_with("0,") ? "error" : "info ",
            texts.empty() ? "" : texts[0].c_str(), text.c_str());
}

void keep(std::vector<led_event> &events, led_event event)
{
    if (events.size() < SEEN_MAX) {
        events.push_back(std::move(event));
    }
}
} // namespace

void timeline_stimulus(timeline &line, int64_t now_us, const std::string &text)
{
    line.stimulus_us = line.stimuli ? now_us : -1;
    if (line.out && line.stimuli) {
        print_time(line, now_us);
        fprintf(line.out, "  %s\n", text.c_str());
    }
}

void timeline_entry(timeline &line, const observed &state, const trace_entry &entry)
{
    if (entry.time_us - line.moment_us > line.moment_length_us) {
        timeline_flush(line, state);
        line.moment_us = entry.time_us;
    }
    if (line.out && line.show_log && entry.call == "kiv_syslog_append") {
        print_log(line, entry);
    }
    const std::optional<led_wanted> request = led_request_of(entry);
    if (!request) {
        return;
    }
    keep(line.requests, {entry.time_us, request->led, request->look, entry.result});
    const bool refused = entry.result != "0";
    if (line.out && (line.every_request || refused)) {
        print_change(line, entry.time_us, request->led,
                     describe(request->look) + (refused ? "  refused, " + entry.result : ""));
    }
}

void timeline_flush(timeline &line, const observed &state)
{
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const led_look &look = state.leds[static_cast<size_t>(led)];
        if (line.before[static_cast<size_t>(led)] == look) {
            continue;
        }
        keep(line.changes, {line.moment_us, led, look, "0"});
        if (line.out && !line.every_request) {
            print_change(line, line.moment_us, led, describe(look));
        }
    }
    line.before = state.leds;
}
