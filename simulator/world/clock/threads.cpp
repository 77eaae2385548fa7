// Threads, mutexes, conditions and semaphores. A mutex or a semaphore is still the real one, taken without blocking;
// a condition's waiters exist only here.
#include "baton.h"
#include "real.h"

#include <array>
#include <cerrno>

namespace
{
// Conditions that were made to wait on the monotonic clock; all others wait on the wall clock.
constexpr int MAX_MONOTONIC_CONDITIONS = 256;
std::array<const pthread_cond_t *, MAX_MONOTONIC_CONDITIONS> monotonic_conditions;

bool replace_condition(const pthread_cond_t *from, const pthread_cond_t *to)
{
    for (const pthread_cond_t *&entry : monotonic_conditions) {
        if (entry == from) {
            entry = to;
            return true;
        }
    }
    return false;
}

bool is_monotonic(const pthread_cond_t *condition)
{
    for (const pthread_cond_t *entry : monotonic_conditions) {
        if (entry == condition) {
            return true;
        }
    }
    return false;
}

int64_t to_ns(const timespec *time)
{
    return time ? time->tv_sec * NS_PER_SECOND + time->tv_nsec : FOREVER;
}

// The owner of such a mutex is told of its mistake; the C library knows which it is, and who.
bool is_own_errorcheck(const pthread_mutex_t *mutex)
{
    constexpr int type_bits = 3;
    return (mutex->__data.__kind & type_bits) == PTHREAD_MUTEX_ERRORCHECK && mutex->__data.__owner == gettid();
}

int lock(pthread_mutex_t *mutex, int64_t deadline_ns = FOREVER, bool on_wall_clock = false)
{
    const int result = real().pthread_mutex_trylock(mutex);
    if (result != EBUSY) {
        return result;
    }
    return is_own_errorcheck(mutex) ? EDEADLK
                                    : baton_take(mutex, real().pthread_mutex_trylock, deadline_ns, on_wall_clock);
}

int wait_on(pthread_cond_t *condition, pthread_mutex_t *mutex, int64_t deadline_ns, bool on_wall_clock)
{
    const int unlocked = real().pthread_mutex_unlock(mutex);
    if (unlocked != 0) {
        return unlocked;
    }
    baton_wake_one(mutex);
    const wake_reason reason =
        baton_wait({.object = condition, .deadline_ns = deadline_ns, .on_wall_clock = on_wall_clock});
    const int locked = lock(mutex);
    if (locked != 0) {
        return locked;
    }
    return reason == TIMED_OUT ? ETIMEDOUT : 0;
}

int take(sem_t *semaphore, int64_t deadline_ns)
{
    while (real().sem_trywait(semaphore) != 0) {
        if (errno != EAGAIN) {
            return -1;
        }
        if (baton_wait({.object = semaphore, .deadline_ns = deadline_ns, .on_wall_clock = true}) == TIMED_OUT) {
            errno = ETIMEDOUT;
            return -1;
        }
    }
    return 0;
}
} // namespace

extern "C" {

int pthread_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *), void *argument) noexcept
{
    const int result = baton_held() ? baton_create(id, attributes, body, argument)
                                    : real().pthread_create(id, attributes, body, argument);
    if (result != 0 && is_traced(__builtin_return_address(0))) {
        trace_line line;
        trace_begin(line, "pthread_create");
        trace_result(line, result);
        trace_end(line);
    }
    return result;
}

int pthread_join(pthread_t id, void **result)
{
    if (baton_held()) {
        baton_wait_for_end(id);
    }
    return real().pthread_join(id, result);
}

// The main program only prints it: a small number that is the same in every run.
pthread_t pthread_self() noexcept
{
    if (!in_main_program(__builtin_return_address(0))) {
        return real().pthread_self();
    }
    const pthread_t self = baton_held() ? static_cast<pthread_t>(baton_thread_number()) : real().pthread_self();
    if (is_traced(__builtin_return_address(0))) {
        trace_line line;
        trace_begin(line, "pthread_self");
        trace_number_result(line, static_cast<long long>(self));
        trace_end(line);
    }
    return self;
}

