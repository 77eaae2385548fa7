#include "player.h"

#include "attach.h"
#include "failure.h"
#include "language/words.h"
#include "seen/expectations.h"
#include "world/device.h"

#include <algorithm>
#include <sstream>
#include <utility>

namespace
{
constexpr int64_t DAY_S = 86400;
constexpr int64_t LAST_WALL_S = 2'145'916'800; // the end of 2037, as far as a 32-bit clock shows every day
constexpr int64_t LONGEST_RUN_NS = 10'000 * DAY_S * NS_PER_S;
constexpr int RETRIES_IN_REAL_TIME = 20;
constexpr int64_t REAL_MOMENT_US = 20'000;

std::string where(const player &p, const statement &at)
{
    return p.story->files[at.file] + ":" + std::to_string(at.line);
}

bool impossible(player &p, const statement &at, const std::string &why)
{
    p.now.failure = explain_impossible(p, at, why);
    p.now.result = PLAY_IMPOSSIBLE;
    return false;
}

bool failed(player &p, const statement &at, const std::string &expected, const std::string &shown)
{
    p.now.expected = expected;
    p.now.shown = shown;
    p.now.failure = explain_failure(p, at, expected, shown);
    p.now.result = PLAY_FAILED;
    return false;
}

bool let_run(player &p, const statement &s, int64_t until_ns)
{
    std::string error;
    return pass_time(p.device, until_ns, error) || failed(p, s, "the daemon comes to rest", error);
}

int64_t wall_seconds(const rig &r)
{
    return (r.now_ns + r.wall_offset_ns) / NS_PER_S;
}

bool set_wall_clock(player &p, const statement &s)
{
    rig &r = p.device;
    const int64_t now = wall_seconds(r);
    int64_t wanted = s.number;
    if (r.options.real_time) {
        return impossible(p, s, "the clock can be set in virtual time only");
    }
    if (s.what == verb::JUMP) {
        wanted = now + s.number / NS_PER_S;
    } else if (s.what == verb::TIME_OF_DAY) {
        wanted = now / DAY_S * DAY_S + s.number;
    }
    if (wanted < 0 || wanted >= LAST_WALL_S) {
        return impossible(p, s, "the clock would leave the years 1970 to 2037");
    }
    // A jump keeps the fraction of the second, a time begins with a full one.
    r.wall_offset_ns = s.what == verb::JUMP ? r.wall_offset_ns + s.number : wanted * NS_PER_S - r.now_ns;
    r.line.wall_offset_us = r.wall_offset_ns / 1000;
    return let_run(p, s, r.now_ns);
}

bool start(player &p, const statement &s)
{
    std::string error;
    const bool waits = p.device.process.pid >= 0 && !p.device.state.started;
    if (p.device.process.pid >= 0 && !(waits && s.what == verb::START)) {
        return impossible(p, s, "the daemon runs already");
    }
    p.end_known = false;
    forget_queue(p.device.wires);
    const bool there = waits || (p.device.attached ? await_daemon(p.device, error) : launch_daemon(p.device, error));
    if (!there) {
        return impossible(p, s, error);
    }
    if (s.what == verb::LAUNCH || p.device.process.pid < 0) {
        return true;
    }
    if (!send_to_daemon(p.device.wires, s.bytes, error)) {
        return impossible(p, s, error);
    }
    return let_run(p, s, p.device.now_ns);
}

bool stop(player &p, const statement &s)
{
    if (p.device.attached) {
        return impossible(p, s, "the daemon is not this simulator's: end it where it was started");
    }
    if (p.device.process.pid < 0) {
        return impossible(p, s, "the daemon does not run");
    }
    kill_daemon(p.device.process);
    forget_queue(p.device.wires);
    forget_process(p.device.state);
    p.end_known = true;
    return true;
}

bool send(player &p, const statement &s)
{
    rig &r = p.device;
    std::string error;
    if (r.process.pid < 0) {
        return impossible(p, s, "the daemon does not run");
    }
    if (s.module_id != 0 && !is_heard(r.wires, s.module_id, s.event)) {
        return failed(p, s, "the daemon has registered for this event",
                      "it has not, so on a device nobody would send it; 'notify unregistered' sends it all the same");
    }
    const bool sent =
        s.what == verb::INDICATE ? send_indication(r.wires, s.bytes, error) : send_to_daemon(r.wires, s.bytes, error);
    return sent ? let_run(p, s, r.now_ns) : impossible(p, s, error);
}

bool write_files(player &p, const statement &s)
{
    std::string error;
    for (const file_write &file : s.files) {
        // An included file furnishes a whole device, of which a story needs a part.
        if (s.file == 0 && file.path.starts_with("nv/") && file.text) {
            p.nv_written.emplace(file.path.substr(3), where(p, s));
        }
        if (!write_device_file(p.device.device, file, error)) {
            return impossible(p, s, error);
        }
    }
    return true;
}

// s.bytes is 'MATCH' RESULT [TIMES].
bool make_fail(player &p, const statement &s)
{
    std::string error;
    if (!p.device.reads_faults) {
        return impossible(p, s, "the daemon was started without KIV_FAULTS=1");
    }
    std::istringstream rest(s.bytes.substr(s.bytes.rfind('\'') + 1));
    watched_fault fault = {
        .call = s.key, .match = s.bytes.substr(1, s.bytes.rfind('\'') - 1), .result = {}, .where = where(p, s)};
    rest >> fault.result;
    p.device.state.faults.push_back(std::move(fault));
    return add_fault(p.device.device, s.key, s.bytes, error) || impossible(p, s, error);
}

bool wait(player &p, const statement &s)
{
    if (p.device.now_ns + s.number > LONGEST_RUN_NS) {
        return impossible(p, s, "a run lasts 10000 days at most");
    }
    return let_run(p, s, p.device.now_ns + s.number);
}

bool check(player &p, const statement &s)
{
    rig &r = p.device;
    if (s.wanted.what == subject::OUTPUT && r.options.lends_terminal) {
        return impossible(p, s, "the daemon prints to the terminal; without one (</dev/null) it is read");
    }
    std::string shown;
    std::string error;
    for (int left = r.options.real_time ? RETRIES_IN_REAL_TIME : 1; left > 0; left--) {
        const std::string printed = s.wanted.what == subject::OUTPUT ? printed_in_step(r) : "";
        const surroundings around = {r.state, r.line.changes, r.line.requests, r.device, printed, r.process.pid >= 0};
        if (holds(s.wanted, around, shown)) {
            p.end_known |= s.wanted.what == subject::ENDED;
            p.held++;
            return true;
        }
        if (left > 1 && !pass_time(r, r.now_ns + 50 * NS_PER_MS, error)) {
            return failed(p, s, "the daemon comes to rest", error);
        }
    }
    return failed(p, s, s.text.substr(s.text.find(' ') + 1), shown);
}

// A daemon that has ended by itself fails the scenario unless that is what comes to be expected.
bool still_there(player &p, const statement &s)
{
    const daemon_process &process = p.device.process;
    if (p.end_known || !p.device.launched || process.pid >= 0) {
        return true;
    }
    p.end_known = true; // told once; start goes on from there
    if (s.what == verb::EXPECT) {
        return s.wanted.what == subject::ENDED || failed(p, s, s.text.substr(7), "the daemon " + process.end);
    }
    return failed(p, s, "the daemon runs", "it " + process.end);
}

bool play_all(player &p, const std::vector<statement> &statements);

bool repeat(player &p, const statement &s)
{
    const bool was_quiet = p.quiet;
    p.rounds.push_back({&s, 0});
    for (int64_t round = 0; round < s.number; round++) {
        p.quiet = was_quiet || round > 0;
        p.rounds.back().round = round + 1;
        if (!play_all(p, s.body)) {
            return false;
        }
    }
    p.quiet = was_quiet;
    p.rounds.pop_back();
    return true;
}

bool do_statement(player &p, const statement &s)
{
    std::string error;
    switch (s.what) {
    case verb::WRITE:
        return write_files(p, s);
    case verb::SEND:
    case verb::INDICATE:
        return send(p, s);
    case verb::FAIL:
        return make_fail(p, s);
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
void show(player &p, const statement &s)
{
    const bool starts = s.what == verb::LAUNCH || s.what == verb::START;
    timeline &line = p.device.line;
    if (s.what == verb::EXPECT || s.what == verb::AFTER || p.quiet || !(starts || p.device.launched)) {
        line.stimulus_us = s.what == verb::AFTER || p.quiet ? -1 : line.stimulus_us;
    } else {
        timeline_stimulus(line, p.device.now_ns / 1000, s.text);
    }
}

// All that a repeat does is one step for the expectations behind it.
bool play_one(player &p, const statement &s)
{
    if (!still_there(p, s)) {
        return false;
    }
    if (s.what != verb::EXPECT && p.rounds.empty()) {
        new_step(p.device);
        p.changes_before = 0;
        p.requests_before = 0;
    }
    show(p, s);
    return do_statement(p, s);
}

bool play_all(player &p, const std::vector<statement> &statements)
{
    return std::all_of(statements.begin(), statements.end(), [&](const statement &s) { return play_one(p, s); });
}

void begin(player &p, const scenario &story)
{
    p.story = &story;
    p.now = {};
    p.now.begin_ns = p.device.now_ns;
    p.quiet = false;
    p.rounds.clear();
    p.changes_before = p.device.line.changes.size();
    p.requests_before = p.device.line.requests.size();
}

played finish(player &p)
{
    p.now.end_ns = p.device.now_ns;
    const timeline &line = p.device.line;
    p.now.changes.assign(line.changes.begin() + static_cast<ptrdiff_t>(p.changes_before), line.changes.end());
    p.now.requests.assign(line.requests.begin() + static_cast<ptrdiff_t>(p.requests_before), line.requests.end());
    return std::move(p.now);
}
} // namespace

bool set_up_player(player &p, const player_options &options, std::string &error)
{
    rig &r = p.device;
    r.line.out = options.timeline;
    r.line.every_request = options.every_request;
    r.line.moment_length_us = options.process.real_time || !options.device.empty() ? REAL_MOMENT_US : 0;
    r.line.show_log = options.show_log;
    r.keep_trace = !options.trace_path.empty();
    return options.device.empty() ? set_up_rig(r, options.process, {}, error) : attach_rig(r, options.device, error);
}

bool renew_player(player &p, std::string &error)
{
    p.held = 0;
    p.end_known = false;
    return renew_rig(p.device, error);
}

played play_statement(player &p, const scenario &story, const statement &s)
{
    begin(p, story);
    play_one(p, s);
    return finish(p);
}

played finish_play(player &p, const scenario &story)
{
    begin(p, story);
    if (!story.statements.empty()) {
        statement end;
        end.file = story.statements.back().file;
        end.line = story.statements.back().line;
        still_there(p, end);
    }
    return finish(p);
}

void take_down_player(player &p, bool keep_device)
{
    take_down_rig(p.device, keep_device);
}

namespace
{
// A repeat sets a key or makes a call fail more than once; one that was met is enough.
std::vector<std::string> unmet(const player &p)
{
    std::vector<std::string> warnings;
    for (const watched_fault &fault : p.device.state.faults) {
        if (!fault.hit) {
            warnings.push_back(fault.where + ": warning: no call of " + fault.call + " has met this fail");
        }
    }
    for (const auto &[key, place] : p.nv_written) {
        if (!p.device.state.nv_read.contains(key)) {
            warnings.push_back(place + ": warning: nobody has read NV '" + key + "'");
        }
    }
    if (p.held == 0) {
        warnings.push_back(p.story->files[0] + ": warning: the scenario expects nothing");
    }
    return warnings;
}

bool goes_on(const player &p, const play_report &report, const player_options &options)
{
    return report.last.result == PLAY_HELD ||
           (options.keep_going && report.last.result == PLAY_FAILED && (p.device.process.pid >= 0 || p.end_known));
}
} // namespace

play_report play(const scenario &story, const player_options &options, bool keep_device, const play_watcher &watcher)
{
    player p;
    play_report report;
    std::string error;
    if (!set_up_player(p, options, error)) {
        report.last.result = PLAY_IMPOSSIBLE;
        report.last.failure = error + "\n";
        report.failed.push_back(report.last);
    }
    for (size_t at = 0; at <= story.statements.size() && goes_on(p, report, options); at++) {
        report.last =
            at < story.statements.size() ? play_statement(p, story, story.statements[at]) : finish_play(p, story);
        if (watcher && at < story.statements.size()) {
            watcher(story.statements[at], report.last);
        }
        if (report.last.result != PLAY_HELD) {
            report.failed.push_back(report.last);
        }
    }
    report.complaints = error_output(p.device.device);
    if (report.failed.empty()) {
        report.warnings = unmet(p);
    } else {
        report.last = report.failed.back();
    }
    if (!options.trace_path.empty() && !copy_file(p.device.trace_path, options.trace_path, error)) {
        report.last.result = PLAY_IMPOSSIBLE;
        report.last.failure = error + "\n";
        report.failed.push_back(report.last);
    }
    keep_device |= !report.failed.empty() && report.last.result == PLAY_FAILED;
    report.device = keep_device ? p.device.device : "";
    take_down_player(p, keep_device);
    report.held = p.held;
    report.end_ns = p.device.now_ns;
    report.leds = p.device.state.leds;
    return report;
}
