#include "evidence/recording.h"

#include "world/device.h"

#include <filesystem>

namespace
{
constexpr int64_t DISORDER_US = 1'000'000; // lines of several threads overtake one another, but not by that much

bool refuse(const recording &in, size_t line, const std::string &what, std::string &error)
{
    error = in.name + ":" + std::to_string(line) + ": " + what;
    return false;
}

bool in_order(const recording &in, const trace_entry &next)
{
    return in.entries.empty() || is_head(next) || next.time_us + DISORDER_US > in.entries.back().time_us;
}

// A file system that lost its power may hand out zeros where the end was.
std::string_view without_lost_end(std::string_view text, bool &cut)
{
    const size_t end = text.find_last_not_of('\0');
    cut = end != std::string_view::npos && (end + 1 != text.size() || text[end] != '\n');
    return text.substr(0, end + 1);
}
} // namespace

bool is_head(const trace_entry &entry)
{
    return entry.call == "kiv_trace";
}

std::string moment(int64_t time_us)
{
    std::string fraction = std::to_string(1000 + time_us / 1000 % 1000);
    return std::to_string(time_us / 1'000'000) + "." + fraction.substr(1);
}

bool parse_recording(std::string_view text, const std::string &name, recording &out, std::string &error)
{
    out = {.name = name, .entries = {}};
    text = without_lost_end(text, out.cut);
    for (size_t number = 1; !text.empty(); number++) {
        const size_t end = text.find('\n');
        if (end == std::string_view::npos && number > 1) {
            break; // half a line
        }
        std::optional<trace_entry> entry = parse_trace_line(std::string(text.substr(0, end)));
        if (!entry) {
            return refuse(out, number, "no line of a trace, which is SECONDS.MICROS THREAD CALL(ARGUMENTS)", error);
        }
        if (!in_order(out, *entry)) {
            return refuse(out, number, "older than the line before it; the lines are not in their order", error);
        }
        out.entries.push_back(std::move(*entry));
        text.remove_prefix(std::min(end, text.size() - 1) + 1);
    }
    if (out.entries.empty()) {
        error = name + ": there is no trace in it";
    }
    return !out.entries.empty();
}

bool read_evidence(const std::string &path, std::string &text, std::string &error)
{
    std::error_code failure;
    if (!std::filesystem::is_regular_file(path, failure) || !read_file(path, text)) {
        error = path + ": cannot be read";
        return false;
    }
    if (text.size() > RECORDING_MAX) {
        error = path + ": larger than 64 MiB; cut out the part that matters";
        return false;
    }
    return true;
}

bool load_recording(const std::string &path, recording &out, std::string &error)
{
    std::string text;
    return read_evidence(path, text, error) && parse_recording(text, path, out, error);
}
