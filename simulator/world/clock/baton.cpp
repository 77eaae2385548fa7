#include "baton.h"

#include "protocol.h"
#include "real.h"

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <dlfcn.h>
#include <linux/futex.h>
#include <sys/syscall.h>

// Nothing in this file may be seen by ThreadSanitizer as synchronisation: handing over the baton orders threads that
// the daemon itself leaves unordered, and a race between them must still be found. Hence system calls, not functions.

namespace
{
enum thread_state { UNUSED = 0, RUNNABLE, WAITING, ENDED };

struct thread {
    thread_state state = UNUSED;
    int number = 0;
    uint64_t turn = 0; // place in the queue of runnable threads, and in the queue of an object's waiters
    wait_for waits_for = {};
    wake_reason reason = WOKEN;
    int has_baton = 0; // futex word
    pthread_t id = {};
    void *(*body)(void *) = nullptr;
    void *argument = nullptr;
};

constexpr int MAX_THREADS = 64;
std::array<thread, MAX_THREADS> threads;
__thread thread *self; // null in threads that take no part
int threads_started;
uint64_t turns;
int looks_at_clock; // since a thread last waited for anything
pthread_key_t end_of_thread;

int control_fd = -1;
int64_t now_ns;
int64_t run_until_ns;
int64_t wall_offset_ns;

void give_baton(thread &to)
{
    __atomic_store_n(&to.has_baton, 1, __ATOMIC_RELEASE);
    real().syscall(SYS_futex, &to.has_baton, FUTEX_WAKE_PRIVATE, 1, nullptr, nullptr, 0);
}

void await_baton(thread &me)
{
    while (__atomic_load_n(&me.has_baton, __ATOMIC_ACQUIRE) == 0) {
        real().syscall(SYS_futex, &me.has_baton, FUTEX_WAIT_PRIVATE, 0, nullptr, nullptr, 0);
    }
    __atomic_store_n(&me.has_baton, 0, __ATOMIC_RELAXED);
}

void make_runnable(thread &t, wake_reason reason)
{
    t.state = RUNNABLE;
    t.reason = reason;
    t.turn = ++turns;
}

thread *first_in_state(thread_state state, const void *object)
{
    thread *first = nullptr;
    for (thread &t : threads) {
        if (t.state != state || (object && t.waits_for.object != object)) {
            continue;
        }
        if (!first || t.turn < first->turn) {
            first = &t;
        }
    }
    return first;
}

bool fd_ready(const thread &t)
{
    const timespec at_once = {};
    return t.waits_for.fd_count > 0 &&
           real().syscall(SYS_ppoll, t.waits_for.fds, t.waits_for.fd_count, &at_once, nullptr, 0) > 0;
}

// In thread order; a thread that was started earlier may sit in a later slot, because slots are reused.
thread *first_with_ready_fd()
{
    thread *first = nullptr;
    for (thread &t : threads) {
        if (t.state == WAITING && fd_ready(t) && (!first || t.number < first->number)) {
            first = &t;
        }
    }
    return first;
}

int64_t deadline_of(const thread &t)
{
    const int64_t deadline = t.waits_for.deadline_ns;
    return t.waits_for.on_wall_clock && deadline != FOREVER ? deadline - wall_offset_ns : deadline;
}

thread *first_deadline()
{
    thread *first = nullptr;
    for (thread &t : threads) {
        if (t.state != WAITING || deadline_of(t) == FOREVER) {
            continue;
        }
        if (!first || deadline_of(t) < deadline_of(*first) ||
            (deadline_of(t) == deadline_of(*first) && t.number < first->number)) {
            first = &t;
        }
    }
    return first;
}

// Every thread is blocked: tell the simulator and wait for what it wants. Without it there is nothing to live for.
void report_idle(const thread *next)
{
    const clock_report report = {now_ns, next ? deadline_of(*next) : CLOCK_NEVER};
    clock_command command = {};
    if (syscall(SYS_write, control_fd, &report, sizeof report) != sizeof report) {
        _exit(0);
    }
    long got = 0;
    do {
        got = real().syscall(SYS_read, control_fd, &command, sizeof command);
    } while (got < 0 && errno == EINTR);
    if (got != sizeof command) {
        _exit(0);
    }
    run_until_ns = command.run_until_ns;
    wall_offset_ns = command.wall_offset_ns;
}

thread &next_to_run()
{
    for (;;) {
        if (thread *t = first_in_state(RUNNABLE, nullptr)) {
            return *t;
        }
        if (thread *t = first_with_ready_fd()) {
            make_runnable(*t, FD_READY);
            return *t;
        }
        thread *t = first_deadline();
        if (t && deadline_of(*t) <= run_until_ns) {
            if (deadline_of(*t) > now_ns) {
                now_ns = deadline_of(*t);
            }
            make_runnable(*t, TIMED_OUT);
            return *t;
        }
        if (run_until_ns > now_ns) {
            now_ns = run_until_ns;
        }
        report_idle(t);
    }
}

void pass_baton(thread &me)
{
    thread &next = next_to_run();
    if (&next == &me) {
        return;
    }
    give_baton(next);
    await_baton(me);
}

// Runs when a thread's own thread-local objects are gone, so that their destructors still held the baton.
void thread_ended(void *ended)
{
    thread &me = *static_cast<thread *>(ended);
    me.state = ENDED;
    self = nullptr;
    for (thread &t : threads) {
        if (t.state == WAITING && t.waits_for.object == &me) {
            make_runnable(t, WOKEN);
        }
    }
    give_baton(next_to_run());
}

void *thread_started(void *started)
{
    thread &me = *static_cast<thread *>(started);
    self = &me;
    pthread_setspecific(end_of_thread, &me);
    await_baton(me);
    return me.body(me.argument);
}

// A thread that runs on and on keeps the baton and stops the clock. Each line of the trace reads the time, so this
// notices long before the trace fills the disk.
void count_look_at_clock()
{
    constexpr int too_many = 200'000;
    constexpr char message[] = "the clock stands still: a thread has read it 200000 times without ever waiting\n";
    if (++looks_at_clock < too_many) {
        return;
    }
    real().syscall(SYS_write, STDERR_FILENO, message, sizeof message - 1);
    _exit(EXIT_FAILURE);
}

thread *free_slot()
{
    for (thread &t : threads) {
        if (t.state == UNUSED || t.state == ENDED) {
            return &t;
        }
    }
    return nullptr;
}

// The process begins here: its main thread holds the baton. The shell commands that it runs must not join in.
__attribute__((constructor)) void take_control()
{
    const char *fd = getenv(CLOCK_FD_VARIABLE);
    if (!fd || control_fd >= 0) {
        return;
    }
    // The shell of a wrapper lives in real time.
    if (getenv(CLOCK_WRAPPED_VARIABLE) && !dlsym(RTLD_DEFAULT, "kiv_init_msg")) {
        return;
    }
    control_fd = atoi(fd);
    fcntl(control_fd, F_SETFD, FD_CLOEXEC);
    if (const char *start = getenv(CLOCK_START_VARIABLE)) {
        char *rest = nullptr;
        now_ns = run_until_ns = strtoll(start, &rest, 10);
        wall_offset_ns = strtoll(rest, nullptr, 10);
    }
    pthread_key_create(&end_of_thread, thread_ended);
    self = &threads[0];
    *self = {.state = RUNNABLE, .number = ++threads_started, .id = real().pthread_self()};
}
} // namespace

