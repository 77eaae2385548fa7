#include "standin.h"
#include "trace/calls.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <sys/uio.h>
#include <unistd.h>

enum { WATCH_TRACE = 1, WATCH_FAULTS = 2 };

std::atomic<int> standin_watched{0};
static std::atomic<int> trace_fd{-1};
static std::atomic<bool> begun{false}; // the trace has its first line

void trace_reload()
{
    const char *path = getenv("KIV_TRACE");
    const char *faults = getenv("KIV_FAULTS");
    const int old = trace_fd.exchange(-1);
    if (old > STDERR_FILENO) {
        close(old);
    }
    int watched = 0;
    begun = false;
    if (path != nullptr && path[0] != '\0') {
        trace_fd = standin_open_sink("KIV_TRACE", path);
        watched |= WATCH_TRACE;
    }
    if (faults != nullptr && strcmp(faults, "1") == 0) {
        watched |= WATCH_FAULTS;
    }
    standin_watched = watched;
}

__attribute__((constructor)) static void read_variables_at_load()
{
    trace_reload();
}

bool trace_fault(trace_line &line, int *result)
{
    if ((standin_watched & WATCH_FAULTS) == 0 || !standin_fault(line.call, line.text, result)) {
        return false;
    }
    trace_result(line, *result);
    trace_end(line);
    return true;
}

// Who reads the trace takes what is not in it for not done, so the process ends with the first byte that is lost.
// Standard error is for people, who may stop looking.
static void lose_trace(int failure)
{
    if (trace_fd != STDERR_FILENO) {
        standin_error("the trace cannot be written: %s", strerror(failure));
        _exit(TRACE_LOST_STATUS);
    }
}

static void write_line(const trace_line &line)
{
    char head[96];
    char newline[] = "\n";
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    const size_t length = trace_head(head, sizeof head, now, trace_thread(), line.call);
    iovec parts[] = {
        {head,                          length     },
        {const_cast<char *>(line.text), line.length},
        {newline,                       1          }
    };
    const int failure = standin_write(trace_fd, parts, 3);
    if (failure != 0) {
        lose_trace(failure);
    }
}

// Apart, so that the line does not lie on the stack of every call.
[[gnu::noinline]] static void write_start()
{
    trace_line line;
    trace_begin(line, "kiv_trace");
    trace_start(line);
    write_line(line);
}

void trace_end(trace_line &line)
{
    if ((standin_watched & WATCH_TRACE) == 0) {
        return;
    }
    if (!begun.exchange(true)) {
        write_start();
    }
    write_line(line);
}
