#include "properties.h"

#include "ground/led_ctx.h"
#include "kiv/adabsp.h"

#include <algorithm>

bool is_night()
{
    static const uint8_t key = key_number("nv/is_night_mode");
    static const uint8_t yes = text_number(key, "1");
    return world.texts[key] == yes;
}

bool is_on_and_awake()
{
    return world.power == POWER_ON && world.asleep == 0;
}

bool is_reminding()
{
    const std::span<const timer_kind> kinds = known_timers();
    for (size_t kind = 0; kind < kinds.size(); kind++) {
        if (kinds[kind].purpose == timer_purpose::REMINDER && running_of(kind) > 0) {
            return true;
        }
    }
    return false;
}

namespace
{
constexpr int MAX_GROUP = 5;

struct led_group_row {
    std::array<int, MAX_GROUP> leds;
};

constexpr std::array group_rows = {
    led_group_row{LED_BAT_RED,       LED_BAT_GREEN,       LED_BAT_BLUE,       LED_BAT_YELLOW,       NO_LED       },
    led_group_row{LED_SIG_6,         LED_SIG_BLUE,        NO_LED,             NO_LED,               NO_LED       },
    led_group_row{LED_NET_RED,       LED_NET_14,          LED_NET_BLUE,       LED_NET_16,           LED_NET_WHITE},
    led_group_row{LED_SMS_GREEN,     LED_SMS_BLUE,        NO_LED,             NO_LED,               NO_LED       },
    led_group_row{LED_VOICE_RED,     LED_VOICE_GREEN,     LED_VOICE_BLUE,     LED_VOICE_YELLOW,     NO_LED       },
    led_group_row{LED_VOICEMAIL_RED, LED_VOICEMAIL_GREEN, LED_VOICEMAIL_BLUE, LED_VOICEMAIL_YELLOW, NO_LED       },
};

constexpr std::array night_gated = {LED_SIG_6,  LED_SIG_BLUE,  LED_NET_RED,    LED_NET_14,   LED_NET_BLUE,
                                    LED_NET_16, LED_NET_WHITE, LED_POWER_BLUE, LED_WIFI_BLUE};

bool is_one_of(int led, std::initializer_list<int> leds)
{
    return std::find(leds.begin(), leds.end(), led) != leds.end();
}

bool shows(uint8_t look, const led_look &wanted)
{
    return look_at(look) == wanted;
}

constexpr led_look ALARM_BLINK = {led_mode::BLINK, 3, 1000, 1000};
constexpr led_look SLEEP_BREATH = {led_mode::BLINK, 4, 300, 5000};

// The temperature alarm blinks the signal LED of every product.
bool is_alarm(int led, uint8_t look)
{
    return led == LED_SIG_BLUE && shows(look, ALARM_BLINK);
}

bool has_led(unsigned product, int led)
{
    switch (product) {
    case UFI:
        return is_one_of(led, {LED_BAT_RED, LED_BAT_GREEN, LED_NET_RED, LED_NET_14, LED_NET_BLUE, LED_NET_WHITE,
                               LED_ID_41, LED_WIFI_BLUE, LED_SMS_BLUE});
    case DATA_CARD:
        return is_one_of(led, {LED_SIG_6, LED_NET_RED, LED_NET_BLUE, LED_NET_WHITE});
    case PAPER_KITE:
        return is_one_of(led, {LED_NET_RED, LED_NET_BLUE, LED_NET_WHITE, LED_WIFI_BLUE});
    case MODULE:
        return is_one_of(led, {LED_BAT_RED, LED_BAT_GREEN, LED_BAT_YELLOW, LED_NET_RED, LED_NET_14, LED_NET_16,
                               LED_VOICE_RED, LED_VOICE_GREEN, LED_VOICE_BLUE, LED_VOICE_YELLOW, LED_VOICEMAIL_GREEN,
                               LED_POWER_BLUE});
    default:
        return is_one_of(led, {LED_POWER_BLUE, LED_WIFI_BLUE, LED_NET_RED, LED_NET_BLUE, LED_NET_WHITE, LED_SIG_BLUE,
                               LED_SIG_6, LED_VOICE_BLUE});
    }
}

// What may be lit in a state that is off. A ringing phone shows in every state, and so does the temperature alarm.
bool may_light_while_off(unsigned product, unsigned power, int led)
{
    if (product == UFI && (power == POWER_OFF_CHARGE || power == POWER_OFF_CHARGE_QUICKEN)) {
        return is_one_of(led, {LED_BAT_RED, LED_BAT_GREEN});
    }
    if (product == UFI && power == POWER_RESETTING) {
        return is_one_of(led, {LED_BAT_GREEN, LED_ID_41, LED_SMS_BLUE, LED_NET_RED});
    }
    if (product == UNI_CORE && power == POWER_RESETTING) {
        return is_one_of(led, {LED_POWER_BLUE, LED_WIFI_BLUE, LED_NET_WHITE, LED_SIG_BLUE, LED_VOICE_BLUE});
    }
    return led == LED_VOICE_BLUE;
}

bool may_light_while_asleep(unsigned product, int led, uint8_t look)
{
    if (product == UFI) {
        return led == LED_BAT_GREEN && shows(look, SLEEP_BREATH);
    }
    return is_one_of(led, {LED_POWER_BLUE, LED_WIFI_BLUE, LED_VOICE_BLUE});
}

bool has_sleep_scene(unsigned product)
{
    return product == UFI || product == UNI_CORE;
}

bool is_wholly_dark_night()
{
    static const uint8_t key = key_number("nv/night_mode_close_all_led");
    static const uint8_t no = text_number(key, "0");
    return world.texts[key] != no;
}

bool may_shine_at_night(int led, uint8_t look)
{
    const bool dimmed = is_one_of(led, {LED_NET_RED, LED_NET_BLUE, LED_NET_WHITE});
    return dimmed && !is_wholly_dark_night() && look_at(look).brightness <= 1;
}

void check_led(unsigned product, int led, uint8_t look, std::vector<breach> &found)
{
    const unsigned power = world.power;
    const bool is_off = power != POWER_NOT_YET && power != POWER_ON;
    if (!has_led(product, led) && !is_alarm(led, look)) {
        found.push_back({.broken = OWN_LEDS, .led = led, .shown = look});
    }
    if (is_off && !may_light_while_off(product, power, led) && !is_alarm(led, look)) {
        found.push_back({.broken = OFF_IS_DARK, .led = led, .shown = look});
    }
    if (power == POWER_ON && world.asleep != 0 && has_sleep_scene(product) && !is_alarm(led, look) &&
        !may_light_while_asleep(product, led, look)) {
        found.push_back({.broken = SLEEP_IS_DARK, .led = led, .shown = look});
    }
    if (is_gated_at_night(led) && power == POWER_ON && is_night() && !may_shine_at_night(led, look)) {
        found.push_back({.broken = NIGHT_IS_DIM, .led = led, .shown = look});
    }
}

void check_group(const led_group_row &group, std::vector<breach> &found)
{
    int lit = NO_LED;
    for (const int led : group.leds) {
        if (led == NO_LED || !is_lit(world.leds[static_cast<size_t>(led)])) {
            continue;
        }
        if (lit != NO_LED) {
            found.push_back({.broken = ONE_COLOUR, .led = led, .shown = world.leds[static_cast<size_t>(led)]});
        }
        lit = led;
    }
}

bool has_a_purpose(timer_purpose purpose)
{
    switch (purpose) {
    case timer_purpose::NEW_MESSAGE:
        return is_on_and_awake();
    case timer_purpose::LIMIT_CHECK:
    case timer_purpose::REMINDER:
        return is_on_and_awake() && world.call_up != 0;
    case timer_purpose::TEMPERATURE:
        return !nv_is("nv/thermal_led_enable", "0");
    default:
        return !nv_is("nv/night_mode_switch", "0");
    }
}

void check_timers(std::vector<breach> &found)
{
    const std::span<const timer_kind> kinds = known_timers();
    for (size_t kind = 0; kind < kinds.size(); kind++) {
        const bool is_kept = ((world.timers[kind] & 1) == 0 || handle_is_kept(kind, 0)) &&
                             ((world.timers[kind] & 2) == 0 || handle_is_kept(kind, 1));
        const bool is_lost = running_of(kind) > 1 || !is_kept;
        if (is_lost || (running_of(kind) > 0 && !has_a_purpose(kinds[kind].purpose))) {
            found.push_back({.broken = TIMERS_KEPT, .timer = kinds[kind].purpose, .is_lost = is_lost});
        }
    }
}

// NV always has a number of bars, so a module terminal that is on shows one of them, or a call in their place.
void check_module_signal(unsigned product, std::vector<breach> &found)
{
    if (product != MODULE || world.power != POWER_ON || world.restarting != 0) {
        return;
    }
    for (const int led : {LED_VOICE_RED, LED_VOICE_GREEN, LED_VOICE_BLUE, LED_VOICE_YELLOW}) {
        if (is_lit(world.leds[static_cast<size_t>(led)])) {
            return;
        }
    }
    found.push_back({.broken = HEALING, .led = LED_VOICE_GREEN});
}

} // namespace

