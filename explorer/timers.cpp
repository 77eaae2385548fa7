#include "timers.h"

#include "daemon.h"
#include "kiv/ipc.h"

#include <vector>

device_clock timing;

namespace
{
constexpr int HANDLE_BASE = 0x4c454400; // no other word of the daemon looks like this

std::vector<timer_kind> kinds;

// Night mode and the temperature alarm have a timer of the same period; each has just read its own settings.
timer_purpose purpose_of(int period_ms)
{
    switch (period_ms) {
    case 10000:
        return timer_purpose::NEW_MESSAGE;
    case 5000:
        return timer_purpose::LIMIT_CHECK;
    case 1000:
        return timer_purpose::REMINDER;
    case 20000:
        return happened.last_nv_read == key_number("nv/thermal_led_enable") ? timer_purpose::TEMPERATURE
                                                                            : timer_purpose::NIGHT;
    default:
        give_up("a timer of " + std::to_string(period_ms) + " ms, which no property knows");
    }
}

size_t kind_of(void (*procedure)(void *), void *argument, int period_ms, bool repeats)
{
    for (size_t kind = 0; kind < kinds.size(); kind++) {
        if (kinds[kind].procedure == procedure && kinds[kind].argument == argument) {
            return kind;
        }
    }
    if (kinds.size() == TIMER_KINDS) {
        give_up("more kinds of timers than the world has room for");
    }
    kinds.push_back({procedure, argument, period_ms, repeats, purpose_of(period_ms)});
    return kinds.size() - 1;
}

int handle_of(size_t kind, size_t instance)
{
    return HANDLE_BASE + static_cast<int>(kind * 16 + instance);
}

bool runs(size_t kind, size_t instance)
{
    return (world.timers[kind] >> instance & 1) != 0;
}
} // namespace

std::span<const timer_kind> known_timers()
{
    return kinds;
}

bool fire_instance(size_t kind, size_t instance)
{
    if (!runs(kind, instance)) {
        return false;
    }
    const timer_kind &timer = kinds[kind];
    if (!timer.repeats) {
        world.timers[kind] = static_cast<uint8_t>(world.timers[kind] & ~(1U << instance));
    }
    timing.due_ms[kind][instance] += timer.period_ms;
    timer.procedure(timer.argument);
    deliver_relights();
    return true;
}

bool fire_timer(size_t kind)
{
    return fire_instance(kind, 0) || fire_instance(kind, 1);
}

bool fire_timer_of(timer_purpose purpose)
{
    for (size_t kind = 0; kind < kinds.size(); kind++) {
        if (kinds[kind].purpose == purpose) {
            return fire_timer(kind);
        }
    }
    return false;
}

bool handle_is_kept(size_t kind, size_t instance)
{
    return daemon_holds(handle_of(kind, instance));
}

unsigned running_of(size_t kind)
{
    return static_cast<unsigned>(__builtin_popcount(world.timers[kind]));
}

// A number is given out again only when the daemon has forgotten it, so that a stale handle never stops another timer.
int kiv_timer(void (*callback)(void *), void *argument, int period_ms, int repeat)
{
    const size_t kind = kind_of(callback, argument, period_ms, repeat != 0);
    if ((world.refused & REFUSED_TIMERS) != 0 || running_of(kind) == TIMERS_OF_A_KIND) {
        return 0;
    }
    size_t instance = runs(kind, 0) ? 1 : 0;
    if (handle_is_kept(kind, instance) && !runs(kind, 1)) {
        instance = 1;
    }
    world.timers[kind] = static_cast<uint8_t>(world.timers[kind] | 1U << instance);
    timing.due_ms[kind][instance] = timing.now_ms + period_ms;
    return handle_of(kind, instance);
}

int kiv_delete_timer(int handle)
{
    const int number = handle - HANDLE_BASE;
    if (number >= 0 && number < static_cast<int>(TIMER_KINDS) * 16) {
        const size_t kind = static_cast<size_t>(number) / 16;
        world.timers[kind] = static_cast<uint8_t>(world.timers[kind] & ~(1U << number % 16));
    }
    return 0;
}
