// The timers that run, and firing them.
#pragma once

#include "world.h"

#include <span>

constexpr size_t TIMERS_OF_A_KIND = 2; // a third is refused, as by a full timer service

enum class timer_purpose : uint8_t { NEW_MESSAGE, LIMIT_CHECK, REMINDER, TEMPERATURE, NIGHT, COUNT };

// A kind is a procedure with its argument and period.
struct timer_kind {
    void (*procedure)(void *);
    void *argument;
    int period_ms;
    bool repeats;
    timer_purpose purpose;
};
std::span<const timer_kind> known_timers();
bool fire_timer(size_t kind); // false when none of the kind runs
bool fire_timer_of(timer_purpose purpose);
bool fire_instance(size_t kind, size_t instance);
bool handle_is_kept(size_t kind, size_t instance); // by a word of the daemon
unsigned running_of(size_t kind);

// Time, for histories that are played by the clock. Exploring leaves it alone.
struct device_clock {
    int64_t now_ms;
    std::array<std::array<int64_t, TIMERS_OF_A_KIND>, TIMER_KINDS> due_ms;
};
extern device_clock timing;
