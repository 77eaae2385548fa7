// What holds in every state of every product, and where a state breaks it.
#pragma once

#include "alphabet.h"

enum property : unsigned {
    ONE_COLOUR = 1, // of a group whose colours exclude one another at most one is lit
    OWN_LEDS,       // an LED that the product does not have is never lit
    OFF_IS_DARK,    // each power state by itself
    SLEEP_IS_DARK,  // asleep shows only what is named for the product
    NIGHT_IS_DIM,   // nothing brighter than the night allows, and the morning shows what NV says
    HEALING,        // off and on again, or a restart, shows a picture that depends on NV alone
    TIMERS_KEPT,    // at most one of a kind, none that nobody can delete, none outlives what it is for
    NO_NOISE,       // an indication that changes nothing asks for nothing; repeating one changes nothing
    FAILURES_HEAL,  // after a failed platform call the next power cycle heals
    NO_TRAP,        // from every state everything can be reached again
    PROPERTY_COUNT
};
std::string_view property_text(unsigned which);

constexpr int NO_LED = -1;

// One place where a state, or the step into it, breaks a property.
struct breach {
    property broken = ONE_COLOUR;
    int led = NO_LED;
    std::optional<timer_purpose> timer = {};
    bool is_lost = false;       // the timer: doubled, or nobody keeps its handle
    uint8_t shown = 0;          // the LED's look
    uint8_t due = 0;            // and what it should be, where that is known
    bool restarted = false;     // by a power cycle that restarts the daemon
    std::string_view said = {}; // the indication
};
std::string subject_of(const breach &what); // the LED's or the timer's name

// In the state as it stands.
void check_state(unsigned product, std::vector<breach> &found);

// LEDs that show what only a notification has told: switching off and on cannot know them.
bool is_told_by_notification(unsigned product, int led);

bool is_night(); // by the daemon's own word in NV
bool is_gated_at_night(int led);
bool is_on_and_awake();
bool is_reminding(); // the timer of the data-volume reminder runs
bool nv_is(std::string_view key, std::string_view text);
