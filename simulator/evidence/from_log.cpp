#include "evidence/from_log.h"

#include "evidence/statements.h"
#include "evidence/syslog.h"
#include "kiv/socket.h"

#include <algorithm>
#include <array>
#include <cstdlib>
#include <sstream>

namespace
{
constexpr int64_t US_PER_S = 1'000'000;
constexpr size_t FAR_BACK = 40; // entries, from a failure to its request

struct timer_row {
    std::string_view name;
    const char *arguments;    // of kiv_timer
    std::string_view started; // a piece of the line that says so
    std::string_view fires;   // and of the one that says that its time has come
};

constexpr std::string_view NO_LINE = "\n";
constexpr std::array timer_rows = {
    timer_row{"the new message's timer", "10000, once",   "enter kiv_led_set_new_sms_timer",
              "enter kiv_led_new_sms_timeout_proc"                                                                                                     },
    timer_row{"night mode's timer",      "20000, repeat", "Creat night mode check timer SUCCESS",
              "is in night, mode switch]:,"                                                                                                            },
    timer_row{"the data volume's timer", "5000, repeat",  "[IN FUNC]:kiv_led_start_remind_data_limit_check",
              "enter  get_dstStatus status:"                                                                                                           },
    timer_row{"the reminder's timer",    "1000, repeat",  NO_LINE,                                           "[IN FUNC]:kiv_led_remind_data_limit_proc"},
    timer_row{"the temperature's timer", "20000, repeat", "Enable temp led FUNC!!",                          "temp led FUNC and "                      },
};
constexpr std::string_view SET_UP = "Cur Temp LED switch:"; // what comes right behind it is no timer's

// Requests that leave no line of their own, by the line before them.
struct silent_row {
    std::string_view line;
    const char *requests;
    std::string_view refused; // a piece of the next line when they are not made
};

constexpr std::array silent_rows = {
    silent_row{"enter kiv_led_set_all_leds_on",                   "bat_green on 4,id_41 on 4,sms_blue on 4,net_red on 4",                 NO_LINE        },
    silent_row{"recv REG_MC_EVENT_INITAL",                        "bat_green off 0,bat_red on 4,id_41 off 0,sms_blue off 0,net_14 off 0",
               NO_LINE                                                                                                                                   },
    silent_row{"kiv_singlechip_led_set_all_white_leds_on start!", "wifi_blue on 2,net_white on 2,sig_blue on 3",
               NO_LINE                                                                                                                                   },
    silent_row{"recv_VoiceMailStatus:0",                          "voicemail_green off 0",                                                "not power on!"},
};

// Requests that a later line makes certain.
struct awaited {
    std::string requests;
    std::string_view refused; // a piece of the next line when they are not made
    std::string behind_off;   // made only behind this group's going off
};

// As far as its lines have told it.
struct told_message {
    size_t entry = SIZE_MAX;
    long source = 0;
    long cmd = 0;
    long event = 0;
    std::optional<std::string> text = {};
};

struct reading {
    recording &calls;
    std::vector<std::string> &moments; // by entry
    const log_line *line = nullptr;
    std::string before; // the line before
    awaited next;
    told_message message; // the last one
};

bool holds(const std::string &text, std::string_view piece)
{
    return text.find(piece) != std::string::npos;
}

// What stands behind the piece; none without it.
std::optional<std::string> behind(const std::string &text, std::string_view piece)
{
    const size_t at = text.find(piece);
    return at == std::string::npos ? std::nullopt : std::optional(text.substr(at + piece.size()));
}

std::optional<long> number_behind(const std::string &text, std::string_view piece)
{
    const std::optional<std::string> found = behind(text, piece);
    if (!found) {
        return std::nullopt;
    }
    return strtol(found->c_str() + std::min(found->find_first_not_of(" ="), found->size()), nullptr, 10);
}

void put(reading &in, const std::string &call, const std::string &arguments, const std::string &result = {})
{
    const std::string number = "line " + std::to_string(in.line->number);
    in.calls.entries.push_back({.time_us = static_cast<int64_t>(in.line->number) * US_PER_S,
                                .line = {},
                                .thread = "log",
                                .call = call,
                                .arguments = arguments,
                                .result = result});
    in.moments.push_back(in.line->moment.empty() ? number : in.line->moment + " (" + number + ")");
}

void put_requests(reading &in, const std::string &requests)
{
    std::istringstream list(requests);
    for (std::string request; std::getline(list, request, ',');) {
        put(in, "kiv_bsp_set_leds_sync", request, "0");
    }
}

void begin_message(reading &in)
{
    in.message = {.entry = in.calls.entries.size()};
    put(in, "kiv_recv_msg", "");
}

// As the trace tells it. Of a command the log has no more than the number; the daemon's own has no more.
void tell_message(reading &in)
{
    const auto &[entry, source, cmd, event, text] = in.message;
    const bool own = cmd == KIV_MSG_CMD_LED_RELIGHT_MSG && source == KIV_MODULE_LED;
    const size_t size = own ? 0 : sizeof(uint32_t) + (text ? text->size() + 1 : 0);
    const long sender = own || cmd == MSG_CMD_SERVICE_NOTIFY ? source : long{KIV_MODULE_MAIN};
    std::ostringstream told;
    told << 12 + size << ", cmd " << cmd << " dest 38 source " << sender << " len " << size;
    if (!own) {
        told << " event 0x" << std::hex << static_cast<uint32_t>(event) << " " << quoted(text.value_or(""));
    }
    in.calls.entries[entry].result = told.str();
}

void take_message(reading &in, const std::string &text)
{
    const std::optional<long> cmd = number_behind(text, "recv_msg.us_cmd is ");
    const std::optional<long> event = number_behind(text, "regDecodeMsg source_id ");
    const std::optional<std::string> flag = behind(text, "recv REG_WMS_SMS_VOCEMAIL_SET_FLAG: ");
    const std::optional<std::string> data = holds(text, "_UNREAD_SMS") ? flag : behind(text, "p_data=");
    if (holds(text, "enter messageParse fun") || ((cmd || event) && in.message.entry == SIZE_MAX)) {
        begin_message(in);
    }
    in.message.source = number_behind(text, "source_module_id is ").value_or(event.value_or(in.message.source));
    if (cmd) {
        in.message.cmd = *cmd;
    } else if (event) {
        in.message.cmd = MSG_CMD_SERVICE_NOTIFY;
        in.message.event = number_behind(text, "mask1 ").value_or(0);
    } else if (flag || data) {
        in.message.text = flag ? flag : data;
    }
    if ((cmd || event || flag || data) && in.message.cmd != 0) {
        tell_message(in);
    }
}

void take_timer(reading &in, const std::string &text)
{
    for (const timer_row &row : timer_rows) {
        const std::string handle = std::to_string(&row - timer_rows.data() + 1);
        if (holds(text, row.started)) {
            put(in, "kiv_timer", row.arguments, handle);
        }
        if (holds(text, row.fires) && !holds(in.before, SET_UP)) {
            put(in, "kiv_timer_fire", handle);
        }
    }
}

void take_cause(reading &in, const std::string &text)
{
    take_message(in, text);
    take_timer(in, text);
    if (holds(text, "kiv_mirta_led start!")) {
        put(in, "kiv_trace", "");
        in.message = {};
    } else if (const auto event = number_behind(text, "kiv_led_bspIpcCallBack : event id = ")) {
        put(in, "kiv_bsp_ind", std::to_string(*event));
    }
}

// The LEDs of a group: those that are called after a colour, and every bar.
std::string off_requests(const std::string &group)
{
    std::string requests;
    for (const led_row &row : led_rows) {
        const std::string name = row.name;
        const bool numbered = name.find_first_of("0123456789") != std::string::npos;
        if (name.starts_with(group + "_") && (!numbered || group == "sigbar")) {
            requests += name + " off 0,";
        }
    }
    return requests;
}

std::string request_text(const reading &in, long led, long operation)
{
    constexpr std::array modes = {" on ", " off ", " blink "}; // by led_operation
    const bool dimmed = holds(in.before, "Night mode check: led_id=" + std::to_string(led) + " brightness=1");
    const bool known = operation >= LED_OP_ON && operation <= LED_OP_BLINK;
    const std::string name(led_name(static_cast<int>(led)));
    return name + (known ? modes[static_cast<size_t>(operation)] : " operation ") + (dimmed ? "1" : "0");
}

void take_off(reading &in, const std::string &group)
{
    put_requests(in, off_requests(group));
    if (in.next.behind_off == group) {
        put_requests(in, in.next.requests);
        in.next = {};
    }
}

void take_operation(reading &in, const std::string &group, long led, long operation)
{
    const bool off_behind = group == "net" || group == "rssi" || group == "bat";
    in.next = {request_text(in, led, operation), group == "power" ? "led id error!" : NO_LINE, off_behind ? group : ""};
}

void take_request(reading &in, const std::string &text)
{
    const std::string what = behind(text, "kiv_led_set_").value_or("");
    const std::string group = what.substr(0, what.find("_led_o"));
    const std::optional<long> led = number_behind(what, "_led_operation led_id");
    const std::optional<long> operation = number_behind(what, "led_operation=");
    if (what.ends_with("_led_off")) {
        take_off(in, group);
    } else if (led && operation) {
        take_operation(in, group, *led, *operation);
    }
    for (const silent_row &row : silent_rows) {
        if (holds(text, row.line)) {
            in.next = {row.requests, row.refused, ""};
        }
    }
}

// "set GROUP COLOUR off fail: N", "set ID fail:N", "set GROUP ... led fail: N": of the last such request.
void take_failure(reading &in, const std::string &text)
{
    const auto result = number_behind(text, "fail:");
    std::string name = behind(text, "set ").value_or("");
    if (!result || name.empty()) {
        return;
    }
    const size_t end = holds(name, " led fail:") ? name.find(' ') : std::min(name.find(" off "), name.find(" fail"));
    name.resize(std::min(end, name.size()));
    name.erase(name.find_last_not_of(' ') + 1);
    if (const size_t digit = name.find_first_of("0123456789"); digit != std::string::npos) {
        name = led_name(atoi(name.c_str() + digit));
    }
    std::replace(name.begin(), name.end(), ' ', '_');
    std::vector<trace_entry> &entries = in.calls.entries;
    for (size_t at = entries.size(); at-- > entries.size() - std::min(entries.size(), FAR_BACK);) {
        trace_entry &entry = entries[at];
        const bool named = entry.arguments.starts_with(name + " ") || entry.arguments.starts_with(name + "_");
        const bool off = holds(entry.arguments, " off ");
        if (entry.call == "kiv_bsp_set_leds_sync" && named && (off || !holds(text, " off "))) {
            entry.result = std::to_string(*result);
            return;
        }
    }
}

void settle_next(reading &in, const std::string &text)
{
    if (in.line && in.next.behind_off.empty()) {
        put_requests(in, holds(text, in.next.refused) ? "" : in.next.requests);
        in.next = {};
    }
}

void take_line(reading &in, const log_line &line)
{
    settle_next(in, line.text);
    in.line = &line;
    take_cause(in, line.text);
    put(in, "kiv_syslog_append", "6, \"log\", 0, 31, " + quoted(line.text));
    if (holds(line.text, "Night mode, LED OFF!") || holds(line.text, "Now is Normal mode") ||
        holds(line.text, "AND EXIT night mode")) {
        put(in, "kiv_lib_led_relight_msg", "", "0");
    }
    take_request(in, line.text);
    take_failure(in, line.text);
    in.before = line.text;
}

bool tells_requests(const recording &calls)
{
    return std::any_of(calls.entries.begin(), calls.entries.end(),
                       [](const trace_entry &entry) { return entry.call == "kiv_bsp_set_leds_sync"; });
}
} // namespace

