#include "evidence/why.h"

#include "evidence/drops.h"
#include "evidence/from_log.h"
#include "evidence/statements.h"

#include <algorithm>

namespace
{
constexpr size_t MOST_LINES = 8; // of one kind: the last ones

using lines = std::vector<std::string>;

void put(std::string &answer, std::string_view label, const std::string &text)
{
    std::string row = "  " + std::string(label);
    row.resize(std::max<size_t>(row.size() + 1, 17), ' ');
    answer += row + text + "\n";
}

void put_all(std::string &answer, std::string_view label, const lines &texts)
{
    for (size_t at = texts.size() - std::min(texts.size(), MOST_LINES); at < texts.size(); at++) {
        put(answer, label, texts[at]);
        label = "";
    }
}

std::string look_text(const history &told, const led_look &look)
{
    if (!told.from_log) {
        return describe(look);
    }
    const std::string dimmed = look.brightness == 1 ? ", dimmed" : "";
    return look.mode == led_mode::OFF ? "off" : (look.mode == led_mode::ON ? "on" : "blink") + dimmed;
}

std::string group_of(int led)
{
    const std::string_view name = led_name(led);
    return std::string(name.substr(0, name.find('_')));
}

// A scene decides once for all its LEDs.
std::vector<size_t> all_before(const history &told, const led_change &change)
{
    std::vector<size_t> way;
    for (size_t at = told.activities[change.in].entry; at < change.request; at++) {
        if (told.activity_of[at] == change.in) {
            way.push_back(at);
        }
    }
    return way;
}

// The entries of the activity from behind the last request for another group's LED up to the request. What is read and
// decided for an LED stands there.
std::vector<size_t> way_to(const history &told, const led_change &change, int led)
{
    std::vector<size_t> way = all_before(told, change);
    const auto last = std::find_if(way.rbegin(), way.rend(), [&](size_t at) {
        const trace_entry &entry = told.trace->entries[at];
        const std::optional<led_wanted> request = led_request_of(entry);
        return entry.call == "kiv_bsp_set_leds_sync" && !(request && group_of(request->led) == group_of(led));
    });
    way.erase(way.begin(), last.base());
    way.push_back(change.request);
    return way;
}

std::string value_read(const trace_entry &entry)
{
    const std::vector<std::string> key = quoted_texts(entry.arguments);
    const size_t text = entry.result.find('"');
    if (entry.call == "kiv_nvconfig_read" && !key.empty()) {
        return "NV " + key[0] + " = " + (text == std::string::npos ? "missing" : entry.result.substr(text));
    }
    if (entry.call == "kiv_cfg_get_item" || entry.call.starts_with("kiv_bsp_get_") || entry.call == "read") {
        return entry.call + "(" + entry.arguments + ") = " + entry.result;
    }
    return {};
}

// What every message and every request logs says nothing about this one.
bool is_routine(const std::string &text)
{
    constexpr std::array pieces = {"enter messageParse",      "recv_msg.us_",        "regDecodeMsg",
                                   "[info] source msg",       "[info] msg MSG_CMD_", "led_id=",
                                   "kiv_led_set_all_leds_off"};
    const bool group_off = text.ends_with("_led_off");
    return text.empty() || group_off || std::any_of(pieces.begin(), pieces.end(), [&](const char *piece) {
               return text.find(piece) != std::string::npos;
           });
}

std::string decision(const trace_entry &entry)
{
    const std::string text = log_text(entry);
    return is_routine(text) ? "" : shortened(text);
}

// What the entries on the way tell, each thing once.
lines told_on(const history &told, const std::vector<size_t> &way, std::string (*tell)(const trace_entry &))
{
    lines texts;
    for (const size_t at : way) {
        const std::string text = tell(told.trace->entries[at]);
        if (!text.empty() && std::find(texts.begin(), texts.end(), text) == texts.end()) {
            texts.push_back(text);
        }
    }
    return texts;
}

// Since when it is night, and who found that out.
std::string night_before(const history &told, size_t from)
{
    for (size_t at = from + 1; at-- > 0;) {
        if (log_text(told.trace->entries[at]).starts_with("Night mode, LED OFF!")) {
            return "; night since " + when(told, at) + ", by " + describe(told, told.activity_of[at]);
        }
    }
    return {};
}

// What the night gate made of the request, from its own log line.
std::string gate_on(const history &told, const std::vector<size_t> &way, int led)
{
    const std::string line = "Night mode check: led_id=" + std::to_string(led) + " brightness=";
    std::string changed;
    for (const size_t at : way) {
        const std::string text = log_text(told.trace->entries[at]);
        if (text.starts_with(line)) {
            const std::string left = text.substr(line.size());
            changed =
                left == "0" ? "the night gate, which switched it off" : "the night gate, which dimmed it to " + left;
        }
    }
    return changed.empty() ? changed : changed + night_before(told, way.front());
}

void explain(std::string &answer, const history &told, const led_change &change, int led)
{
    const trace_entry &request = told.trace->entries[change.request];
    const std::vector<size_t> way = way_to(told, change, led);
    const lines decisions = told_on(told, way, decision);
    put(answer, "set off by", describe(told, change.in));
    put_all(answer, "read", told_on(told, way, value_read));
    put_all(answer, "decided", decisions.empty() ? told_on(told, all_before(told, change), decision) : decisions);
    if (const std::optional<led_wanted> wanted = led_request_of(request); wanted && !told.from_log) {
        put(answer, "asked for", describe(wanted->look) + (change.failed ? "" : ", which the board did"));
    }
    if (change.failed) {
        put(answer, "failed", "with " + request.result + "; the LED stays as it was");
    }
    if (const std::string gate = gate_on(told, way, led); !gate.empty()) {
        put(answer, "changed by", gate);
    }
}

void explain_drops(std::string &answer, const history &told, int led, size_t from, size_t until)
{
    lines drops;
    for (size_t at = from; at < until; at++) {
        const std::string why_not = dropped_for(led, log_text(told.trace->entries[at]));
        if (!why_not.empty()) {
            drops.push_back(describe(told, told.activity_of[at]) + ", at " + when(told, at) + ": " + why_not);
        }
    }
    put_all(answer, "dropped", drops);
}

// The last change that happened before an entry, counted from 1; 0 for none.
size_t changes_until(const std::vector<led_change> &changes, size_t until)
{
    size_t count = 0;
    while (count < changes.size() && changes[count].request < until) {
        count++;
    }
    return count;
}

// From the last one on back to the one that made it so.
size_t origin_of(const std::vector<led_change> &changes, size_t last)
{
    while (last > 0 && changes[last].before == changes[last].after) {
        last--;
    }
    return last;
}

void explain_untold(std::string &answer, const history &told, const led_change *change)
{
    if (told.from_log) {
        put_all(answer, "not in the log", untold_by_log(told, change));
    }
}

void explain_last_asked(std::string &answer, const history &told, const led_change &last, int led)
{
    if (last.failed) {
        put(answer, "then failed", "at " + when(told, last.request) + ":");
        explain(answer, told, last, led);
    } else {
        put(answer, "asked again", "at " + when(told, last.request) + " by " + describe(told, last.in));
    }
}
} // namespace

