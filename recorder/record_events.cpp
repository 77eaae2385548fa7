// The daemon's callbacks: the device calls the recorder, the recorder writes the event and calls the daemon.
#include "record.h"

#include <array>
#include <atomic>
#include <sched.h>

namespace
{
constexpr size_t TIMERS = 256; // at once; a slot is used again as late as possible
constexpr int LOOKS_FOR_HANDLE = 1000;

struct timer_slot {
    std::atomic<bool> used;
    std::atomic<int> handle; // 0 until the service has told it
    std::atomic<timer_callback> callback;
    std::atomic<void *> argument;
    std::atomic<bool> repeats;
};

std::array<timer_slot, TIMERS> timers;
std::atomic<size_t> next_slot;
std::array<std::atomic<bsp_ind_callback>, IND_SLOTS> callbacks;

timer_slot *take_slot()
{
    for (size_t tries = 0; tries < TIMERS; tries++) {
        timer_slot &slot = timers[next_slot++ % TIMERS];
        if (!slot.used.exchange(true)) {
            return &slot;
        }
    }
    return nullptr;
}

// A timer may fire before whoever started it has been told its handle.
int handle_of(const timer_slot &slot)
{
    for (int looks = 0; slot.handle == 0 && looks < LOOKS_FOR_HANDLE; looks++) {
        sched_yield();
    }
    return slot.handle;
}

[[gnu::noinline]] void write_fire(int handle)
{
    trace_line line;
    trace_begin(line, "kiv_timer_fire");
    trace_timer_fire(line, handle);
    record_write(line);
}

[[gnu::noinline]] void write_indication(int event_id, bool has_record)
{
    trace_line line;
    trace_begin(line, "kiv_bsp_ind");
    trace_indication(line, event_id, has_record);
    record_write(line);
}

void on_timer(void *given)
{
    timer_slot &slot = *static_cast<timer_slot *>(given);
    trace_label("timer");
    write_fire(handle_of(slot));
    const timer_callback callback = slot.callback;
    void *argument = slot.argument;
    if (!slot.repeats) {
        slot.used = false;
    }
    callback(argument);
}

template <ind_slot slot> int on_indication(int event_id, int arg2, void *record)
{
    trace_label("ipc");
    write_indication(event_id, record != nullptr);
    return callbacks[slot].load()(event_id, arg2, record);
}
} // namespace

bool front_sleep(const char *call, unsigned amount)
{
    trace_line line;
    trace_begin(line, call);
    trace_add(line, "%u", amount);
    trace_close(line);
    record_write(line);
    return true;
}

// A thread is an event only when there is none.
extern "C" int pthread_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *),
                              void *argument) noexcept
{
    const int result = next().pthread_create(id, attributes, body, argument);
    if (result != 0 && takes_call(CALLER)) {
        trace_line line;
        trace_begin(line, "pthread_create");
        trace_result(line, result);
        record_write(line);
    }
    return result;
}

int start_timer(timer_callback callback, void *argument, int period_ms, int repeat)
{
    timer_slot *slot = take_slot();
    if (!slot) {
        return next().kiv_timer(callback, argument, period_ms, repeat);
    }
    slot->handle = 0;
    slot->callback = callback;
    slot->argument = argument;
    slot->repeats = repeat != 0;
    const int handle = next().kiv_timer(on_timer, slot, period_ms, repeat);
    slot->handle = handle;
    if (handle <= 0) {
        slot->used = false;
    }
    return handle;
}

void forget_timer(int handle)
{
    for (timer_slot &slot : timers) {
        if (handle > 0 && slot.used && slot.handle == handle) {
            slot.used = false;
        }
    }
}

bsp_ind_callback keep_callback(ind_slot slot, bsp_ind_callback callback)
{
    constexpr std::array<bsp_ind_callback, IND_SLOTS> recorders = {
        on_indication<BATTERY_ONLINE>, on_indication<BATTERY_OFFLINE>, on_indication<CHARGER_CONNECT>,
        on_indication<CHARGER_DISCONNECT>};
    callbacks[slot] = callback;
    return callback ? recorders[slot] : nullptr;
}
