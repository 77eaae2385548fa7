#include "live/session.h"

#include "evidence/why.h"
#include "language/words.h"
#include "live/help.h"
#include "world/device.h"
#include "world/interrupt.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <sstream>

namespace
{

void print_lit(const observed &state)
{
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const led_look &look = state.leds[static_cast<size_t>(led)];
        if (look.mode != led_mode::OFF) {
            printf("  %-14s %s\n", std::string(led_name(led)).c_str(), describe(look).c_str());
        }
    }
}

std::string why_now(const rig &r, const std::string &led_name)
{
    recording trace;
    std::string error;
    const std::optional<int> led = find_led(led_name);
    if (!led) {
        return "  why which LED? " + led_names() + "\n";
    }
    if (!load_recording(r.trace_path, trace, error)) {
        return "  " + error + "\n";
    }
    for (trace_entry &entry : trace.entries) {
        entry.time_us -= r.real_start_ns / 1000;
    }
    return why(history_of(trace), *led, trace.entries.size());
}

void report(live_session &s, const statement &at, const played &done)
{
    s.failed += done.result == PLAY_FAILED;
    if (!s.typed) {
        fflush(stdout);
        fputs(done.failure.c_str(), stderr);
    } else if (done.result == PLAY_FAILED) {
        printf("  expected: %s\n  shown:    %s\n", done.expected.c_str(), done.shown.c_str());
    } else if (done.result == PLAY_IMPOSSIBLE) {
        printf("  %s", done.failure.substr(done.failure.find(": ") + 2).c_str());
    } else if (at.what == verb::EXPECT) {
        printf("  holds\n");
    }
}

bool needs_daemon(const statement &s)
{
    return s.what == verb::SEND || s.what == verb::INDICATE || s.what == verb::EXPECT ||
           std::any_of(s.body.begin(), s.body.end(), needs_daemon);
}

// False when the statement could not be played.
bool play_next(live_session &s, const scenario &story, const statement &next)
{
    if (!s.p.device.launched && needs_daemon(next) && !play_text(s, "start", "start")) {
        return false;
    }
    glance(s.p.device);
    const played done = play_statement(s.p, story, next);
    report(s, next, done);
    return done.result != PLAY_IMPOSSIBLE;
}

// What the parser says of a text, with the session's number of the line; a person at a terminal needs none.
std::string told(const live_session &s, const std::string &error, const std::string &name, int lines_before)
{
    const size_t what = error.find(": ");
    if (s.typed) {
        return "  " + error.substr(what + 2);
    }
    if (!error.starts_with(name + ":")) {
        return error; // of a file that the text includes
    }
    const int line = atoi(error.c_str() + name.size() + 1);
    return name + ":" + std::to_string(line + lines_before) + error.substr(what);
}

void shift_lines(std::vector<statement> &statements, int by)
{
    for (statement &each : statements) {
        each.line += each.file == 0 ? by : 0;
        shift_lines(each.body, by);
    }
}

} // namespace

void look_up(live_session &s)
{
    rig &r = s.p.device;
    std::string errors;
    glance(r);
    // An LED that is missing, a map that cannot be read, a sanitizer's report.
    if (!r.attached && read_file(r.device + "/stderr", errors) && errors.size() > s.told_errors) {
        fputs(errors.c_str() + s.told_errors, r.line.out);
        s.told_errors = errors.size();
    }
    const bool gone = r.launched && r.process.pid < 0 && !s.p.end_known;
    if (gone && !s.told_end) {
        fprintf(r.line.out, "the daemon %s\n", r.process.end.c_str());
    }
    s.told_end = gone;
}

std::string news(live_session &s)
{
    char *text = nullptr;
    size_t size = 0;
    FILE *kept = s.p.device.line.out;
    s.p.device.line.out = open_memstream(&text, &size);
    look_up(s);
    fclose(s.p.device.line.out);
    s.p.device.line.out = kept;
    std::string result(text, size);
    free(text);
    return result;
}

bool play_story(live_session &s, const scenario &story)
{
    for (const statement &next : story.statements) {
        if (interrupt_signal != 0) {
            break;
        }
        if (!play_next(s, story, next)) {
            return false;
        }
    }
    return true;
}

bool play_text(live_session &s, const std::string &text, const std::string &name)
{
    scenario story;
    std::string error;
    const int before = s.line - static_cast<int>(std::count(text.begin(), text.end(), '\n'));
    if (!parse_scenario(text, name, load_scenario_file, story, error)) {
        fflush(stdout);
        std::istringstream lines(error);
        for (std::string line; std::getline(lines, line);) {
            fprintf(stderr, "%s\n", told(s, line, name, before).c_str());
        }
        return false;
    }
    shift_lines(story.statements, before);
    return play_story(s, story);
}

bool answer(live_session &s, const std::string &line)
{
    std::vector<word> words;
    std::string error;
    if (!split_line(line, words, error) || words.empty()) {
        return false;
    }
    const std::string &asked = words[0].text;
    const std::string about = words.size() > 1 ? words[1].text : "";
    if (asked == "help") {
        fputs(help_text(about).c_str(), stdout);
    } else if (asked == "leds") {
        print_lit(s.p.device.state);
    } else if (asked == "why") {
        fputs(why_now(s.p.device, about).c_str(), stdout);
    } else {
        return false;
    }
    return true;
}