bool baton_held()
{
    // A library's constructor may run before ours.
    if (control_fd < 0 && threads_started == 0) {
        take_control();
    }
    return self != nullptr;
}

wake_reason baton_wait(const wait_for &what)
{
    thread &me = *self;
    me.state = WAITING;
    me.waits_for = what;
    me.turn = ++turns;
    looks_at_clock = 0;
    pass_baton(me);
    return me.reason;
}

void baton_yield()
{
    count_look_at_clock(); // a thread that spins on and on stops the clock, too
    make_runnable(*self, WOKEN);
    pass_baton(*self);
}

void baton_wake_one(const void *object)
{
    if (thread *t = first_in_state(WAITING, object)) {
        make_runnable(*t, WOKEN);
    }
}

void baton_wake_all(const void *object)
{
    while (thread *t = first_in_state(WAITING, object)) {
        make_runnable(*t, WOKEN);
    }
}

int baton_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *), void *argument)
{
    thread *t = free_slot();
    if (!t) {
        return EAGAIN;
    }
    *t = {.number = threads_started + 1, .body = body, .argument = argument};
    const int result = real().pthread_create(id, attributes, thread_started, t);
    if (result != 0) {
        return result;
    }
    t->id = *id;
    threads_started++;
    make_runnable(*t, WOKEN);
    return 0;
}

void baton_wait_for_end(pthread_t id)
{
    for (thread &t : threads) {
        if ((t.state == RUNNABLE || t.state == WAITING) && pthread_equal(t.id, id)) {
            baton_wait({.object = &t});
        }
    }
}

int baton_thread_number()
{
    return self->number;
}

int64_t virtual_monotonic_ns()
{
    count_look_at_clock();
    return now_ns;
}

int64_t virtual_wall_ns()
{
    count_look_at_clock();
    return now_ns + wall_offset_ns;
}
