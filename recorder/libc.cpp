// The C library as a front: what the daemon observes of the device through it. Calls of others go by. Never built with
// a sanitizer: its runtime comes through here before a thread is set up.
#ifdef KIV_REPLAY
#include "replay.h"
#else
#include "record.h"
#endif

#include <atomic>
#include <cstdarg>
#include <cstring>

namespace
{
constexpr const char *KERNEL_LEDS = "/sys/class/leds/";

std::atomic<int> led_file{
    -1}; // what the daemon has opened in that folder last; in a replay as the recording numbers it

// Of calls that the daemon's libraries make as well.
auto libc_call(const char *call, const void *caller, auto arguments, auto work, auto results, auto put)
{
    return takes_call(caller) ? front_call(call, caller, arguments, work, results, put) : work();
}

bool is_led_file(int fd)
{
    return fd >= 0 && fd == led_file.load();
}
} // namespace

extern "C" {

time_t time(time_t *result) noexcept
{
    return libc_call(
        "time", CALLER, no_arguments, [&] { return next().time(result); }, trace_number_result,
        [&](const answer &told) {
            if (result) {
                *result = static_cast<time_t>(told.result);
            }
        });
}

pthread_t pthread_self() noexcept
{
    return libc_call(
        "pthread_self", CALLER, no_arguments, [] { return next().pthread_self(); },
        [](trace_line &line, pthread_t self) { trace_number_result(line, static_cast<long long>(self)); }, nothing);
}

unsigned sleep(unsigned seconds)
{
    return takes_call(CALLER) && !front_sleep("sleep", seconds) ? 0 : next().sleep(seconds);
}

int usleep(useconds_t microseconds)
{
    return takes_call(CALLER) && !front_sleep("usleep", microseconds) ? 0 : next().usleep(microseconds);
}

int open(const char *path, int flags, ...)
{
    va_list arguments;
    va_start(arguments, flags);
    const int mode = flags & (O_CREAT | O_TMPFILE) ? va_arg(arguments, int) : 0;
    va_end(arguments);
    const auto work = [&] { return next().open(path, flags, mode); };
    if (strncmp(path, KERNEL_LEDS, strlen(KERNEL_LEDS)) != 0 || !takes_call(CALLER)) {
        return work();
    }
    const int fd = front_call(
        "open", CALLER, [&](trace_line &line) { trace_text(line, path); }, work, trace_result, nothing);
    led_file = fd;
    return fd;
}

ssize_t read(int fd, void *buffer, size_t size)
{
    const auto work = [&] { return next().read(fd, buffer, size); };
    if (!is_led_file(fd)) {
        return work();
    }
    return libc_call(
        "read", CALLER, [&](trace_line &line) { trace_add(line, "%d, %zu", fd, size); }, work,
        [&](trace_line &line, ssize_t got) { trace_bytes_result(line, static_cast<int>(got), buffer); },
        [&](const answer &told) { put_bytes(told, buffer, size); });
}

int close(int fd)
{
    const bool led = is_led_file(fd);
    if (led) {
        led_file = -1;
    }
    return led && REPLAYS ? 0 : next().close(fd);
}

int system(const char *command)
{
    return front_call(
        "system", CALLER, [&](trace_line &line) { trace_text(line, command); }, [&] { return next().system(command); },
        trace_result, nothing);
}
}
