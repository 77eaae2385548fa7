#include "evidence/syslog.h"

#include <algorithm>
#include <array>
#include <optional>

namespace
{
constexpr size_t LINE_MAX_SIZE = 4096;
constexpr size_t WORDS_OF_HEAD = 4; // a time's, or those between the time and the process
constexpr std::string_view DAEMON = "kiv_mirta_led";

// What lines are called after that are written without syslog: the source's name and the line in it.
constexpr std::array<std::string_view, 9> SOURCES = {DAEMON,
                                                     "kiv_mirta_led_operation",
                                                     "kiv_mirta_led_set_status",
                                                     "kiv_mirta_led_set_status_singlechip",
                                                     "kiv_led_tr181",
                                                     "kiv_led_night_mode",
                                                     "kiv_mirta_led_cpe",
                                                     "kiv_led_over_temp",
                                                     "kiv_led_data_limit"};

enum class owner { NOBODY, US, ANOTHER }; // of a line, as far as it says

struct framed {
    owner from = owner::NOBODY;
    std::string_view moment;
    std::string_view text;
};

bool has_shape(std::string_view text, std::string_view shape) // 0 a digit, a a letter, all else itself
{
    return text.size() >= shape.size() && std::equal(shape.begin(), shape.end(), text.begin(), [](char want, char is) {
               const bool digit = is >= '0' && is <= '9';
               const bool letter = (is >= 'a' && is <= 'z') || (is >= 'A' && is <= 'Z');
               return want == '0' ? digit : want == 'a' ? letter : want == is;
           });
}

bool is_number(std::string_view text)
{
    return !text.empty() && text.find_first_not_of("0123456789") == std::string_view::npos;
}

std::string_view without_blanks(std::string_view text)
{
    text.remove_prefix(std::min(text.find_first_not_of(' '), text.size()));
    return text.substr(0, text.find_last_not_of(" \r") + 1);
}

std::string_view take_word(std::string_view &rest)
{
    rest = without_blanks(rest);
    const std::string_view word = rest.substr(0, rest.find(' '));
    rest.remove_prefix(word.size());
    return word;
}

// What stands behind "Mmm dd hh:mm:ss", "Www Mmm dd hh:mm:ss yyyy" or "yyyy-mm-dd hh:mm:ss", all also with fractions
// and zones, or with a T in the middle. None when the line begins otherwise.
std::optional<std::string_view> behind_date(std::string_view rest)
{
    for (size_t words = 0; words < WORDS_OF_HEAD; words++) {
        const std::string_view word = take_word(rest);
        if (has_shape(word, "00:00:00") || has_shape(word, "0000-00-00T00:00:00")) {
            std::string_view behind = rest;
            const std::string_view year = take_word(behind);
            return year.size() == 4 && is_number(year) ? behind : rest;
        }
        const bool name = word.size() == 3 && has_shape(word, "aaa");
        const bool day = word.size() <= 2 && is_number(word);
        if (!name && !day && !has_shape(word, "0000-00-00")) {
            break;
        }
    }
    return std::nullopt;
}

// Behind seconds with a fraction, alone or in brackets.
std::optional<std::string_view> behind_seconds(std::string_view rest)
{
    const std::string_view seconds = rest.substr(0, rest.find_first_not_of("[] .0123456789"));
    const bool ends = seconds.find_first_of("] ") != std::string_view::npos;
    if (!ends || seconds.find('.') == std::string_view::npos) {
        return std::nullopt;
    }
    return rest.substr(seconds.size());
}

std::string_view take_moment(std::string_view &line)
{
    const std::optional<std::string_view> date = behind_date(line);
    const std::string_view rest = date ? *date : behind_seconds(line).value_or(line);
    const std::string_view moment = without_blanks(line.substr(0, line.size() - rest.size()));
    line = without_blanks(rest);
    return moment;
}

// NAME: or NAME[PID]: or SOURCE:LINE
owner owner_of_word(std::string_view word)
{
    const size_t end = word.find_first_of("[:");
    if (end == std::string_view::npos || end == 0) {
        return owner::NOBODY;
    }
    std::string_view name = word.substr(0, end);
    name.remove_prefix(name.rfind('/') == std::string_view::npos ? 0 : name.rfind('/') + 1);
    const std::string_view behind = word.substr(end);
    const size_t close = behind.find("]:");
    const bool pid = behind[0] == '[' && close != std::string_view::npos && is_number(behind.substr(1, close - 1));
    const bool source = std::find(SOURCES.begin(), SOURCES.end(), name) != SOURCES.end();
    if (source && (behind == ":" || (behind[0] == ':' && is_number(behind.substr(1))) || (pid && name == DAEMON))) {
        return owner::US;
    }
    return pid || behind == ":" ? owner::ANOTHER : owner::NOBODY;
}

// HOST PROCESS PID MESSAGE-ID DATA, where DATA is a dash or in brackets.
framed take_numbered_head(std::string_view rest, std::string_view moment)
{
    take_word(rest);
    const bool ours = take_word(rest) == DAEMON;
    take_word(rest);
    take_word(rest);
    rest = without_blanks(rest);
    while (rest.starts_with("[") && rest.find(']') != std::string_view::npos) {
        rest.remove_prefix(rest.find(']') + 1);
    }
    if (rest.starts_with("-")) {
        rest.remove_prefix(1);
    }
    rest.remove_prefix(rest.starts_with(" \xef\xbb\xbf") ? 4 : 0); // a mark of the encoding
    return {ours ? owner::US : owner::ANOTHER, moment, without_blanks(rest)};
}

framed take_head(std::string_view line)
{
    const size_t priority = line.starts_with("<") ? line.find('>') : std::string_view::npos;
    if (priority != std::string_view::npos && is_number(line.substr(1, priority - 1))) {
        line.remove_prefix(priority + 1);
        if (line.starts_with("1 ")) {
            line.remove_prefix(2);
            const std::string_view moment = take_moment(line);
            return take_numbered_head(line, moment);
        }
    }
    framed found = {.moment = take_moment(line), .text = line};
    std::string_view rest = line;
    for (size_t words = 0; words < WORDS_OF_HEAD && found.from == owner::NOBODY; words++) {
        found.from = owner_of_word(take_word(rest));
    }
    if (found.from == owner::US) {
        found.text = without_blanks(rest);
    }
    return found;
}

// A daemon whose log goes to standard error has a head of its own behind that of the service manager.
framed take_heads(std::string_view line)
{
    const framed outer = take_head(line);
    if (outer.from != owner::US) {
        return outer;
    }
    const framed inner = take_head(outer.text);
    const bool nested = inner.from == owner::US;
    return {owner::US, outer.moment.empty() ? inner.moment : outer.moment, nested ? inner.text : outer.text};
}

// Bytes that a terminal would act upon are not shown.
std::string printable(std::string_view text)
{
    std::string shown(text);
    std::replace_if(
        shown.begin(), shown.end(), [](char c) { return (c >= 0 && c < ' ') || c == 0x7f; }, '?');
    return shown;
}

// A bare log may have lines of other processes in it that say their number.
bool names_another(std::string_view text)
{
    for (size_t words = 0; words < WORDS_OF_HEAD; words++) {
        const std::string_view word = take_word(text);
        if (owner_of_word(word) == owner::ANOTHER && word.ends_with("]:")) {
            return true;
        }
    }
    return false;
}

bool sounds_like_us(const log_line &line)
{
    constexpr std::array pieces = {"kiv_led_", "kiv_mirta_led", "messageParse", "recv REG_"};
    return std::any_of(pieces.begin(), pieces.end(),
                       [&](const char *piece) { return line.text.find(piece) != std::string::npos; });
}
} // namespace

std::vector<log_line> own_lines(std::string_view log)
{
    std::vector<log_line> named;
    std::vector<log_line> bare;
    for (size_t number = 1; !log.empty(); number++) {
        const size_t end = std::min(log.find('\n'), log.size());
        std::string_view line = log.substr(0, std::min(end, LINE_MAX_SIZE));
        const framed found = take_heads(line);
        if (found.from == owner::US) {
            named.push_back({number, printable(found.moment), printable(found.text)});
        } else if (named.empty()) {
            take_moment(line);
            if (!names_another(line)) {
                bare.push_back({number, printable(found.moment), printable(line)});
            }
        }
        log.remove_prefix(std::min(end + 1, log.size()));
    }
    if (!named.empty() || std::none_of(bare.begin(), bare.end(), sounds_like_us)) {
        return named;
    }
    return bare;
}
