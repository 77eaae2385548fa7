#include "evidence/syslog.h"

#include "evidence/statements.h"
#include "language/vocabulary.h"

#include <algorithm>
#include <array>
#include <regex>

namespace
{
constexpr size_t LINE_MAX_SIZE = 1200; // the daemon's longest line and a head

const std::regex &priority()
{
    static const std::regex pattern("<[0-9]+>(?:1 )?");
    return pattern;
}

// Mmm dd hh:mm:ss, Www Mmm dd hh:mm:ss yyyy, yyyy-mm-dd hh:mm:ss or with a T, with fractions and zones; seconds.
const std::regex &time_stamp()
{
    static const std::regex pattern("(?:(?:[A-Z][a-z]{2} )?[A-Z][a-z]{2} +[0-9]{1,2} [0-9:.]{8,}(?: [0-9]{4}(?= ))?|"
                                    "[0-9]{4}-[0-9]{2}-[0-9]{2}[T ][0-9:.,]{8,}(?:Z|[+-][0-9:]+)?|"
                                    "\\[ *[0-9]+\\.[0-9]+\\]|[0-9]+\\.[0-9]+(?= )) *");
    return pattern;
}

// Any of the names that the daemon logs under, its own among them.
std::string our_names()
{
    std::string names;
    for (const std::string_view source : log_sources()) {
        names += (names.empty() ? "(?:" : "|") + std::string(source);
    }
    return names + ")";
}

// NAME: and NAME[PID]: behind a host or a level; NAME:LINE of standard error; and of RFC 5424 HOST NAME PID ID DATA.
const std::regex &our_head()
{
    static const std::regex pattern("(?:[^ :]+ +){0,3}(?:[^ :]*/)?"
                                    "(?:" +
                                    our_names() + "(?:(?:\\[[0-9]+\\])?:(?= |$)|:[0-9]+(?= |$))|" +
                                    "kiv_mirta_led [^ ]+ [^ ]+ (?:-|(?:\\[[^\\]]*\\])+)(?:\xef\xbb\xbf)?) *");
    return pattern;
}

const std::regex &head_of_another()
{
    static const std::regex pattern("(?:[^ ]+ +){0,3}[^ :\\[]+\\[[0-9]+\\]:");
    return pattern;
}

// Takes what matches off the line's beginning.
bool take(std::string_view &line, const std::regex &pattern, std::string *taken = nullptr)
{
    std::cmatch found;
    const char *begin = line.data();
    if (!std::regex_search(begin, begin + line.size(), found, pattern, std::regex_constants::match_continuous)) {
        return false;
    }
    if (taken) {
        *taken = found.str();
        taken->erase(taken->find_last_not_of(' ') + 1);
    }
    line.remove_prefix(static_cast<size_t>(found.length()));
    return true;
}

std::string without_end(std::string_view line)
{
    return printable(line.substr(0, line.find_last_not_of(" \r") + 1));
}

// True when the line names the daemon. It has a second head where its standard error went to a logger.
bool take_heads(std::string_view &line, std::string &moment)
{
    std::string_view inner;
    take(line, priority());
    take(line, time_stamp(), &moment);
    if (!take(line, our_head())) {
        return false;
    }
    inner = line;
    take(inner, time_stamp());
    if (take(inner, our_head())) {
        line = inner;
    }
    return true;
}

template <size_t count> bool holds_one(std::string_view text, const std::array<const char *, count> &pieces)
{
    return std::any_of(pieces.begin(), pieces.end(),
                       [&](const char *piece) { return text.find(piece) != std::string_view::npos; });
}

bool sounds_like_us(const log_line &line)
{
    return holds_one(line.text, std::array{"kiv_led_", "kiv_mirta_led", "messageParse", "recv REG_"});
}

bool tells_of_dropped_lines(std::string_view line)
{
    return holds_one(line, std::array{"Suppressed ", "rate-limiting", "messages lost"});
}
} // namespace

std::vector<log_line> own_lines(std::string_view log)
{
    std::vector<log_line> named;
    std::vector<log_line> bare;
    for (size_t number = 1; !log.empty(); number++) {
        const size_t end = std::min(log.find('\n'), log.size());
        std::string_view line = log.substr(0, std::min(end, LINE_MAX_SIZE));
        std::string moment;
        const bool text = line.find('\0') == std::string_view::npos; // else a program, or what a power cut has left
        if (text && take_heads(line, moment)) {
            named.push_back({number, moment, without_end(line)});
        } else if (text && tells_of_dropped_lines(line)) {
            (named.empty() ? bare : named).push_back({number, moment, DROPPED_LINES});
        } else if (text && named.empty() && !take(line, head_of_another())) {
            bare.push_back({number, moment, without_end(line)});
        }
        log.remove_prefix(std::min(end + 1, log.size()));
    }
    if (!named.empty() || std::none_of(bare.begin(), bare.end(), sounds_like_us)) {
        return named;
    }
    return bare;
}
