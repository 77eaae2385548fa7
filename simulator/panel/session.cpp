#include "panel/session.h"

#include "evidence/history.h"
#include "language/words.h"
#include "panel/front.h"
#include "world/device.h"

#include <algorithm>
#include <filesystem>
#include <utility>

namespace
{
constexpr size_t NEWS_MAX = 1000; // of each kind
constexpr int64_t ROUNDS_MAX = 20'000;
constexpr int64_t SLICE_NS = 3600 * NS_PER_S;
constexpr int64_t LATEST_NS = 10'000 * 86'400 * NS_PER_S;
constexpr int64_t LONGEST_REAL_NS = 100 * NS_PER_MS; // more is not caught up with
constexpr int HEAD_LINE_MAX = 400;

template <typename T> void tell(session &s, std::deque<T> told::*list, const T &item)
{
    for (told *where : {&s.news, &s.past}) {
        (where->*list).push_back(item);
        if ((where->*list).size() > NEWS_MAX) {
            (where->*list).pop_front();
            where->left_out++;
        }
    }
}

int led_in_log(const std::string &text)
{
    constexpr std::string_view key = "led_id=";
    const size_t at = text.find(key);
    if (at == std::string::npos) {
        return -1;
    }
    const std::string_view rest = std::string_view(text).substr(at + key.size());
    return static_cast<int>(parse_number(rest.substr(0, rest.find_first_not_of("0123456789")), 0, 81).value_or(-1));
}

told_line line_of(const trace_entry &entry)
{
    told_line line = {.time_us = entry.time_us, .level = LEVEL_OF_CALLS, .led = -1, .thread = entry.thread, .text = {}};
    if (entry.call == "kiv_syslog_append") {
        line.text = log_text(entry);
        line.level = entry.arguments.starts_with("0,") ? 0 : 6;
        line.led = led_in_log(line.text);
    } else {
        const std::optional<led_wanted> request = led_request_of(entry);
        line.text = entry.call + "(" + entry.arguments + ")" + (entry.result.empty() ? "" : " = " + entry.result);
        line.led = request ? request->led : -1;
    }
    line.text.resize(std::min(line.text.size(), size_t{HEAD_LINE_MAX}));
    return line;
}

// After everything that may have moved the daemon.
void take_changes(session &s, const std::vector<led_event> &changes)
{
    for (const led_event &change : changes) {
        s.since_us[static_cast<size_t>(change.led)] = change.time_us;
        tell<told_change>(s, &told::changes, {change.time_us, change.led, change.look});
    }
}

std::string text_of(const statement &s)
{
    std::string text = s.text + "\n";
    if (s.what == verb::REPEAT) {
        for (const statement &inner : s.body) {
            text += text_of(inner);
        }
        text += "end\n";
    }
    return text;
}

void keep_statement(session &s, int64_t time_ns, const std::string &text)
{
    s.kept_bytes += text.size() + 1;
    if (s.kept_bytes <= SCENARIO_FILE_MAX) {
        s.kept.push_back({time_ns, text});
    }
}

// A daemon that is gone by itself is part of the story, and may be started again.
void look_after_daemon(session &s)
{
    rig &r = s.device.device;
    if (s.death_told || !has_ended(r.process)) {
        return;
    }
    s.death_told = true;
    s.device.end_known = true;
    forget_process(r.state);
    forget_queue(r.wires);
    const bool was_killed = r.process.end.find("signal 9") != std::string::npos;
    keep_statement(s, r.now_ns, was_killed ? "kill\n" : "expect ended\n");
    tell<told_statement>(s, &told::statements, {r.now_ns / NS_PER_US, "the daemon " + r.process.end});
}

bool pass(session &s, int64_t until_ns, std::string &error)
{
    rig &r = s.device.device;
    bool went_on = true;
    while (went_on && r.now_ns < until_ns && !*s.stop) {
        went_on = pass_time(r, std::min(until_ns, r.now_ns + SLICE_NS), error);
        take_changes(s, std::exchange(r.line.changes, {}));
        r.line.requests.clear();
    }
    look_after_daemon(s);
    return went_on;
}

int64_t rounds_of(const statement &s)
{
    if (s.what != verb::REPEAT) {
        return 1;
    }
    int64_t rounds = 1;
    for (const statement &inner : s.body) {
        rounds = std::min(rounds + rounds_of(inner), ROUNDS_MAX + 1);
    }
    return std::min(rounds * std::min(s.number, ROUNDS_MAX + 1), ROUNDS_MAX + 1);
}

played play_now(session &s, const scenario &script, const statement &what)
{
    rig &r = s.device.device;
    played did = play_statement(s.device, script, what);
    s.death_told = r.process.pid < 0 && (s.death_told || s.device.end_known);
    if (what.what != verb::EXPECT) {
        tell<told_statement>(s, &told::statements, {did.begin_ns / NS_PER_US, what.text});
    }
    if (did.result == PLAY_HELD) {
        keep_statement(s, did.begin_ns, text_of(what));
    }
    take_changes(s, did.changes);
    look_after_daemon(s);
    return did;
}

// What a person is told of a statement that did not hold.
std::string complaint(const played &did)
{
    if (did.result == PLAY_FAILED) {
        return "expected: " + did.expected + "; shown: " + did.shown;
    }
    const std::string first = did.failure.substr(0, did.failure.find('\n'));
    const size_t place = first.find(": ");
    return place == std::string::npos ? first : first.substr(place + 2);
}

bool refuse_include(const std::string &, std::string &)
{
    return false;
}

bool do_one(session &s, const scenario &script, const statement &what, std::string &message)
{
    if (rounds_of(what) > ROUNDS_MAX) {
        message = "more than 20000 statements at once";
        return false;
    }
    if (what.what == verb::AFTER) {
        new_step(s.device.device);
        const int64_t until_ns = s.device.device.now_ns + what.number;
        if (until_ns <= LATEST_NS) {
            return pass(s, until_ns, message);
        }
        message = "a device lives 10000 days at most";
        return false;
    }
    const played did = play_now(s, script, what);
    message = did.result == PLAY_HELD ? "" : complaint(did);
    return did.result == PLAY_HELD;
}

void next_of_story(session &s)
{
    story &play = s.play;
    const statement &what = play.script.statements[play.next];
    story_line &line = play.lines[play.next];
    if (what.what == verb::AFTER && play.wait_until_ns < 0) {
        new_step(s.device.device);
        play.wait_until_ns = s.device.device.now_ns + what.number;
    }
    if (what.what == verb::AFTER && s.device.device.now_ns < play.wait_until_ns) {
        return;
    }
    if (what.what != verb::AFTER) {
        const played did = play_now(s, play.script, what);
        play.failed = did.result != PLAY_HELD;
        line.shown = play.failed ? complaint(did) : "";
    }
    play.wait_until_ns = -1;
    line.state = play.failed ? line_state::FAILED : line_state::HELD;
    play.next++;
}

bool story_goes_on(const session &s)
{
    return !s.play.name.empty() && !s.play.failed && s.play.next < s.play.script.statements.size();
}
} // namespace

