// The fronts of the five products: which LEDs are on each, by indicator, as a person sees them.
#pragma once

#include "language/names.h"
#include "language/scenario.h"

#include <span>

constexpr size_t LENS_LEDS_MAX = 4;

// The LEDs behind one lens and the word beneath it.
struct indicator {
    std::string_view word;
    std::array<int, LENS_LEDS_MAX> leds; // NO_LED behind the last one
};

constexpr int NO_LED = -1;

// From left to right. Holds every LED that the product can light.
std::span<const indicator> front_of(const product_name &product);

// "red", "green", "blue", "yellow" or "white"; empty for a LED whose name tells no colour.
std::string_view colour_of(int led);

bool is_lit(const led_look &look);
std::string in_words(int led, const led_look &look); // "green, blinking, 0.8 s on, 1.2 s off"
std::string seconds(int64_t ms);                     // "0.8 s"