std::string why(const history &told, int led, size_t until)
{
    const std::vector<led_change> changes = changes_of(told, led);
    const size_t count = changes_until(changes, until);
    const std::string name(led_name(led));
    std::string answer;
    if (count == 0) {
        answer = name + " is dark: nobody has asked for it since the " + (told.from_log ? "log" : "trace") +
                 " begins, at " + when(told, 0) + "\n";
        explain_drops(answer, told, led, 0, until);
        explain_untold(answer, told, nullptr);
        return answer;
    }
    const led_change &last = changes[count - 1];
    const led_change &origin = changes[origin_of(changes, count - 1)];
    const bool dark = last.after.mode == led_mode::OFF;
    answer = name + (dark ? " is dark" : " shows " + look_text(told, last.after)) + ", since " +
             when(told, origin.request) + "\n";
    if (dark) {
        const bool lit = origin.before.mode != led_mode::OFF;
        put(answer, "before", lit ? look_text(told, origin.before) : "it had not been lit since the beginning");
    }
    explain(answer, told, origin, led);
    if (&last != &origin) {
        explain_last_asked(answer, told, last, led);
    }
    if (dark) {
        explain_drops(answer, told, led, origin.request, until);
    }
    explain_untold(answer, told, &origin);
    return answer;
}

std::string why_always(const history &told, int led)
{
    std::string answer;
    for (const led_change &change : changes_of(told, led)) {
        const std::string look = change.failed ? "fails" : look_text(told, change.after);
        if (!change.failed && change.before == change.after) {
            continue;
        }
        std::string row = when(told, change.request) + "  " + look;
        row.resize(std::max<size_t>(row.size() + 1, told.from_log ? 44 : 30), ' ');
        answer += row + describe(told, change.in) + "\n";
    }
    return answer.empty() ? std::string(led_name(led)) + " never changes\n" : answer;
}

size_t entry_after(const recording &trace, int64_t time_us)
{
    size_t at = trace.entries.size();
    while (at > 0 && trace.entries[at - 1].time_us > time_us) {
        at--;
    }
    return at;
}
