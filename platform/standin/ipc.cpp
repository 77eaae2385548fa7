#include "kiv/ipc.h"

#include "indications.h"
#include "standin.h"
#include "trace/calls.h"
#include "ubox/uloop.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <climits>
#include <cstring>
#include <ctime>
#include <pthread.h>
#include <sys/socket.h>
#include <unistd.h>

constexpr int64_t NS_PER_MS = 1000000;
constexpr int64_t NS_PER_S = 1000000000;

struct timer_slot {
    int handle; // 0: free
    void (*callback)(void *);
    void *argument;
    int64_t deadline_ns;
    int64_t period_ns; // 0: fires once
};

static pthread_mutex_t lock = PTHREAD_MUTEX_INITIALIZER;
static pthread_cond_t changed; // on the monotonic clock; set up with the thread
static bool service_started;   // this and all below under lock
static std::array<timer_slot, 64> timers;
static int last_handle;

static uloop_fd indications;

static int64_t now_ns()
{
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return now.tv_sec * NS_PER_S + now.tv_nsec;
}

static timer_slot *next_timer()
{
    timer_slot *next = nullptr;
    for (timer_slot &slot : timers) {
        if (slot.handle == 0) {
            continue;
        }
        if (next == nullptr || slot.deadline_ns < next->deadline_ns ||
            (slot.deadline_ns == next->deadline_ns && slot.handle < next->handle)) {
            next = &slot;
        }
    }
    return next;
}

static timer_slot *find_timer(int handle)
{
    for (timer_slot &slot : timers) {
        if (slot.handle == handle) {
            return &slot;
        }
    }
    return nullptr;
}

static timer_slot wait_for_due_timer()
{
    for (;;) {
        const timer_slot *next = next_timer();
        if (next == nullptr) {
            pthread_cond_wait(&changed, &lock);
            continue;
        }
        if (next->deadline_ns <= now_ns()) {
            return *next;
        }
        const timespec until = {static_cast<time_t>(next->deadline_ns / NS_PER_S),
                                static_cast<long>(next->deadline_ns % NS_PER_S)};
        pthread_cond_timedwait(&changed, &lock, &until);
    }
}

// A periodic timer keeps its phase. Periods that have gone by unserved are dropped, not fired in a burst.
static void arm_again(timer_slot &slot)
{
    if (slot.period_ns == 0) {
        slot.handle = 0;
        return;
    }
    const int64_t missed = (now_ns() - slot.deadline_ns) / slot.period_ns;
    slot.deadline_ns += (missed + 1) * slot.period_ns;
}

// The slot is settled before its callback runs, so that the callback may delete its own timer or start others.
static void *serve_timers(void *)
{
    trace_label("timer");
    pthread_mutex_lock(&lock);
    for (;;) {
        const timer_slot due = wait_for_due_timer();
        arm_again(*find_timer(due.handle));
        pthread_mutex_unlock(&lock);
        standin_event("kiv_timer_fire", [&](trace_line &line) { trace_timer_fire(line, due.handle); });
        due.callback(due.argument);
        pthread_mutex_lock(&lock);
    }
    return nullptr;
}

static bool start_service()
{
    pthread_t thread;
    pthread_condattr_t attributes;
    if (service_started) {
        return true;
    }
    pthread_condattr_init(&attributes);
    pthread_condattr_setclock(&attributes, CLOCK_MONOTONIC);
    pthread_cond_init(&changed, &attributes);
    pthread_condattr_destroy(&attributes);
    service_started = pthread_create(&thread, nullptr, serve_timers, nullptr) == 0;
    if (service_started) {
        pthread_detach(thread);
    }
    return service_started;
}

// Handles go up and start again at 1 after the last int, past those still in use.
static int fresh_handle()
{
    do {
        last_handle = last_handle == INT_MAX ? 1 : last_handle + 1;
    } while (find_timer(last_handle) != nullptr);
    return last_handle;
}

static int add_timer(void (*callback)(void *), void *argument, int period_ms, int repeat)
{
    if (callback == nullptr || period_ms <= 0) {
        return 0;
    }
    const int64_t period_ns = period_ms * NS_PER_MS;
    int handle = 0;
    pthread_mutex_lock(&lock);
    timer_slot *slot = find_timer(0);
    if (slot != nullptr && start_service()) {
        handle = fresh_handle();
        *slot = {handle, callback, argument, now_ns() + period_ns, repeat != 0 ? period_ns : 0};
        pthread_cond_signal(&changed);
    }
    pthread_mutex_unlock(&lock);
    return handle;
}

static int remove_timer(int handle)
{
    pthread_mutex_lock(&lock);
    timer_slot *slot = handle > 0 ? find_timer(handle) : nullptr;
    if (slot != nullptr) {
        slot->handle = 0;
        pthread_cond_signal(&changed);
    }
    pthread_mutex_unlock(&lock);
    return 0;
}

// "1356" or "1356 null", with or without a newline.
static bool parse_indication(char *text, int *event_id, bool *has_record)
{
    char *word = strstr(text, " null");
    *has_record = word == nullptr;
    if (word != nullptr) {
        const char *rest = word + strlen(" null");
        if (rest[strspn(rest, " \n")] != '\0') {
            return false;
        }
        *word = '\0';
    }
    return standin_parse_ints(text, event_id, 1) == 1;
}

static void take_indication(uloop_fd *source, unsigned int)
{
    char text[64] = "";
    int event_id = 0;
    bool has_record = true;
    trace_label("ipc");
    const ssize_t length = recv(source->fd, text, sizeof text - 1, MSG_DONTWAIT | MSG_TRUNC);
    if (length < 0) {
        return;
    }
    const bool fits = length < static_cast<ssize_t>(sizeof text) && strlen(text) == static_cast<size_t>(length);
    if (!fits || !parse_indication(text, &event_id, &has_record)) {
        standin_error("bsp/ind: a datagram of %d bytes is not \"ID\" or \"ID null\"", static_cast<int>(length));
        return;
    }
    standin_event("kiv_bsp_ind", [&](trace_line &line) { trace_indication(line, event_id, has_record); });
    bsp_deliver_ind(event_id, has_record);
}

static int set_up_ipc()
{
    if (indications.registered) {
        return 0;
    }
    if (uloop_init() != 0) {
        standin_error("uloop_init failed: %s", strerror(errno));
        return -1;
    }
    indications.fd = standin_bind("bsp/ind");
    indications.cb = take_indication;
    if (indications.fd < 0) {
        return -1;
    }
    if (uloop_fd_add(&indications, ULOOP_READ) != 0) {
        standin_error("bsp/ind cannot join the uloop: %s", strerror(errno));
        close(indications.fd);
        return -1;
    }
    // The timer service starts with the process's IPC, not in the middle of its work.
    pthread_mutex_lock(&lock);
    const bool started = start_service();
    pthread_mutex_unlock(&lock);
    return started ? 0 : -1;
}

int kiv_ipc_init(int log_id, int flag)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_ints(line, log_id, flag); }, set_up_ipc);
}

int kiv_timer(void (*callback)(void *), void *argument, int period_ms, int repeat)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_timer(line, period_ms, repeat); },
        [&] { return add_timer(callback, argument, period_ms, repeat); });
}

int kiv_delete_timer(int handle)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_int(line, handle); }, [&] { return remove_timer(handle); });
}