std::string_view property_text(unsigned which)
{
    constexpr std::array<std::string_view, PROPERTY_COUNT - 1> texts = {
        "of a group whose colours exclude one another at most one is lit",
        "an LED that the product does not have is never lit",
        "off means dark, except what is named for the power state",
        "asleep shows only what is named for the product",
        "nothing shines brighter than the night allows, and the morning shows what NV says",
        "off and on again, or a restart, shows a picture that depends on NV alone",
        "no timer is lost, doubled or outlives what it is for",
        "an indication that changes nothing asks for nothing, and repeating one changes nothing",
        "what a failed platform call has left, the next power cycle heals",
        "from every state everything can be reached again",
    };
    return texts[which - ONE_COLOUR];
}

std::string subject_of(const breach &what)
{
    constexpr std::array<std::string_view, 5> timers = {"the new-message timer", "the limit-check timer",
                                                        "the reminder timer", "the temperature timer",
                                                        "the night timer"};
    if (what.timer) {
        return std::string(timers[static_cast<size_t>(*what.timer)]);
    }
    if (!what.said.empty()) {
        const size_t line = what.said.rfind('\n') + 1; // 0 when there is one line
        return std::string(what.said.substr(line));
    }
    return what.led == NO_LED ? "the daemon" : std::string(led_name(what.led));
}

bool nv_is(std::string_view key, std::string_view text)
{
    const std::string *now = text_of(key);
    return now != nullptr && *now == text;
}

void check_state(unsigned product, std::vector<breach> &found)
{
    for (size_t led = 0; led < world.leds.size(); led++) {
        if (is_lit(world.leds[led])) {
            check_led(product, static_cast<int>(led), world.leds[led], found);
        }
    }
    for (const led_group_row &group : group_rows) {
        check_group(group, found);
    }
    check_timers(found);
    check_module_signal(product, found);
}

bool is_gated_at_night(int led)
{
    return std::find(night_gated.begin(), night_gated.end(), led) != night_gated.end();
}

bool is_told_by_notification(unsigned product, int led)
{
    return (product == UFI && led == LED_SMS_BLUE) || (product == UNI_CORE && led == LED_VOICE_BLUE) ||
           (product == MODULE && is_one_of(led, {LED_VOICE_BLUE, LED_VOICEMAIL_GREEN}));
}