bool open_session(session &s, const player_options &options, std::string &error)
{
    s.options = options;
    s.device.device.watcher = [&s](const trace_entry &entry) { tell(s, &told::lines, line_of(entry)); };
    return set_up_player(s.device, options, error);
}

void close_session(session &s)
{
    take_down_player(s.device, false);
}

outcome renew(session &s, const std::string &statements)
{
    outcome result;
    if (!renew_player(s.device, result.message)) {
        result.line = 1;
        return result;
    }
    s.generation++;
    s.owed_ns = 0;
    s.since_us = {};
    s.news = {};
    s.past = {};
    s.play = {};
    s.kept = {};
    s.kept_bytes = 0;
    s.death_told = true;
    return do_text(s, statements);
}

outcome do_text(session &s, const std::string &text)
{
    outcome result;
    scenario script;
    std::string error;
    if (!parse_scenario(text, "", refuse_include, script, error)) { // ":LINE: what is wrong"
        const size_t end = error.find(": ", 1);
        result.line = std::max(1, atoi(error.c_str() + 1));
        result.message = end == std::string::npos ? error : error.substr(end + 2);
        return result;
    }
    for (const statement &what : script.statements) {
        if (*s.stop || !do_one(s, script, what, result.message)) {
            result.line = what.line;
            return result;
        }
        result.done++;
    }
    return result;
}

