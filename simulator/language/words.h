// One line of a scenario as words, and the numbers and times among them.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

constexpr int64_t NS_PER_US = 1'000;
constexpr int64_t NS_PER_MS = 1'000'000;
constexpr int64_t NS_PER_S = 1'000'000'000;

struct word {
    std::string text;           // without quotes, escapes resolved
    bool quoted = false;        // some of it stood in quotes, so it is never a keyword
    std::optional<size_t> sign; // where the first '=' outside quotes stands
};

// Splits at blanks, outside quotes; '#' ends the line. False with an error text: an open quote, an unknown escape.
bool split_line(std::string_view line, std::vector<word> &words, std::string &error);

// Decimal or 0x and hexadecimal digits, nothing else around them.
std::optional<int64_t> parse_number(std::string_view text, int64_t least, int64_t most);

// 500ms, 10s, 2m, 3h or 1d, up to 1000 days, in nanoseconds.
std::optional<int64_t> parse_duration(std::string_view text);

// The C escapes of a quoted text resolved, as the trace writes them too. False with what was wrong in error.
bool unescape(std::string_view escaped, std::string &text, std::string &error);
