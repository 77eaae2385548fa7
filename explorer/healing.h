// Switching off and on again, and whether the picture is then one that depends on NV alone.
#pragma once

#include "properties.h"
#include "store.h"

#include <unordered_map>

// A way of switching off and on again.
struct power_cycle {
    stimulus off; // and awake
    stimulus on;
    bool restarts; // the daemon
};
std::string text_of(const power_cycle &cycle, bool after_failures); // as a scenario says it

using led_picture = std::array<uint8_t, LED_ID_COUNT>;

// Those of one product.
struct power_cycles {
    unsigned product = UFI;
    std::vector<power_cycle> ways;                      // the first one restarts the daemon
    state_store switched_off;                           // the states that have been switched on again
    std::unordered_map<std::string, led_picture> fresh; // by NV and clock: what a fresh device shows
};

void open_power_cycles(power_cycles &cycles, unsigned product);
void switch_off(const power_cycles &cycles, const power_cycle &cycle);         // nothing fails any more
std::vector<breach> switch_on(power_cycles &cycles, const power_cycle &cycle); // what has not healed
void restart_and_switch_on(const power_cycles &cycles);