int pthread_mutex_lock(pthread_mutex_t *mutex) noexcept
{
    return baton_held() ? lock(mutex) : real().pthread_mutex_lock(mutex);
}

int pthread_mutex_timedlock(pthread_mutex_t *mutex, const timespec *deadline) noexcept
{
    return baton_held() ? lock(mutex, to_ns(deadline), true) : real().pthread_mutex_timedlock(mutex, deadline);
}

int pthread_mutex_clocklock(pthread_mutex_t *mutex, clockid_t clock, const timespec *deadline) noexcept
{
    return baton_held() ? lock(mutex, to_ns(deadline), clock == CLOCK_REALTIME)
                        : real().pthread_mutex_clocklock(mutex, clock, deadline);
}

int pthread_mutex_unlock(pthread_mutex_t *mutex) noexcept
{
    const int result = real().pthread_mutex_unlock(mutex);
    if (result == 0 && baton_held()) {
        baton_wake_one(mutex);
    }
    return result;
}

int pthread_cond_init(pthread_cond_t *condition, const pthread_condattr_t *attributes) noexcept
{
    clockid_t clock = CLOCK_REALTIME;
    if (attributes && pthread_condattr_getclock(attributes, &clock) == 0 && clock == CLOCK_MONOTONIC) {
        if (!is_monotonic(condition) && !replace_condition(nullptr, condition)) {
            return EAGAIN;
        }
    }
    return real().pthread_cond_init(condition, attributes);
}

int pthread_cond_destroy(pthread_cond_t *condition) noexcept
{
    replace_condition(condition, nullptr);
    return real().pthread_cond_destroy(condition);
}

int pthread_cond_wait(pthread_cond_t *condition, pthread_mutex_t *mutex)
{
    return baton_held() ? wait_on(condition, mutex, FOREVER, false) : real().pthread_cond_wait(condition, mutex);
}

int pthread_cond_timedwait(pthread_cond_t *condition, pthread_mutex_t *mutex, const timespec *deadline)
{
    return baton_held() ? wait_on(condition, mutex, to_ns(deadline), !is_monotonic(condition))
                        : real().pthread_cond_timedwait(condition, mutex, deadline);
}

int pthread_cond_clockwait(pthread_cond_t *condition, pthread_mutex_t *mutex, clockid_t clock, const timespec *deadline)
{
    return baton_held() ? wait_on(condition, mutex, to_ns(deadline), clock == CLOCK_REALTIME)
                        : real().pthread_cond_clockwait(condition, mutex, clock, deadline);
}

int pthread_cond_signal(pthread_cond_t *condition) noexcept
{
    if (!baton_held()) {
        return real().pthread_cond_signal(condition);
    }
    baton_wake_one(condition);
    return 0;
}

int pthread_cond_broadcast(pthread_cond_t *condition) noexcept
{
    if (!baton_held()) {
        return real().pthread_cond_broadcast(condition);
    }
    baton_wake_all(condition);
    return 0;
}

int sem_wait(sem_t *semaphore)
{
    return baton_held() ? take(semaphore, FOREVER) : real().sem_wait(semaphore);
}

int sem_timedwait(sem_t *semaphore, const timespec *deadline)
{
    return baton_held() ? take(semaphore, to_ns(deadline)) : real().sem_timedwait(semaphore, deadline);
}

int sem_post(sem_t *semaphore) noexcept
{
    const int result = real().sem_post(semaphore);
    if (result == 0 && baton_held()) {
        baton_wake_one(semaphore);
    }
    return result;
}

int sched_yield() noexcept
{
    if (!baton_held()) {
        return real().sched_yield();
    }
    baton_yield();
    return 0;
}
}
