// What the drawings share: text that XML can hold, the colours of the LEDs, and how a blinking one is hatched.
#pragma once

#include "language/scenario.h"

#include <string>
#include <string_view>

constexpr int PICTURE_WIDTH = 800;

// Escaped for text and attributes; what is neither printable nor UTF-8 becomes a question mark.
std::string xml_text(std::string_view text);

// Formats as printf does, at most 1000 characters, and adds it.
__attribute__((format(printf, 2, 3))) void draw(std::string &svg, const char *format, ...);

// The head with title, styles and patterns; the picture ends with "</svg>".
std::string begin_svg(int height, std::string_view title);

std::string led_fill(int led, const led_look &look); // a paint: the colour, or its hatched pattern
