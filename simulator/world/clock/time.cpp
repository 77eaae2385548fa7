// The clocks and the sleeps.
#include "baton.h"
#include "real.h"

#include <cerrno>
#include <cstdio>

namespace
{
bool is_virtual(clockid_t clock)
{
    return clock != CLOCK_PROCESS_CPUTIME_ID && clock != CLOCK_THREAD_CPUTIME_ID && clock >= 0 && baton_held();
}

bool is_wall(clockid_t clock)
{
    return clock == CLOCK_REALTIME || clock == CLOCK_REALTIME_COARSE || clock == CLOCK_TAI;
}

int64_t to_ns(const timespec &time)
{
    return time.tv_sec * NS_PER_SECOND + time.tv_nsec;
}

timespec to_timespec(int64_t ns)
{
    timespec time = {};
    time.tv_sec = static_cast<time_t>(ns / NS_PER_SECOND);
    time.tv_nsec = static_cast<long>(ns % NS_PER_SECOND);
    return time;
}

void sleep_for(int64_t ns)
{
    baton_wait({.deadline_ns = virtual_monotonic_ns() + ns});
}

// Sleeps of the daemon itself are part of what it does to the device, so they stand in its trace.
void trace_sleep(const char *name, unsigned amount, const void *caller)
{
    trace_line line;
    if (is_traced(caller)) {
        trace_begin(line, name);
        trace_add(line, "%u", amount);
        trace_close(line);
        trace_end(line);
    }
}

void trace_time(time_t now)
{
    trace_line line;
    trace_begin(line, "time");
    trace_number_result(line, now);
    trace_end(line);
}
} // namespace

extern "C" {

time_t time(time_t *result) noexcept
{
    const auto now = baton_held() ? static_cast<time_t>(virtual_wall_ns() / NS_PER_SECOND) : real().time(nullptr);
    if (result) {
        *result = now;
    }
    if (is_traced(__builtin_return_address(0))) {
        trace_time(now);
    }
    return now;
}

int gettimeofday(timeval *result, void *zone) noexcept
{
    if (!baton_held()) {
        return real().gettimeofday(result, zone);
    }
    const timespec now = to_timespec(virtual_wall_ns());
    result->tv_sec = now.tv_sec;
    result->tv_usec = now.tv_nsec / 1000;
    return 0;
}

int clock_gettime(clockid_t clock, timespec *result) noexcept
{
    if (!is_virtual(clock)) {
        return real().clock_gettime(clock, result);
    }
    *result = to_timespec(is_wall(clock) ? virtual_wall_ns() : virtual_monotonic_ns());
    return 0;
}

int timespec_get(timespec *result, int base) noexcept
{
    if (base != TIME_UTC || !baton_held()) {
        return real().timespec_get(result, base);
    }
    *result = to_timespec(virtual_wall_ns());
    return base;
}

unsigned sleep(unsigned seconds)
{
    trace_sleep("sleep", seconds, __builtin_return_address(0));
    if (!baton_held()) {
        return real().sleep(seconds);
    }
    sleep_for(seconds * NS_PER_SECOND);
    return 0;
}

int usleep(useconds_t microseconds)
{
    trace_sleep("usleep", microseconds, __builtin_return_address(0));
    if (!baton_held()) {
        return real().usleep(microseconds);
    }
    sleep_for(microseconds * int64_t{1000});
    return 0;
}

int nanosleep(const timespec *duration, timespec *rest)
{
    if (!baton_held()) {
        return real().nanosleep(duration, rest);
    }
    sleep_for(to_ns(*duration));
    return 0;
}

int clock_nanosleep(clockid_t clock, int flags, const timespec *time, timespec *rest)
{
    if (!is_virtual(clock)) {
        return real().clock_nanosleep(clock, flags, time, rest);
    }
    if (flags & TIMER_ABSTIME) {
        baton_wait({.deadline_ns = to_ns(*time), .on_wall_clock = is_wall(clock)});
    } else {
        sleep_for(to_ns(*time));
    }
    return 0;
}

int pause()
{
    if (!baton_held()) {
        return real().pause();
    }
    for (;;) {
        baton_wait({});
    }
}
}
