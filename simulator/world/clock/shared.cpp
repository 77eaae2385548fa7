// Shared locks, pthread_once and the futex call, which std::atomic::wait, std::latch and function-local statics wait
// in.
#include "baton.h"
#include "real.h"

#include <array>
#include <cerrno>
#include <climits>
#include <cstdarg>
#include <linux/futex.h>
#include <sys/syscall.h>

namespace
{
int64_t to_ns(const timespec *time)
{
    return time->tv_sec * NS_PER_SECOND + time->tv_nsec;
}

long fail(int failure)
{
    errno = failure;
    return -1;
}

struct futex_call {
    const int *word;
    int operation;
    int value;
    const timespec *limit;
};

int64_t deadline_of(const futex_call &call)
{
    if (!call.limit) {
        return FOREVER;
    }
    const bool is_absolute = (call.operation & FUTEX_CMD_MASK) == FUTEX_WAIT_BITSET;
    return to_ns(call.limit) + (is_absolute ? 0 : virtual_monotonic_ns());
}

long wait_on_word(const futex_call &call)
{
    if (__atomic_load_n(call.word, __ATOMIC_ACQUIRE) != call.value) {
        return fail(EAGAIN);
    }
    const bool on_wall_clock = (call.operation & FUTEX_CLOCK_REALTIME) != 0;
    const wake_reason reason =
        baton_wait({.object = call.word, .deadline_ns = deadline_of(call), .on_wall_clock = on_wall_clock});
    return reason == TIMED_OUT ? fail(ETIMEDOUT) : 0;
}

// Wakes more than asked for when it is more than one; they look again.
long wake_word(const futex_call &call)
{
    if (call.value == 1) {
        baton_wake_one(call.word);
    } else {
        baton_wake_all(call.word);
    }
    return call.value == INT_MAX ? 0 : call.value;
}

// Whose function runs now; a sanitizer keeps this in pthread_once_t in its own way.
std::array<const pthread_once_t *, 16> running_once;

bool replace_once(const pthread_once_t *from, const pthread_once_t *to)
{
    for (const pthread_once_t *&entry : running_once) {
        if (entry == from) {
            entry = to;
            return true;
        }
    }
    return false;
}
} // namespace

extern "C" {

int pthread_rwlock_rdlock(pthread_rwlock_t *lock) noexcept
{
    return baton_held() ? baton_take(lock, real().pthread_rwlock_tryrdlock, FOREVER, false)
                        : real().pthread_rwlock_rdlock(lock);
}

int pthread_rwlock_timedrdlock(pthread_rwlock_t *lock, const timespec *deadline) noexcept
{
    return baton_held() ? baton_take(lock, real().pthread_rwlock_tryrdlock, to_ns(deadline), true)
                        : real().pthread_rwlock_timedrdlock(lock, deadline);
}

int pthread_rwlock_clockrdlock(pthread_rwlock_t *lock, clockid_t clock, const timespec *deadline) noexcept
{
    return baton_held() ? baton_take(lock, real().pthread_rwlock_tryrdlock, to_ns(deadline), clock == CLOCK_REALTIME)
                        : real().pthread_rwlock_clockrdlock(lock, clock, deadline);
}

int pthread_rwlock_wrlock(pthread_rwlock_t *lock) noexcept
{
    return baton_held() ? baton_take(lock, real().pthread_rwlock_trywrlock, FOREVER, false)
                        : real().pthread_rwlock_wrlock(lock);
}

int pthread_rwlock_timedwrlock(pthread_rwlock_t *lock, const timespec *deadline) noexcept
{
    return baton_held() ? baton_take(lock, real().pthread_rwlock_trywrlock, to_ns(deadline), true)
                        : real().pthread_rwlock_timedwrlock(lock, deadline);
}

int pthread_rwlock_clockwrlock(pthread_rwlock_t *lock, clockid_t clock, const timespec *deadline) noexcept
{
    return baton_held() ? baton_take(lock, real().pthread_rwlock_trywrlock, to_ns(deadline), clock == CLOCK_REALTIME)
                        : real().pthread_rwlock_clockwrlock(lock, clock, deadline);
}

int pthread_rwlock_unlock(pthread_rwlock_t *lock) noexcept
{
    const int result = real().pthread_rwlock_unlock(lock);
    if (result == 0 && baton_held()) {
        baton_wake_all(lock);
    }
    return result;
}

int pthread_once(pthread_once_t *once, void (*function)())
{
    if (!baton_held()) {
        return real().pthread_once(once, function);
    }
    while (replace_once(once, once)) {
        baton_wait({.object = once});
    }
    replace_once(nullptr, once);
    const int result = real().pthread_once(once, function);
    replace_once(once, nullptr);
    baton_wake_all(once);
    return result;
}

long syscall(long number, ...) noexcept
{
    va_list arguments;
    long a[6];
    va_start(arguments, number);
    for (long &argument : a) {
        argument = va_arg(arguments, long);
    }
    va_end(arguments);
    if (number != SYS_futex || !baton_held()) {
        return real().syscall(number, a[0], a[1], a[2], a[3], a[4], a[5]);
    }
    // NOLINTBEGIN(performance-no-int-to-ptr): a system call takes its addresses as numbers
    const futex_call call = {reinterpret_cast<const int *>(a[0]), static_cast<int>(a[1]), static_cast<int>(a[2]),
                             reinterpret_cast<const timespec *>(a[3])};
    // NOLINTEND(performance-no-int-to-ptr)
    switch (call.operation & FUTEX_CMD_MASK) {
    case FUTEX_WAIT:
    case FUTEX_WAIT_BITSET:
        return wait_on_word(call);
    case FUTEX_WAKE:
    case FUTEX_WAKE_BITSET:
        return wake_word(call);
    default:
        return real().syscall(number, a[0], a[1], a[2], a[3], a[4], a[5]);
    }
}
}