bool parse_log(std::string_view text, const std::string &name, log_history &out, std::string &error)
{
    const std::vector<log_line> log = own_lines(text);
    out.calls = std::make_unique<recording>();
    std::vector<std::string> moments;
    reading in = {.calls = *out.calls, .moments = moments, .before = {}, .next = {}, .message = {}};
    for (const log_line &line : log) {
        take_line(in, line);
    }
    settle_next(in, "");
    if (log.empty()) {
        error = name + ": no line of kiv_mirta_led in it";
        return false;
    }
    out.told = history_of(*out.calls);
    out.told.from_log = true;
    out.told.moments = std::move(moments);
    for (const timer_row &row : timer_rows) {
        out.told.timer_names.emplace_back(row.name);
    }
    return true;
}

bool load_log(const std::string &path, log_history &out, std::string &error)
{
    std::string text;
    return read_evidence(path, text, error) && parse_log(text, path, out, error);
}

std::vector<std::string> untold_by_log(const history &told, const led_change *change)
{
    const std::vector<trace_entry> &entries = told.trace->entries;
    const auto dropped = std::find_if(entries.rbegin(), entries.rend(),
                                      [](const trace_entry &entry) { return log_text(entry) == DROPPED_LINES; });
    std::vector<std::string> untold;
    if (dropped != entries.rend()) {
        const auto at = static_cast<size_t>(entries.rend() - dropped) - 1;
        untold.push_back("what the logger has dropped, for the last time at " + when(told, at));
    }
    if (!tells_requests(*told.trace)) {
        untold.emplace_back("requests: it is kept without the daemon's lines of level 6, so all else is a guess");
    } else if (!change) {
        untold.emplace_back("what the LED showed before its first line, and what it may have lost");
    } else {
        untold.emplace_back("brightness and blink times, and each value read that no line repeats");
        untold.emplace_back("threads: a line in between may be of something else");
        const activity &doing = told.activities[change->in];
        if (doing.what == cause::TIMER && doing.asked_for == doing.entry) {
            untold.emplace_back("who started the timer");
        }
    }
    return untold;
}
