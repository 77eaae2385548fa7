// The C library as the recorder's front: what the daemon observes of the device through it. Calls of others go by.
#include "record.h"

#include <atomic>
#include <cstdarg>
#include <cstring>

namespace
{
constexpr const char *KERNEL_LEDS = "/sys/class/leds/";

std::atomic<int> led_file{-1}; // what the daemon has opened in that folder last

void record_number(const char *call, long long result)
{
    trace_line line;
    trace_begin(line, call);
    trace_number_result(line, result);
    record_write(line);
}

void record_sleep(const char *call, unsigned amount)
{
    trace_line line;
    trace_begin(line, call);
    trace_add(line, "%u", amount);
    trace_close(line);
    record_write(line);
}

void record_text(const char *call, const char *text, int result)
{
    trace_line line;
    trace_begin(line, call);
    trace_text(line, text);
    trace_result(line, result);
    record_write(line);
}

int record_open(const char *path, int fd, const void *caller)
{
    if (strncmp(path, KERNEL_LEDS, strlen(KERNEL_LEDS)) == 0 && record_takes(caller)) {
        record_text("open", path, fd);
        led_file = fd;
    }
    return fd;
}
} // namespace

#define CALLER __builtin_return_address(0)

extern "C" {

time_t time(time_t *result) noexcept
{
    const time_t now = next().time(result);
    if (record_takes(CALLER)) {
        record_number("time", now);
    }
    return now;
}

unsigned sleep(unsigned seconds)
{
    if (record_takes(CALLER)) {
        record_sleep("sleep", seconds);
    }
    return next().sleep(seconds);
}

int usleep(useconds_t microseconds)
{
    if (record_takes(CALLER)) {
        record_sleep("usleep", microseconds);
    }
    return next().usleep(microseconds);
}

int open(const char *path, int flags, ...)
{
    va_list arguments;
    va_start(arguments, flags);
    const int mode = flags & (O_CREAT | O_TMPFILE) ? va_arg(arguments, int) : 0;
    va_end(arguments);
    return record_open(path, next().open(path, flags, mode), CALLER);
}

ssize_t read(int fd, void *buffer, size_t size)
{
    const ssize_t got = next().read(fd, buffer, size);
    if (fd >= 0 && fd == led_file && record_takes(CALLER)) {
        trace_line line;
        trace_begin(line, "read");
        trace_add(line, "%d, %zu", fd, size);
        trace_bytes_result(line, static_cast<int>(got), buffer);
        record_write(line);
    }
    return got;
}

int system(const char *command)
{
    const int status = next().system(command);
    if (command && record_takes(CALLER)) {
        record_text("system", command, status);
    }
    return status;
}

int pthread_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *), void *argument) noexcept
{
    const int result = next().pthread_create(id, attributes, body, argument);
    if (result != 0 && record_takes(CALLER)) {
        trace_line line;
        trace_begin(line, "pthread_create");
        trace_result(line, result);
        record_write(line);
    }
    return result;
}

pthread_t pthread_self() noexcept
{
    const pthread_t self = next().pthread_self();
    if (record_takes(CALLER)) {
        record_number("pthread_self", static_cast<long long>(self));
    }
    return self;
}
}
