#include "panel/front.h"

#include "kiv/adabsp.h"

#include <cstdio>

namespace
{
constexpr indicator BATTERY = {
    "Battery", {LED_BAT_GREEN, LED_BAT_RED, NO_LED, NO_LED}
};
constexpr indicator POWER = {
    "Power", {LED_POWER_BLUE, NO_LED, NO_LED, NO_LED}
};
constexpr indicator NETWORK = {
    "Network", {LED_NET_BLUE, LED_NET_RED, LED_NET_WHITE, NO_LED}
};
constexpr indicator HEAT = {
    "Heat", {LED_SIG_BLUE, NO_LED, NO_LED, NO_LED}
};
constexpr indicator SIGNAL = {
    "Signal", {LED_SIG_BLUE, LED_SIG_6, NO_LED, NO_LED}
};
constexpr indicator WIFI = {
    "Wi-Fi", {LED_WIFI_BLUE, NO_LED, NO_LED, NO_LED}
};
constexpr indicator MESSAGES = {
    "Messages", {LED_SMS_BLUE, NO_LED, NO_LED, NO_LED}
};

constexpr std::array ufi_front = {
    BATTERY,
    indicator{"Network",   {LED_NET_BLUE, LED_NET_RED, LED_NET_WHITE, LED_NET_14}},
    WIFI,
    MESSAGES,
    HEAT,
    POWER,
    indicator{"Self-test", {LED_ID_41, NO_LED, NO_LED, NO_LED}                   },
};
constexpr std::array data_card_front = {POWER, NETWORK, SIGNAL, WIFI, MESSAGES};
constexpr std::array paper_kite_front = {POWER, NETWORK, WIFI, MESSAGES, HEAT};
constexpr std::array module_front = {
    indicator{"Battery",       {LED_BAT_GREEN, LED_BAT_YELLOW, LED_BAT_RED, NO_LED}              },
    indicator{"Network",       {LED_NET_14, LED_NET_16, LED_NET_RED, NO_LED}                     },
    indicator{"Signal, phone", {LED_VOICE_GREEN, LED_VOICE_YELLOW, LED_VOICE_RED, LED_VOICE_BLUE}},
    indicator{"Voicemail",     {LED_VOICEMAIL_GREEN, NO_LED, NO_LED, NO_LED}                     },
    HEAT,
};
constexpr std::array uni_core_front = {
    POWER, NETWORK, SIGNAL, WIFI, MESSAGES, indicator{"Phone", {LED_VOICE_BLUE, NO_LED, NO_LED, NO_LED}},
};
} // namespace

std::span<const indicator> front_of(const product_name &product)
{
    if (product.name == "UFI") {
        return ufi_front;
    }
    if (product.name == "DATA_CARD") {
        return data_card_front;
    }
    if (product.name == "PAPER_KITE") {
        return paper_kite_front;
    }
    if (product.name == "MODULE") {
        return module_front;
    }
    return uni_core_front;
}

std::string_view colour_of(int led)
{
    constexpr std::array<std::string_view, 5> colours = {"red", "green", "blue", "yellow", "white"};
    const std::string_view name = led_name(led);
    const std::string_view last = name.substr(name.rfind('_') + 1);
    for (const std::string_view colour : colours) {
        if (colour == last) {
            return colour;
        }
    }
    return {};
}

bool is_lit(const led_look &look)
{
    return look.mode != led_mode::OFF && look.brightness > 0;
}

std::string seconds(int64_t ms)
{
    std::array<char, 32> text;
    snprintf(text.data(), text.size(), "%g s", static_cast<double>(ms) / 1000);
    return text.data();
}

std::string in_words(int led, const led_look &look)
{
    const std::string_view colour = colour_of(led);
    const std::string name(colour.empty() ? led_name(led) : colour);
    if (!is_lit(look)) {
        return name + ", off";
    }
    if (look.mode == led_mode::ON) {
        return name + ", on";
    }
    return name + ", blinking, " + seconds(look.blink_time1) + " on, " + seconds(look.blink_time2) + " off";
}
