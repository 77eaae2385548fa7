#include "seen/trace.h"

#include "language/names.h"
#include "language/words.h"

#include <array>
#include <cmath>
#include <cstdio>
#include <fcntl.h>
#include <unistd.h>

namespace
{
constexpr int BLOCKS_AT_ONCE = 64;

// The position of the next c outside quotes, or npos.
size_t find_outside_quotes(const std::string &text, char c, size_t from)
{
    bool quoted = false;
    for (size_t at = from; at < text.size(); at++) {
        if (quoted && text[at] == '\\') {
            at++;
        } else if (text[at] == '"') {
            quoted = !quoted;
        } else if (!quoted && text[at] == c) {
            return at;
        }
    }
    return std::string::npos;
}

std::optional<int64_t> parse_time_us(std::string_view text)
{
    const size_t dot = text.find('.');
    if (dot == std::string_view::npos || text.size() - dot != 7) {
        return std::nullopt;
    }
    const auto seconds = parse_number(text.substr(0, dot), 0, INT64_MAX / 2'000'000);
    const auto micros = parse_number(text.substr(dot + 1), 0, 999'999);
    if (!seconds || !micros) {
        return std::nullopt;
    }
    return *seconds * 1'000'000 + *micros;
}
} // namespace

bool open_trace(trace_file &trace, const std::string &path)
{
    trace.fd = open(path.c_str(), O_RDONLY | O_CREAT | O_CLOEXEC, 0600);
    return trace.fd >= 0;
}

void close_trace(trace_file &trace)
{
    trace.rest.clear();
    if (trace.fd >= 0) {
        close(trace.fd);
    }
    trace.fd = -1;
}

std::vector<trace_entry> read_trace(trace_file &trace)
{
    std::vector<trace_entry> entries;
    std::array<char, 65536> block;
    for (int blocks = 0; blocks < BLOCKS_AT_ONCE; blocks++) {
        const ssize_t got = read(trace.fd, block.data(), block.size());
        if (got <= 0) {
            break;
        }
        trace.rest.append(block.data(), static_cast<size_t>(got));
    }
    size_t begin = 0;
    for (size_t end = trace.rest.find('\n'); end != std::string::npos; end = trace.rest.find('\n', begin)) {
        if (std::optional<trace_entry> entry = parse_trace_line(trace.rest.substr(begin, end - begin))) {
            entries.push_back(std::move(*entry));
        }
        begin = end + 1;
    }
    trace.rest.erase(0, begin);
    return entries;
}

std::optional<trace_entry> parse_trace_line(const std::string &line)
{
    const size_t thread = line.find(' ');
    const size_t call = thread == std::string::npos ? thread : line.find(' ', thread + 1);
    const size_t open = call == std::string::npos ? call : line.find('(', call);
    const size_t close = open == std::string::npos ? open : find_outside_quotes(line, ')', open + 1);
    if (close == std::string::npos) {
        return std::nullopt;
    }
    const std::optional<int64_t> time = parse_time_us(std::string_view(line).substr(0, thread));
    if (!time) {
        return std::nullopt;
    }
    trace_entry entry;
    entry.time_us = *time;
    entry.line = line;
    entry.thread = line.substr(thread + 1, call - thread - 1);
    entry.call = line.substr(call + 1, open - call - 1);
    entry.arguments = line.substr(open + 1, close - open - 1);
    if (line.compare(close, 4, ") = ") == 0) {
        entry.result = line.substr(close + 4);
    }
    return entry;
}

std::optional<led_wanted> led_request_of(const trace_entry &entry)
{
    std::array<char, 32> name;
    std::array<char, 16> mode;
    led_wanted wanted;
    led_look &look = wanted.look;
    if (entry.call != "kiv_bsp_set_leds_sync") {
        return std::nullopt;
    }
    if (sscanf(entry.arguments.c_str(), "%31s %15s %d %d/%d", name.data(), mode.data(), &look.brightness,
               &look.blink_time1, &look.blink_time2) < 3) {
        return std::nullopt;
    }
    const std::optional<int> led = find_led(name.data());
    if (!led) {
        return std::nullopt;
    }
    wanted.led = *led;
    const std::string_view shown = mode.data();
    if (shown == "blink") {
        look.mode = led_mode::BLINK;
    } else if (shown == "on") {
        look.mode = led_mode::ON;
    } else {
        look = {};
    }
    return wanted;
}

std::vector<std::string> quoted_texts(const std::string &arguments)
{
    std::vector<std::string> texts;
    for (size_t at = arguments.find('"'); at != std::string::npos; at = arguments.find('"', at)) {
        size_t end = at + 1;
        while (end < arguments.size() && arguments[end] != '"') {
            end += arguments[end] == '\\' ? 2 : 1;
        }
        std::string error;
        unescape(std::string_view(arguments).substr(at + 1, std::min(end, arguments.size()) - at - 1),
                 texts.emplace_back(), error);
        at = std::min(end + 1, arguments.size());
    }
    return texts;
}
