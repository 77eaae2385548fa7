#include "player.h"

#include "device.h"
#include "expectations.h"
#include "words.h"

#include <algorithm>
#include <sstream>
#include <unistd.h>

namespace
{
constexpr int64_t DAY_S = 86400;
constexpr int64_t LAST_WALL_S = 2'145'916'800; // the end of 2037, as far as a 32-bit clock shows every day
constexpr int64_t LONGEST_RUN_NS = 10'000 * DAY_S * NS_PER_S;
constexpr int RETRIES_IN_REAL_TIME = 20;
constexpr int64_t REAL_MOMENT_US = 20'000;
constexpr size_t ERROR_LINES = 60;

struct playing {
    const scenario &story;
    rig device;
    play_report report;
    int repeats_deep = 0;
    bool quiet = false;     // a repeat after its first round
    bool end_known = false; // the daemon is gone, and the scenario wanted or expected that
};

void put_where(playing &p, const statement &at, const std::string &what)
{
    p.report.failure = p.story.files[at.file] + ":" + std::to_string(at.line) + ": " + what + "\n";
}

bool impossible(playing &p, const statement &at, const std::string &why)
{
    put_where(p, at, at.text + ": " + why);
    p.report.result = PLAY_IMPOSSIBLE;
    return false;
}

// The end of what the daemon wrote to standard error: a sanitizer's report, or why it could not start.
std::string error_output(const std::string &device)
{
    std::string text;
    std::string last;
    read_file(device + "/stderr", text);
    std::istringstream lines(text);
    size_t skip = static_cast<size_t>(std::count(text.begin(), text.end(), '\n'));
    skip = skip > ERROR_LINES ? skip - ERROR_LINES : 0;
    for (std::string line; std::getline(lines, line);) {
        if (skip > 0)
            skip--;
        else
            last += "    " + line + "\n";
    }
    return last;
}

bool failed(playing &p, const statement &at, const std::string &expected, const std::string &shown)
{
    std::string &text = p.report.failure;
    put_where(p, at, "expected: " + expected);
    text += "  shown:    " + shown + "\n";
    text += "  the last lines of the trace:\n";
    for (const std::string &line : p.device.state.last_lines)
        text += "    " + line + "\n";
    const std::string errors = error_output(p.device.device);
    if (!errors.empty())
        text += "  the daemon's standard error:\n" + errors;
    p.report.result = PLAY_FAILED;
    return false;
}

bool let_run(playing &p, const statement &s, int64_t until_ns)
{
    std::string error;
    return pass_time(p.device, until_ns, error) || failed(p, s, "the daemon comes to rest", error);
}

int64_t wall_seconds(const rig &r)
{
    return (r.now_ns + r.wall_offset_ns) / NS_PER_S;
}

bool set_wall_clock(playing &p, const statement &s)
{
    rig &r = p.device;
    const int64_t now = wall_seconds(r);
    int64_t wanted = s.number;
    if (r.options.real_time)
        return impossible(p, s, "the clock can be set in virtual time only");
    if (s.what == verb::JUMP)
        wanted = now + s.number / NS_PER_S;
    else if (s.what == verb::TIME_OF_DAY)
        wanted = now / DAY_S * DAY_S + s.number;
    if (wanted < 0 || wanted >= LAST_WALL_S)
        return impossible(p, s, "the clock would leave the years 1970 to 2037");
    // A jump keeps the fraction of the second, a time begins with a full one.
    r.wall_offset_ns = s.what == verb::JUMP ? r.wall_offset_ns + s.number : wanted * NS_PER_S - r.now_ns;
    return let_run(p, s, r.now_ns);
}

bool start(playing &p, const statement &s)
{
    std::string error;
    if (p.device.process.pid >= 0)
        return impossible(p, s, "the daemon runs already");
    p.end_known = false;
    if (!launch_daemon(p.device, error))
        return impossible(p, s, error);
    if (s.what == verb::LAUNCH || p.device.process.pid < 0)
        return true;
    if (!send_to_daemon(p.device.wires, s.bytes, error))
        return impossible(p, s, error);
    return let_run(p, s, p.device.now_ns);
}

bool stop(playing &p, const statement &s)
{
    if (p.device.process.pid < 0)
        return impossible(p, s, "the daemon does not run");
    kill_daemon(p.device.process);
    forget_process(p.device.state);
    p.end_known = true;
    return true;
}

bool send(playing &p, const statement &s)
{
    rig &r = p.device;
    std::string error;
    if (r.process.pid < 0)
        return impossible(p, s, "the daemon does not run");
    const bool sent =
        s.what == verb::INDICATE ? send_indication(r.wires, s.bytes, error) : send_to_daemon(r.wires, s.bytes, error);
    return sent ? let_run(p, s, r.now_ns) : impossible(p, s, error);
}

bool write_files(playing &p, const statement &s)
{
    std::string error;
    for (const file_write &file : s.files) {
        if (!write_device_file(p.device.device, file, error))
            return impossible(p, s, error);
    }
    return true;
}

bool wait(playing &p, const statement &s)
{
    if (p.device.now_ns + s.number > LONGEST_RUN_NS)
        return impossible(p, s, "a run lasts 10000 days at most");
    return let_run(p, s, p.device.now_ns + s.number);
}

bool check(playing &p, const statement &s)
{
    rig &r = p.device;
    std::string shown;
    std::string error;
    for (int left = r.options.real_time ? RETRIES_IN_REAL_TIME : 1; left > 0; left--) {
        const surroundings around = {r.state, r.device, printed_in_step(r), r.process.pid >= 0};
        if (holds(s.wanted, around, shown)) {
            p.end_known |= s.wanted.what == subject::ENDED;
            p.report.held++;
            return true;
        }
        if (left > 1)
            pass_time(r, r.now_ns + 50 * NS_PER_MS, error);
    }
    return failed(p, s, s.text.substr(s.text.find(' ') + 1), shown);
}

// A daemon that has ended by itself fails the scenario unless that is what comes to be expected.
bool still_there(playing &p, const statement &s)
{
    const daemon_process &process = p.device.process;
    if (p.end_known || !p.device.launched || process.pid >= 0)
        return true;
    if (s.what == verb::EXPECT)
        return s.wanted.what == subject::ENDED || failed(p, s, s.text.substr(7), "the daemon " + process.end);
    return failed(p, s, "the daemon runs", "it " + process.end);
}

bool play_all(playing &p, const std::vector<statement> &statements);

bool repeat(playing &p, const statement &s)
{
    const bool was_quiet = p.quiet;
    p.repeats_deep++;
    for (int64_t round = 0; round < s.number; round++) {
        p.quiet = was_quiet || round > 0;
        if (!play_all(p, s.body))
            return false;
    }
    p.quiet = was_quiet;
    p.repeats_deep--;
    return true;
}

bool do_statement(playing &p, const statement &s)
{
    std::string error;
    switch (s.what) {
    case verb::WRITE:
        return write_files(p, s);
    case verb::SEND:
    case verb::INDICATE:
        return send(p, s);
    case verb::FAIL:
        return add_fault(p.device.device, s.key, s.bytes, error) || impossible(p, s, error);
    case verb::REPAIR:
        remove_faults(p.device.device, s.key);
        return true;
    case verb::TIME_OF_DAY:
    case verb::DATE:
    case verb::JUMP:
        return set_wall_clock(p, s);
    case verb::LAUNCH:
    case verb::START:
        return start(p, s);
    case verb::KILL:
        return stop(p, s);
    case verb::AFTER:
        return wait(p, s);
    case verb::REPEAT:
        return repeat(p, s);
    case verb::EXPECT:
        return check(p, s);
    }
    return true;
}

// Before the daemon is there, the scenario only furnishes the device.
void show(playing &p, const statement &s)
{
    const bool starts = s.what == verb::LAUNCH || s.what == verb::START;
    timeline &line = p.device.line;
    if (s.what == verb::EXPECT || s.what == verb::AFTER || p.quiet || !(starts || p.device.launched))
        line.stimulus_us = s.what == verb::AFTER || p.quiet ? -1 : line.stimulus_us;
    else
        timeline_stimulus(line, p.device.now_ns / 1000, s.text);
}

// All that a repeat does is one step for the expectations behind it.
bool play_all(playing &p, const std::vector<statement> &statements)
{
    for (const statement &s : statements) {
        if (!still_there(p, s))
            return false;
        if (s.what != verb::EXPECT && p.repeats_deep == 0)
            new_step(p.device);
        show(p, s);
        if (!do_statement(p, s))
            return false;
    }
    return true;
}
} // namespace

play_report play(const scenario &story, const play_options &options)
{
    playing p = {.story = story, .device = {}, .report = {}};
    std::string error;
    rig &r = p.device;
    r.line.out = options.timeline;
    r.line.every_request = options.every_request;
    r.line.moment_length_us = options.process.real_time ? REAL_MOMENT_US : 0;
    if (!set_up_rig(r, options.process, options.trace_path, error)) {
        p.report = {.result = PLAY_IMPOSSIBLE, .failure = error + "\n"};
    } else if (play_all(p, story.statements) && !story.statements.empty()) {
        statement end;
        end.file = story.statements.back().file;
        end.line = story.statements.back().line;
        still_there(p, end);
    }
    const bool keep = options.keep_device || p.report.result == PLAY_FAILED;
    if (keep && !r.device.empty())
        p.report.failure += "  the device directory is kept: " + r.device + "\n";
    take_down_rig(r, keep);
    p.report.virtual_ns = r.now_ns;
    p.report.leds = r.state.leds;
    return p.report;
}
