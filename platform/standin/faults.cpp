#include "standin.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <mutex>
#include <string_view>
#include <unistd.h>

// One line of a fault file. times_at is where its count stands in the file, 0 digits when it has none.
struct fault_row {
    std::string_view match;
    int result;
    int times;
    size_t times_at;
    size_t times_digits;
};

enum { FAULT_FILE_MAX = 65536 };

static std::mutex fault_lock;              // counting down reads and writes the file
static char file_text[FAULT_FILE_MAX + 1]; // under fault_lock

static std::string_view next_word(std::string_view line, size_t &at)
{
    at = line.find_first_not_of(" \t", at);
    if (at == std::string_view::npos) {
        at = line.size();
        return {};
    }
    const bool quoted = line[at] == '\'';
    const size_t start = quoted ? at + 1 : at;
    const size_t end = quoted ? line.find('\'', start) : line.find_first_of(" \t", start);
    const size_t stop = end == std::string_view::npos ? line.size() : end;
    at = quoted && stop < line.size() ? stop + 1 : stop;
    return line.substr(start, stop - start);
}

static bool parse_number(std::string_view word, int *value)
{
    char text[16];
    if (word.empty() || word.size() >= sizeof text) {
        return false;
    }
    memcpy(text, word.data(), word.size());
    text[word.size()] = '\0';
    return standin_parse_ints(text, value, 1) == 1;
}

static bool parse_row(std::string_view line, fault_row &row)
{
    size_t at = 0;
    row.match = next_word(line, at);
    if (row.match.empty() || !parse_number(next_word(line, at), &row.result)) {
        return false;
    }
    const std::string_view times = next_word(line, at);
    row.times = 1;
    row.times_digits = times.size();
    row.times_at = times.empty() ? 0 : static_cast<size_t>(times.data() - line.data());
    return times.empty() || (parse_number(times, &row.times) && row.times >= 0);
}

// The count is written over itself in as many digits, so that a restarted process goes on counting.
static void count_down(int fd, const fault_row &row, size_t line_at)
{
    char text[16];
    if (row.times_digits == 0) {
        return;
    }
    const int length = snprintf(text, sizeof text, "%0*d", static_cast<int>(row.times_digits), row.times - 1);
    if (pwrite(fd, text, static_cast<size_t>(length), static_cast<off_t>(line_at + row.times_at)) != length) {
        standin_error("faults: a count cannot be written");
    }
}

static bool find_row(int fd, std::string_view file, const char *call, std::string_view arguments, int *result)
{
    for (size_t at = 0; at < file.size();) {
        const size_t end = std::min(file.find('\n', at), file.size());
        const std::string_view line = file.substr(at, end - at);
        const size_t line_at = at;
        fault_row row{};
        at = end + 1;
        if (line.find_first_not_of(" \t\r") == std::string_view::npos || line[0] == '#') {
            continue;
        }
        if (!parse_row(line, row)) {
            standin_error("faults/%s: not a line of MATCH RESULT [TIMES]: %.*s", call, static_cast<int>(line.size()),
                          line.data());
            continue;
        }
        if (row.times == 0 || (row.match != "*" && arguments.find(row.match) == std::string_view::npos)) {
            continue;
        }
        count_down(fd, row, line_at);
        *result = row.result;
        return true;
    }
    return false;
}

// A file that is too long is said to be, and what fits of it counts.
static std::string_view read_faults(int fd, const char *call)
{
    size_t length = 0;
    for (;;) {
        const ssize_t got = read(fd, file_text + length, sizeof file_text - length);
        if (got <= 0) {
            break;
        }
        length += static_cast<size_t>(got);
    }
    if (length > FAULT_FILE_MAX) {
        standin_error("faults/%s is longer than %d bytes; the rest is left out", call, FAULT_FILE_MAX);
        length = FAULT_FILE_MAX;
    }
    return {file_text, length};
}

bool standin_fault(const char *call, const char *arguments, int *result)
{
    char path[96];
    const int device = standin_device_dir();
    if (device < 0) {
        return false;
    }
    snprintf(path, sizeof path, "faults/%s", call);
    const std::lock_guard guard(fault_lock);
    const int fd = standin_open(device, path, O_RDWR | O_NONBLOCK);
    if (fd < 0) {
        return false;
    }
    const bool hit = find_row(fd, read_faults(fd, call), call, arguments, result);
    close(fd);
    return hit;
}
