#include "failure.h"

#include "evidence/statements.h"
#include "language/words.h"
#include "seen/expectations.h"
#include "world/device.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <ctime>
#include <sstream>

namespace
{
constexpr size_t ERROR_LINES = 60;
constexpr size_t LOG_LINES = 12;
constexpr size_t LEDS_TOLD = 6;

std::string seconds(int64_t us)
{
    std::array<char, 32> text;
    const long long ms = std::llabs(us / 1000); // negative: before a session took the daemon
    snprintf(text.data(), text.size(), "%s%lld.%03lld", us < 0 ? "-" : "", ms / 1000, ms % 1000);
    return text.data();
}

std::string wall_clock(const rig &r)
{
    std::array<char, 32> text;
    tm broken = {};
    const auto now = static_cast<time_t>((r.now_ns + r.wall_offset_ns) / NS_PER_S);
    gmtime_r(&now, &broken);
    strftime(text.data(), text.size(), "%F %T", &broken);
    return text.data();
}

std::string place(const scenario &story, size_t file, int line)
{
    return story.files[file] + ":" + std::to_string(line);
}

std::string how_it_came_here(const player &p, const statement &s)
{
    std::string text;
    for (size_t file = s.file; file != 0; file = p.story->included_at[file].file) {
        const include_place &at = p.story->included_at[file];
        text += "  included at " + place(*p.story, at.file, at.line) + "\n";
    }
    for (const repeat_round &round : p.rounds) {
        text += "  in round " + std::to_string(round.round) + " of " + std::to_string(round.repeat->number) +
                " of the repeat at " + place(*p.story, round.repeat->file, round.repeat->line) + "\n";
    }
    return text;
}

std::string last_text(const std::string &arguments)
{
    const std::vector<std::string> texts = quoted_texts(arguments);
    std::string text = texts.empty() ? std::string() : texts.back();
    std::replace(text.begin(), text.end(), '\n', ' ');
    return text.substr(0, text.find_last_not_of(' ') + 1);
}

std::string cause(const thread_story &thread)
{
    if (thread.set_off_by.empty()) {
        return "the start";
    }
    if (thread.timer_ms > 0) {
        return "a timer of " + std::to_string(thread.timer_ms) + " ms";
    }
    const std::optional<trace_entry> entry = parse_trace_line(thread.set_off_by);
    const std::string told = entry ? stimulus_of(*entry) : std::string();
    return told.empty() ? thread.set_off_by : told;
}

std::string requests_of(const observed &state, int led)
{
    std::string text = "  " + std::string(led_name(led)) + ", its last requests:";
    const std::deque<led_request_story> &last = state.last_requests[static_cast<size_t>(led)];
    if (last.empty()) {
        return text + " none\n";
    }
    text += "\n";
    for (const led_request_story &request : last) {
        text += "    " + seconds(request.time_us) + "  " + describe(request.look) +
                (request.result == "0" ? "" : " refused, " + request.result) + "  set off by " + cause(request.thread);
        const std::string decision = last_text(request.thread.decision);
        text += decision.empty() ? "\n" : ", after the log said \"" + decision + "\"\n";
    }
    return text;
}

// Of an expectation that is not about LEDs.
std::string log_of_step(const observed &state)
{
    std::string text;
    size_t lines = 0;
    for (auto entry = state.step.rbegin(); entry != state.step.rend() && lines < LOG_LINES; ++entry) {
        if (entry->call == "kiv_syslog_append") {
            text.insert(0, "    " + seconds(entry->time_us) + "  " + last_text(entry->arguments) + "\n");
            lines++;
        }
    }
    return text.empty() ? "  nothing was logged in the step\n" : "  the end of the step's log:\n" + text;
}
} // namespace

std::string error_output(const std::string &device)
{
    std::string text;
    std::string last;
    read_file(device + "/stderr", text);
    std::istringstream lines(text);
    size_t skip = static_cast<size_t>(std::count(text.begin(), text.end(), '\n'));
    skip = skip > ERROR_LINES ? skip - ERROR_LINES : 0;
    for (std::string line; std::getline(lines, line);) {
        if (skip > 0) {
            skip--;
        } else {
            last += "    " + line + "\n";
        }
    }
    return last.empty() ? last : "  the daemon's standard error:\n" + last;
}

std::string explain_failure(const player &p, const statement &s, const std::string &expected, const std::string &shown)
{
    const rig &r = p.device;
    const surroundings around = {r.state, r.line.changes, r.line.requests, r.device, {}, r.process.pid >= 0};
    std::vector<int> leds;
    if (s.what == verb::EXPECT) {
        leds = leds_that_differ(s.wanted, around);
    }
    std::string text = place(*p.story, s.file, s.line) + ": expected: " + expected + "\n  shown:    " + shown + "\n" +
                       how_it_came_here(p, s) + "  at " + seconds(r.now_ns / 1000) +
                       " s of device time, the clock shows " + wall_clock(r) +
                       "\n  the front: " + lit_leds(r.state.leds) + "\n";
    for (size_t at = 0; at < leds.size() && at < LEDS_TOLD; at++) {
        text += requests_of(r.state, leds[at]);
    }
    return text + (leds.empty() ? log_of_step(r.state) : "") + error_output(r.device);
}

std::string explain_impossible(const player &p, const statement &s, const std::string &why)
{
    return place(*p.story, s.file, s.line) + ": " + s.text + ": " + why + "\n" + how_it_came_here(p, s) +
           error_output(p.device.device);
}