bool begin_story(session &s, const std::string &path, std::string &error)
{
    std::string text;
    scenario script;
    error = path + " cannot be read";
    if (!read_file(path, text) || !parse_scenario(text, path, read_file, script, error)) {
        return false;
    }
    const outcome fresh = renew(s, "");
    if (fresh.line > 0) {
        error = fresh.message;
        return false;
    }
    s.play.name = path;
    for (const statement &what : script.statements) {
        s.play.lines.push_back({.text = what.text, .state = line_state::COMING, .shown = {}});
    }
    s.play.script = std::move(script);
    s.running = true;
    return true;
}

void go_on(session &s, int64_t real_ns)
{
    rig &r = s.device.device;
    std::string error;
    look_after_daemon(s);
    if (!s.running) {
        return;
    }
    if (story_goes_on(s)) {
        next_of_story(s);
    }
    s.owed_ns += std::min(real_ns, LONGEST_REAL_NS) * s.speed;
    int64_t until_ns = r.now_ns + s.owed_ns / NS_PER_MS * NS_PER_MS;
    s.owed_ns %= NS_PER_MS;
    if (s.play.wait_until_ns >= 0) {
        until_ns = std::min(until_ns, s.play.wait_until_ns);
    } else if (story_goes_on(s)) {
        return; // its statements come at once, time passes where it says so
    }
    if (until_ns > LATEST_NS || !pass(s, until_ns, error)) {
        s.running = false;
    }
}

bool step_to_deadline(session &s)
{
    rig &r = s.device.device;
    std::string error;
    const int64_t deadline_ns = r.process.next_deadline_ns;
    if (r.process.pid < 0 || deadline_ns < r.now_ns) {
        return false;
    }
    // Whole milliseconds, as a scenario can tell them.
    int64_t until_ns = std::max(r.now_ns + NS_PER_MS, (deadline_ns + NS_PER_MS - 1) / NS_PER_MS * NS_PER_MS);
    if (s.play.wait_until_ns >= 0) {
        until_ns = std::min(until_ns, s.play.wait_until_ns);
    }
    return pass(s, until_ns, error);
}

std::string keep(const session &s)
{
    const rig &r = s.device.device;
    if (s.kept_bytes > SCENARIO_FILE_MAX) {
        return {};
    }
    std::string text = "# Kept from the panel.\n";
    int64_t now_ns = 0;
    const auto wait_for = [&](int64_t time_ns) {
        if (time_ns > now_ns) {
            text += "after " + std::to_string((time_ns - now_ns) / NS_PER_MS) + "ms\n";
        }
        now_ns = time_ns;
    };
    for (const kept_statement &done : s.kept) {
        wait_for(done.time_ns);
        text += done.text;
    }
    wait_for(r.now_ns);
    if (!r.launched) {
        return text;
    }
    text += r.process.pid < 0 ? "expect ended\n" : "";
    return text + expect_lit(r.state.leds) + "\n";
}

const product_name *product_of(const session &s)
{
    std::string text;
    if (!read_device_text(s.device.device.device, "cfg/6000", text)) {
        return nullptr;
    }
    for (const product_name &product : all_products()) {
        if (product.cfg_text == text) {
            return &product;
        }
    }
    return nullptr;
}
