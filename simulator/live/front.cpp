#include "live/front.h"

#include "panel/front.h"

#include <algorithm>

namespace
{
constexpr std::array<std::string_view, 5> colours = {"red", "green", "yellow", "blue", "white"};
constexpr int FIRST_COLOUR = 91; // the terminal's bright red, and the others behind it
constexpr int WHITE = 97;

int terminal_colour(int led)
{
    const auto found = std::find(colours.begin(), colours.end(), colour_of(led));
    return found == colours.end() || *found == "white" ? WHITE
                                                       : FIRST_COLOUR + static_cast<int>(found - colours.begin());
}

// Any text that names no product is a data card.
const product_name &product_of(std::string_view cfg_text)
{
    const std::string_view text = cfg_text == "DRIVER_UFI" ? "NO_DRIVER_UFI" : cfg_text;
    for (const product_name &product : all_products()) {
        if (text == product.cfg_text) {
            return product;
        }
    }
    return *find_product("DATA_CARD");
}

bool is_lit_now(const led_look &look, int64_t shown_for_ms)
{
    const int64_t period = int64_t{look.blink_time1} + look.blink_time2;
    if (look.mode == led_mode::BLINK && period > 0 && shown_for_ms % period >= look.blink_time1) {
        return false;
    }
    return look.mode != led_mode::OFF && look.brightness > 0;
}

std::string paint(const std::string &text, int led, const led_look &look, bool lit)
{
    constexpr int bright = 3;
    const std::string colour = std::to_string(terminal_colour(led)) + "m";
    return (lit ? (look.brightness >= bright ? "\033[1;" : "\033[") + colour : "\033[2m") + text + "\033[0m";
}

std::string padded(std::string text, size_t width)
{
    text.resize(std::max(width, text.size()), ' ');
    return text;
}
} // namespace

std::vector<int> leds_of(std::string_view product_text, const observed &state)
{
    std::vector<int> leds;
    for (const indicator &lens : front_of(product_of(product_text))) {
        std::copy_if(lens.leds.begin(), lens.leds.end(), std::back_inserter(leds),
                     [](int led) { return led != NO_LED; });
    }
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const bool lit = is_lit(state.leds[static_cast<size_t>(led)]);
        if (lit && std::find(leds.begin(), leds.end(), led) == leds.end()) {
            leds.push_back(led);
        }
    }
    return leds;
}

std::string draw_front(const std::vector<int> &leds, const observed &state,
                       const std::array<int64_t, LED_ID_COUNT> &shown_for_ms, const front_look &how)
{
    std::string all;
    for (size_t at = 0; at < leds.size();) {
        std::string names;
        std::string lamps;
        std::string states;
        for (size_t used = 0; at < leds.size(); at++) {
            const auto led = static_cast<size_t>(leds[at]);
            const std::string name(led_name(leds[at]));
            const led_look &look = state.leds[led];
            const std::string shown = look.mode == led_mode::OFF ? "" : describe(look);
            const size_t width = std::max(name.size(), shown.size()) + 2;
            const bool lit = is_lit_now(look, shown_for_ms[led]);
            if (used > 0 && used + width > how.columns) {
                break;
            }
            used += width;
            const std::string lamp = how.utf8 ? (lit ? "●" : "○") : (lit ? "*" : ".");
            names += padded(name, width);
            lamps += paint(lamp, leds[at], look, lit) + std::string(width - 1, ' ');
            states += padded(shown, width);
        }
        all += lamps + "\n" + names + "\n" + states + "\n";
    }
    return all;
}
