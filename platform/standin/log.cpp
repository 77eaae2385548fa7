#include "kiv/log.h"

#include "standin.h"
#include "trace/calls.h"

#include <chrono>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <mutex>
#include <sys/uio.h>
#include <unistd.h>

enum { SINK_NONE = -1, LINE_MAX_SIZE = 1024 }; // a longer line is cut

static std::mutex sink_lock;
static std::atomic<int> sink_fd{SINK_NONE};
static std::atomic<unsigned> sink_generation{~0U}; // the generation that sink_fd belongs to

static int open_sink()
{
    const char *path = getenv("KIV_LOG");
    if (path == nullptr || path[0] == '\0') {
        path = "-";
    }
    return strcmp(path, "none") == 0 ? SINK_NONE : standin_open_sink("KIV_LOG", path);
}

static int sink()
{
    if (sink_generation.load(std::memory_order_acquire) == standin_generation) {
        return sink_fd;
    }
    const std::lock_guard guard(sink_lock);
    if (sink_generation != standin_generation) {
        if (sink_fd > STDERR_FILENO) {
            close(sink_fd);
        }
        sink_fd = open_sink();
        sink_generation = standin_generation.load();
    }
    return sink_fd;
}

static int format_head(char *head, size_t size, int level, const char *file, int line)
{
    timespec now{};
    clock_gettime(CLOCK_REALTIME, &now);
    // The calendar of <chrono>: gmtime_r would read the time zone file on its first call.
    const std::chrono::sys_seconds moment{std::chrono::seconds{now.tv_sec}};
    const auto midnight = std::chrono::floor<std::chrono::days>(moment);
    const std::chrono::year_month_day date{midnight};
    const auto second = static_cast<int>((moment - midnight).count());
    const char *word = level == KIV_LOG_ERROR ? "ERROR" : level == KIV_LOG_INFO ? "INFO" : "LEVEL";
    return snprintf(head, size, "%04d-%02u-%02u %02d:%02d:%02d.%03d %s %.64s:%d ", static_cast<int>(date.year()),
                    static_cast<unsigned>(date.month()), static_cast<unsigned>(date.day()), second / 3600,
                    second / 60 % 60, second % 60, static_cast<int>(now.tv_nsec / 1000000), word, file, line);
}

// A line of the log is one line of the sink, whatever its text holds; the newline that most texts end with is ours.
static size_t escape_text(const char *text, char *escaped, size_t size)
{
    size_t length = strlen(text);
    size_t used = 0;
    while (length > 0 && text[length - 1] == '\n') {
        length--;
    }
    for (size_t at = 0; at < length && used + 5 < size; at++) {
        const auto byte = static_cast<unsigned char>(text[at]);
        if (byte < 0x20 || byte == 0x7f) {
            used += static_cast<size_t>(snprintf(escaped + used, size - used, "\\x%02x", byte));
        } else {
            escaped[used++] = text[at];
        }
    }
    return used;
}

static void write_line(int fd, int level, const char *file, int line, const char *text)
{
    char head[160];
    char body[4 * LINE_MAX_SIZE];
    char newline[] = "\n";
    const int head_length = format_head(head, sizeof head, level, file, line);
    const size_t body_length = escape_text(text, body, sizeof body);
    iovec parts[] = {
        {head,    static_cast<size_t>(head_length)},
        {body,    body_length                     },
        {newline, 1                               }
    };
    standin_write(fd, parts, 3); // a log that cannot be written stops nobody
}

void kiv_syslog_append(int level, const char *file, int line, int log_id, const char *format, ...)
{
    const int fd = sink();
    if (fd == SINK_NONE && standin_watched == 0) {
        return;
    }
    char text[LINE_MAX_SIZE];
    va_list arguments;
    va_start(arguments, format);
    const int length = vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    if (length < 0) {
        return;
    }
    standin_call(
        __func__, [&](trace_line &trace) { trace_log(trace, level, file, line, log_id, text); },
        [&] {
            if (fd != SINK_NONE) {
                write_line(fd, level, file == nullptr ? "-" : file, line, text);
            }
            return 0;
        },
        [](trace_line &trace, int) { trace_close(trace); });
}
