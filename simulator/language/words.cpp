#include "language/words.h"

#include <array>
#include <charconv>

namespace
{
bool is_blank(char c)
{
    return c == ' ' || c == '\t' || c == '\r';
}

std::optional<int> hex_digit(char c)
{
    if (c >= '0' && c <= '9') {
        return c - '0';
    }
    if (c >= 'a' && c <= 'f') {
        return c - 'a' + 10;
    }
    if (c >= 'A' && c <= 'F') {
        return c - 'A' + 10;
    }
    return std::nullopt;
}

// What stands behind a backslash, appended to text. Returns how many characters it took, 0 when it is no escape.
size_t take_escape(std::string_view rest, std::string &text)
{
    constexpr std::string_view letters = "nrt\"'\\";
    constexpr std::string_view meanings = "\n\r\t\"'\\";
    if (rest.empty()) {
        return 0;
    }
    if (const size_t at = letters.find(rest[0]); at != std::string_view::npos) {
        text += meanings[at];
        return 1;
    }
    if (rest[0] != 'x' || rest.size() < 3 || !hex_digit(rest[1]) || !hex_digit(rest[2])) {
        return 0;
    }
    text += static_cast<char>(*hex_digit(rest[1]) * 16 + *hex_digit(rest[2]));
    return 3;
}

// From behind the opening quote. Returns the length up to and with the closing one, 0 on an error.
size_t take_quoted(std::string_view rest, word &into, std::string &error)
{
    const size_t end = [&] {
        size_t at = 0;
        while (at < rest.size() && rest[at] != '"') {
            at += rest[at] == '\\' ? 2 : 1;
        }
        return at;
    }();
    if (end >= rest.size()) {
        error = "a quote is not closed";
        return 0;
    }
    into.quoted = true;
    return unescape(rest.substr(0, end), into.text, error) ? end + 1 : 0;
}
} // namespace

bool unescape(std::string_view escaped, std::string &text, std::string &error)
{
    for (size_t at = 0; at < escaped.size(); at++) {
        if (escaped[at] != '\\') {
            text += escaped[at];
            continue;
        }
        const size_t taken = take_escape(escaped.substr(at + 1), text);
        if (taken == 0) {
            error = "unknown escape; a text knows \\n \\r \\t \\\" \\\\ and \\x with two digits";
            return false;
        }
        at += taken;
    }
    return true;
}

bool split_line(std::string_view line, std::vector<word> &words, std::string &error)
{
    size_t at = 0;
    words.clear();
    for (;;) {
        while (at < line.size() && is_blank(line[at])) {
            at++;
        }
        if (at == line.size() || line[at] == '#') {
            return true;
        }
        word &current = words.emplace_back();
        while (at < line.size() && !is_blank(line[at])) {
            const char c = line[at++];
            if (c == '"') {
                const size_t taken = take_quoted(line.substr(at), current, error);
                if (taken == 0) {
                    return false;
                }
                at += taken;
                continue;
            }
            if (c == '=' && !current.sign) {
                current.sign = current.text.size();
            }
            current.text += c;
        }
    }
}

std::optional<int64_t> parse_number(std::string_view text, int64_t least, int64_t most)
{
    const bool hex = text.starts_with("0x") || text.starts_with("0X");
    const std::string_view digits = hex ? text.substr(2) : text;
    int64_t value = 0;
    const auto [end, failure] = std::from_chars(digits.begin(), digits.end(), value, hex ? 16 : 10);
    if (failure != std::errc() || end != digits.end() || (hex && value < 0) || value < least || value > most) {
        return std::nullopt;
    }
    return value;
}

std::optional<int64_t> parse_duration(std::string_view text)
{
    struct unit {
        std::string_view name;
        int64_t ns;
    };
    constexpr std::array units = {
        unit{"ms", NS_PER_MS       },
        unit{"s",  NS_PER_S        },
        unit{"m",  60 * NS_PER_S   },
        unit{"h",  3600 * NS_PER_S },
        unit{"d",  86400 * NS_PER_S}
    };
    constexpr int64_t longest = 1000 * 86400 * NS_PER_S;
    for (const unit &u : units) {
        if (!text.ends_with(u.name)) {
            continue;
        }
        const std::string_view digits = text.substr(0, text.size() - u.name.size());
        if (digits.starts_with("0x") || digits.starts_with("0X")) {
            return std::nullopt;
        }
        if (const std::optional<int64_t> count = parse_number(digits, 0, longest / u.ns)) {
            return *count * u.ns;
        }
    }
    return std::nullopt;
}
