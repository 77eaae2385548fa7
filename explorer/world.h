// The device around the daemon, as small as it can be: what the daemon asks for and what it has lit. The platform's
// contract is implemented on it, in this process and on one thread.
#pragma once

#include "language/names.h"
#include "language/scenario.h"

#include <array>
#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

constexpr size_t TEXT_KEYS = 48;
constexpr size_t TIMER_KINDS = 6;

// Calls of the platform that may be refused, as bits.
enum refused_call : uint8_t {
    REFUSED_LEDS = 1,
    REFUSED_TIMERS = 2,
    REFUSED_NV_READS = 4,
    REFUSED_NV_WRITES = 8,
    REFUSED_SUPPLY = 16, // queries for the battery and the charger
    REFUSED_SENSORS = 32,
    REFUSED_CONFIGURATION = 64,
    REFUSED_RELIGHT = 128,
};

// What has come over a device in a state in which the daemon takes no care, as bits: it explains what is lit now.
enum excuse : uint16_t {
    NET_SHOWN_WHILE_OFF = 1, // a changed close-all setting, or the single-chip terminal's wake-up, while off
    SWITCHED_ON_ASLEEP = 2,  // without the scene of falling asleep
    RELIT_ASLEEP = 4,        // or its close-all setting was changed
    MESSAGE_TIMER_LEFT = 8,  // switched on, or told of messages while off, with the timer of one running
    SETTINGS_UNREAD = 16,    // the night's and the temperature's, when NV could not be read or no timer be had
    SWITCHED_ON_LIT = 32,    // a single-chip terminal whose net or signal LED was lit before
    SELF_TESTED = 64,        // a handheld, and its red battery LED has been lit since
    LEVEL_SHOWN_AGAIN = 128, // by the temperature alarm of a single-chip terminal that is off or asleep
    NET_CHANGED_ASLEEP = 256,
    NET_REFUSED = 512, // the last request for an LED of the group
    SIG_6_REFUSED = 1024,
    SIG_BLUE_REFUSED = 2048,
    CONFIGURATION_UNREAD = 4096, // at the start
    LIT_AS_ANOTHER = 8192,       // a module terminal with a signal LED that was lit then
    NIGHT_UNTOLD = 16384,        // the last word about it that was to be written to NV
    SLEEP_VALUE_UNKNOWN = 32768, // to a handheld: neither asleep nor awake
};
// These outlive a kill.
constexpr unsigned EXCUSES_OF_LEDS =
    SELF_TESTED | LEVEL_SHOWN_AGAIN | NET_REFUSED | SIG_6_REFUSED | SIG_BLUE_REFUSED | LIT_AS_ANOTHER | NIGHT_UNTOLD;

// All of the device that can change, without gaps: it is copied and compared as bytes.
struct world_state {
    uint16_t excused;                        // excuse
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
};
static_assert(sizeof(world_state) == 2 + LED_ID_COUNT + TEXT_KEYS + TIMER_KINDS + 6);

extern world_state world;

inline bool is_excused(unsigned by)
{
    return (world.excused & by) != 0;
}

inline void excuse_by(unsigned what)
{
    world.excused = static_cast<uint16_t>(world.excused | what);
}

inline void drop_excuse(unsigned what)
{
    world.excused = static_cast<uint16_t>(world.excused & ~what);
}

// What one stimulus has led to; not part of the state.
struct world_record {
    unsigned led_requests;
    unsigned relights;    // asked for and not yet delivered
    uint8_t last_nv_read; // a key
    unsigned refused;     // excuses by requests that the board has refused
    unsigned accepted;    // and those that are gone, because it has accepted one
};
extern world_record happened;

[[noreturn]] void give_up(const std::string &why); // says so and aborts

// Keys are paths in a device directory, such as nv/battery_value. The numbers of keys and texts are given in the order
// in which they are first asked for. Gives up when there are more than the state has room for.
uint8_t key_number(std::string_view path);
uint8_t text_number(uint8_t key, const std::optional<std::string> &text);
const std::string *text_of(std::string_view path); // as it stands now; null when missing
const std::string *read_text(uint8_t key);         // likewise, for the daemon
bool was_read(std::string_view path);              // by the daemon, since open_world

// Looks, by their index in the state.
uint8_t look_number(const led_look &look);
const led_look &look_at(uint8_t index);
inline bool is_lit(uint8_t index)
{
    return index != 0;
}

// A device that holds nothing. Called before anything else of this header.
void open_world();

using indication_callback = int (*)(int, int, void *);
extern indication_callback board_callback; // null until the daemon registers it
bool is_registered(int module_id, uint32_t event);
