#include "standin.h"

#include "kiv/socket.h"

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <sys/uio.h>
#include <unistd.h>

enum { WATCH_TRACE = 1, WATCH_FAULTS = 2 };

enum { ARGUMENTS_LIMIT = 4352 }; // holds the longest message with every byte escaped

std::atomic<int> standin_watched{0};
static std::atomic<int> trace_fd{-1};

static thread_local char label[12];
static std::atomic<int> other_threads{0};
static std::atomic<bool> receiver_known{false};

int standin_open_sink(const char *variable, const char *path)
{
    if (strcmp(path, "-") == 0)
        return STDERR_FILENO;
    const int fd = open(path, O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
    if (fd < 0)
        standin_error("%s=%s: %s", variable, path, strerror(errno));
    return fd;
}

void trace_reload()
{
    const char *path = getenv("KIV_TRACE");
    const char *faults = getenv("KIV_FAULTS");
    const int old = trace_fd.exchange(-1);
    if (old > STDERR_FILENO)
        close(old);
    int watched = 0;
    if (path != nullptr && path[0] != '\0')
        trace_fd = standin_open_sink("KIV_TRACE", path);
    if (trace_fd >= 0)
        watched |= WATCH_TRACE;
    if (faults != nullptr && strcmp(faults, "1") == 0)
        watched |= WATCH_FAULTS;
    standin_watched = watched;
}

__attribute__((constructor)) static void read_variables_at_load()
{
    trace_reload();
}

static bool is_main_thread()
{
    return gettid() == getpid();
}

void trace_label(const char *name)
{
    if (!is_main_thread())
        snprintf(label, sizeof label, "%s", name);
}

void trace_label_receiver()
{
    if (!is_main_thread() && !receiver_known.exchange(true))
        trace_label("receive");
}

static const char *thread_label()
{
    if (label[0] != '\0')
        return label;
    if (is_main_thread())
        snprintf(label, sizeof label, "main");
    else
        snprintf(label, sizeof label, "t%d", ++other_threads);
    return label;
}

void trace_begin(trace_line &line, const char *call)
{
    line.call = call;
    line.length = 0;
    line.limit = ARGUMENTS_LIMIT;
    line.text[0] = '\0';
}

void trace_add(trace_line &line, const char *format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    const int length = vsnprintf(line.text + line.length, line.limit - line.length, format, arguments);
    va_end(arguments);
    if (length > 0)
        line.length += static_cast<size_t>(length);
    if (line.length >= line.limit)
        line.length = line.limit - 1;
}

// The escape of one byte; every \x escape has two digits.
static const char *escape(unsigned char byte, char *room, size_t size)
{
    switch (byte) {
    case '\n':
        return "\\n";
    case '\r':
        return "\\r";
    case '\t':
        return "\\t";
    case '"':
        return "\\\"";
    case '\\':
        return "\\\\";
    default:
        room[0] = static_cast<char>(byte);
        room[1] = '\0';
        if (byte < 0x20 || byte >= 0x7f)
            snprintf(room, size, "\\x%02x", byte);
        return room;
    }
}

void trace_text_of(trace_line &line, const char *text, size_t size)
{
    if (text == nullptr) {
        trace_add(line, "null");
        return;
    }
    trace_add(line, "\"");
    for (size_t at = 0; at < size && text[at] != '\0' && line.length + 8 < line.limit; at++) {
        char room[8];
        const char *shown = escape(static_cast<unsigned char>(text[at]), room, sizeof room);
        while (*shown != '\0')
            line.text[line.length++] = *shown++;
    }
    trace_add(line, "\"");
}

void trace_text(trace_line &line, const char *text)
{
    trace_text_of(line, text, SIZE_MAX);
}

static bool is_daemon_record(const unsigned char *data, size_t size, daemon_record *record)
{
    if (size != sizeof *record)
        return false;
    memcpy(record, data, sizeof *record);
    return record->record_type == DAEMON_RECORD_HELLO || record->record_type == DAEMON_RECORD_START ||
           record->record_type == DAEMON_RECORD_REG_COMPLETE;
}

void trace_message(trace_line &line, const unsigned char *data, size_t size)
{
    daemon_record record;
    if (is_daemon_record(data, size, &record)) {
        trace_add(line, ", record %d ", record.record_type);
        trace_text_of(line, record.process_name, sizeof record.process_name);
        trace_add(line, " ");
        trace_text_of(line, record.queue_name, sizeof record.queue_name);
        return;
    }
    uint16_t head[6];
    uint32_t masks[4] = {};
    if (size < sizeof head)
        return;
    memcpy(head, data, sizeof head);
    trace_add(line, ", cmd %u dest %u source %u len %u", head[0], head[2], head[3], head[4]);
    if (head[0] == MSG_CMD_SERVICE_REG && size >= sizeof head + sizeof masks) {
        memcpy(masks, data + sizeof head, sizeof masks);
        trace_add(line, " masks 0x%x 0x%x 0x%x 0x%x", masks[0], masks[1], masks[2], masks[3]);
    } else if (size >= sizeof head + sizeof masks[0]) {
        memcpy(masks, data + sizeof head, sizeof masks[0]);
        trace_add(line, " event 0x%x ", masks[0]);
        const size_t text_at = sizeof head + sizeof masks[0];
        trace_text_of(line, reinterpret_cast<const char *>(data + text_at), size - text_at);
    }
}

bool trace_fault(trace_line &line, int *result)
{
    if ((standin_watched & WATCH_FAULTS) == 0 || !standin_fault(line.call, line.text, result))
        return false;
    trace_result(line, *result);
    trace_end(line);
    return true;
}

void trace_result(trace_line &line, int result)
{
    line.limit = sizeof line.text;
    trace_add(line, ") = %d", result);
}

void trace_end(trace_line &line)
{
    if ((standin_watched & WATCH_TRACE) == 0)
        return;
    char head[96];
    char newline[] = "\n";
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    const int length = snprintf(head, sizeof head, "%lld.%06ld %s %s(", static_cast<long long>(now.tv_sec),
                                now.tv_nsec / 1000, thread_label(), line.call);
    const iovec parts[] = {
        {head,      static_cast<size_t>(length)},
        {line.text, line.length                },
        {newline,   1                          }
    };
    if (writev(trace_fd, parts, 3) < 0)
        standin_error("the trace cannot be written: %s", strerror(errno));
}
