// The baton: exactly one thread of the daemon runs at a time, and the baton passes on only when that thread blocks or
// ends. Who runs next is decided by a fixed order, so the same input gives the same run.
#pragma once

#include <cerrno>
#include <cstdint>
#include <poll.h>
#include <pthread.h>

constexpr int64_t FOREVER = INT64_MAX;
constexpr int64_t NS_PER_SECOND = 1'000'000'000;

enum wake_reason { WOKEN, FD_READY, TIMED_OUT };

// What a thread waits for: whichever comes first.
struct wait_for {
    const void *object = nullptr; // a condition, mutex, semaphore or thread; null for none
    pollfd *fds = nullptr;
    nfds_t fd_count = 0;
    int64_t deadline_ns = FOREVER;
    bool on_wall_clock = false; // the deadline moves when the wall clock is set
};

// True in a thread that takes part. False everywhere in real time, and in threads that a sanitizer starts for itself.
bool baton_held();

wake_reason baton_wait(const wait_for &what);
void baton_yield();
void baton_wake_one(const void *object);
void baton_wake_all(const void *object);

// Takes a lock by its function that does not block; every attempt that finds it busy waits for a wake of the object.
template <typename Object>
int baton_take(Object *object, int (*try_lock)(Object *), int64_t deadline_ns, bool on_wall_clock)
{
    for (;;) {
        const int result = try_lock(object);
        if (result != EBUSY) {
            return result;
        }
        if (baton_wait({.object = object, .deadline_ns = deadline_ns, .on_wall_clock = on_wall_clock}) == TIMED_OUT) {
            return ETIMEDOUT;
        }
    }
}

// Threads, by the order in which they were started: the main thread is 1.
int baton_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *), void *argument);
void baton_wait_for_end(pthread_t id);
int baton_thread_number();

int64_t virtual_monotonic_ns();
int64_t virtual_wall_ns();

// Waits while a read would block. False, with errno set, when the socket's own limit of time has passed.
bool wait_before_read(int fd);
