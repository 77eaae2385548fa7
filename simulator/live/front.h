// How a terminal shows a device's LEDs.
#pragma once

#include "seen/observed.h"

#include <string>
#include <vector>

struct front_look {
    bool utf8 = true; // round lamps; otherwise * and .
    size_t columns = 80;
};

// The LEDs of the product that configuration item 6000 names, and others that are lit.
std::vector<int> leds_of(std::string_view product_text, const observed &state);

// Rows of lamps with their names and states, as many to a row as fit. lit_for_ms: how long each LED has shown what it
// shows, which tells where in its rhythm one that blinks is.
std::string draw_front(const std::vector<int> &leds, const observed &state,
                       const std::array<int64_t, LED_ID_COUNT> &shown_for_ms, const front_look &how);
