// The device around the daemon, as small as it can be: what the daemon asks for and what it has lit. The platform's
// contract is implemented on it, in this process and on one thread.
#pragma once

#include "language/names.h"
#include "language/scenario.h"

#include <array>
#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

constexpr size_t TEXT_KEYS = 48;
constexpr size_t TIMER_KINDS = 6;
constexpr size_t TIMERS_OF_A_KIND = 2; // a third is refused, as by a full timer service

// Calls of the platform that may be refused, as bits.
enum refused_call : uint8_t {
    REFUSED_LEDS = 1,
    REFUSED_TIMERS = 2,
    REFUSED_NV_READS = 4,
    REFUSED_BATTERY = 8,
};

enum class timer_purpose : uint8_t { NEW_MESSAGE, LIMIT_CHECK, REMINDER, TEMPERATURE, NIGHT, COUNT };

// What has come over a device in a state in which the daemon takes no care, as bits: it explains what is lit now.
enum excuse : uint8_t {
    NET_SHOWN_WHILE_OFF = 1, // a changed close-all setting, or the single-chip terminal's wake-up, while off
    SWITCHED_ON_ASLEEP = 2,  // without the scene of falling asleep
    RELIT_ASLEEP = 4,        // or its close-all setting was changed
    SETTINGS_UNREAD = 16,    // the night's and the temperature's, when NV could not be read or no timer be had
    SWITCHED_ON_LIT = 32,    // a single-chip terminal whose net or signal LED was lit before
    MESSAGE_TIMER_LEFT = 8,  // switched on, or told of messages while off, with the timer of one running
};

// All of the device that can change. Bytes only: it is copied and compared as such.
struct world_state {
    std::array<uint8_t, LED_ID_COUNT> leds;  // index of a look; 0 is off
    std::array<uint8_t, TEXT_KEYS> texts;    // by key: index of its text; 0 is missing
    std::array<uint8_t, TIMER_KINDS> timers; // a bit for each that runs
    uint8_t refused;                         // refused_call
    uint8_t hour;                            // of the wall clock, UTC
    // What the services have told the daemon, whatever it made of it.
    uint8_t power; // power_state
    uint8_t asleep;
    uint8_t call_up;
    uint8_t restarting;
    uint8_t excused; // excuse
};

extern world_state world;

// What one stimulus has led to; not part of the state.
struct world_record {
    unsigned led_requests;
    unsigned relights; // asked for and not yet delivered
    uint8_t timers_refused;
};
extern world_record happened;

// Keys are paths in a device directory, such as nv/battery_value. The numbers of keys and texts are given in the order
// in which they are first asked for. Aborts when there are more than the state has room for.
uint8_t key_number(std::string_view path);
uint8_t text_number(uint8_t key, const std::optional<std::string> &text);
const std::string *text_of(std::string_view path); // as it stands now; null when missing

// Looks, by their index in the state.
const led_look &look_at(uint8_t index);
inline bool is_lit(uint8_t index)
{
    return index != 0;
}

// The timers that run, and firing them. A kind is a procedure with its argument and period.
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

// Called once, before anything else of this header.
void open_world();

using indication_callback = int (*)(int, int, void *);
extern indication_callback board_callback; // null until the daemon registers it
bool is_registered(int module_id, uint32_t event);
