#include "oddities.h"

#include "ground/led_ctx.h"
#include "kiv/adabsp.h"

#include <algorithm>

namespace
{
constexpr unsigned A_HANDHELD = 1U << UFI;
constexpr unsigned A_DATA_CARD = 1U << DATA_CARD;
constexpr unsigned A_PAPER_KITE = 1U << PAPER_KITE;
constexpr unsigned A_MODULE = 1U << MODULE;
constexpr unsigned A_SINGLE_CHIP = 1U << UNI_CORE;
constexpr unsigned ANY_PRODUCT = (1U << PRODUCTS) - 1;

constexpr unsigned bit(property which)
{
    return 1U << which;
}

constexpr unsigned COLOURS = bit(ONE_COLOUR);
constexpr unsigned OWN = bit(OWN_LEDS);
constexpr unsigned OFF = bit(OFF_IS_DARK);
constexpr unsigned SLEEP = bit(SLEEP_IS_DARK);
constexpr unsigned NIGHTS = bit(NIGHT_IS_DIM);
constexpr unsigned HEALS = bit(HEALING) | bit(FAILURES_HEAL);
constexpr unsigned TIMERS = bit(TIMERS_KEPT);
constexpr unsigned NOISE = bit(NO_NOISE);

bool is_of(const breach &what, std::initializer_list<int> leds)
{
    return std::find(leds.begin(), leds.end(), what.led) != leds.end();
}

bool is_net(const breach &what)
{
    return is_of(what, {LED_NET_RED, LED_NET_BLUE, LED_NET_WHITE});
}

bool said(const breach &what, std::string_view piece)
{
    return what.said.find(piece) != std::string_view::npos;
}

bool is_power_led(const breach &what)
{
    return what.led == LED_POWER_BLUE;
}

bool is_reset_light(const breach &what)
{
    return what.led == LED_ID_41;
}

bool is_self_test(const breach &what)
{
    return what.led == LED_BAT_RED && look_at(what.shown) == led_look{led_mode::ON, 4, 0, 0};
}

bool is_odd_charging(const breach &what)
{
    return is_of(what, {LED_BAT_RED, LED_BAT_GREEN}) && nv_is("nv/battery_charging", "4");
}

bool is_asleep_when_switched_on(const breach &what)
{
    return (world.excused & SWITCHED_ON_ASLEEP) != 0 && is_of(what, {LED_BAT_RED, LED_BAT_GREEN, LED_SMS_BLUE});
}

bool is_taken_for_shown_at_night(const breach &what)
{
    return is_net(what) || what.led == LED_SIG_BLUE;
}

bool is_relit_asleep(const breach &what)
{
    return (world.excused & (RELIT_ASLEEP | SWITCHED_ON_ASLEEP)) != 0 && (is_net(what) || what.led == LED_SIG_BLUE);
}

bool is_net_shown_while_off(const breach &what)
{
    return (world.excused & NET_SHOWN_WHILE_OFF) != 0 && is_net(what);
}

bool is_taken_for_shown(const breach &what)
{
    return (is_net(what) || what.led == LED_SIG_BLUE) && (what.shown == 0 || what.due == 0);
}

// Plain power-off and sleep delete the timer, unless it is one that was lost before.
bool is_message_timer(const breach &what)
{
    return what.timer == timer_purpose::NEW_MESSAGE &&
           (what.is_lost || (world.power != POWER_OFF && world.power != POWER_ON) ||
            (world.excused & (SWITCHED_ON_ASLEEP | MESSAGE_TIMER_LEFT)) != 0);
}

bool is_message_led(const breach &what)
{
    return what.led == LED_SMS_BLUE && (look_at(what.shown).mode == led_mode::ON || world.asleep != 0);
}

bool is_reminder_timer(const breach &what)
{
    return what.timer == timer_purpose::LIMIT_CHECK || what.timer == timer_purpose::REMINDER;
}

bool is_reminder_while_unreal(const breach &what)
{
    return !what.is_lost && (world.power == POWER_OFF_UNREAL || world.asleep != 0 || world.call_up == 0) &&
           is_reminder_timer(what);
}

bool is_net_while_unreal(const breach &what)
{
    return world.power == POWER_OFF_UNREAL && is_net(what) && is_reminding();
}

bool is_reminder_asleep(const breach &what)
{
    return !what.is_lost && (world.asleep != 0 || world.call_up == 0) && is_reminder_timer(what);
}

bool is_alarm_at_night(const breach &what)
{
    return what.led == LED_SIG_BLUE &&
           (look_at(what.shown).mode == led_mode::BLINK || look_at(what.due).mode == led_mode::BLINK);
}

bool is_wifi_while_pairing(const breach &what)
{
    return what.led == LED_WIFI_BLUE &&
           (nv_is("nv/wifi_chip1_wps_state", "1") || nv_is("nv/wifi_chip2_wps_state", "1"));
}

bool is_dark_wifi(const breach &what)
{
    return what.led == LED_WIFI_BLUE && what.shown == 0;
}

bool is_net_said_asleep(const breach &what)
{
    return world.asleep != 0 && (said(what, "NETTYPE") || said(what, "PPP"));
}

bool is_wifi_said(const breach &what)
{
    return said(what, "WLAN");
}

bool is_new_message_said(const breach &what)
{
    return said(what, "NEW_SMS");
}

bool is_voicemail_said(const breach &what)
{
    return said(what, "VOCEMAIL");
}

bool is_battery_said(const breach &what)
{
    return said(what, "BATTERY_VALUE") || said(what, "CHARGIN_STATUS");
}

bool is_terminal_led(const breach &what)
{
    return is_of(what, {LED_POWER_BLUE, LED_WIFI_BLUE, LED_SIG_BLUE});
}

bool is_sig_6(const breach &what)
{
    return what.led == LED_SIG_6;
}

bool is_sig_6_out_of_range(const breach &what)
{
    return what.led == LED_SIG_6 && nv_is("nv/signalbar", "9");
}

bool is_module_net(const breach &what)
{
    return is_of(what, {LED_NET_RED, LED_NET_14, LED_NET_16});
}

bool is_module_net_of_its_own(const breach &what)
{
    return is_of(what, {LED_NET_14, LED_NET_16});
}

bool is_module_5g(const breach &what)
{
    return is_module_net(what) && nv_is("nv/network_type", "SA");
}

bool is_module_out_of_range(const breach &what)
{
    return is_of(what, {LED_VOICE_RED, LED_VOICE_GREEN, LED_VOICE_YELLOW}) && nv_is("nv/signalbar", "9");
}

bool is_module_without_bars(const breach &what)
{
    return what.led == LED_VOICE_GREEN && what.shown == 0;
}

bool is_any_sig(const breach &what)
{
    return is_of(what, {LED_SIG_6, LED_SIG_BLUE});
}

bool is_level_while_off(const breach &what)
{
    return what.led == LED_SIG_BLUE;
}

bool is_of_the_reset_scene(const breach &what)
{
    constexpr led_look SIGNAL = {led_mode::ON, 3, 0, 0};
    return what.led == LED_NET_WHITE ||
           (what.led == LED_SIG_BLUE && (look_at(what.shown) == SIGNAL || look_at(what.due) == SIGNAL));
}

bool is_refused_and_remembered(const breach &what)
{
    return is_net(what) || is_of(what, {LED_SIG_6, LED_SIG_BLUE});
}

// The first row that fits counts.
// clang-format off
constexpr std::array oddity_rows = {
    oddity{"relight-lights-a-power-led", A_HANDHELD | A_PAPER_KITE, OWN | OFF | SLEEP | NIGHTS | HEALS, is_power_led,
           "A power LED lights up on a device that has none to show. Every relight, and so every end of a night, lights "
           "the set of the single-chip terminal whatever the product is, and nothing of this product puts it out again."},
    oddity{"reset-light-stays", A_HANDHELD, OFF | SLEEP | HEALS, is_reset_light,
           "One light of the factory-reset scene stays lit when the device goes off, because switching everything off "
           "leaves it out. Only the next self-test puts it out."},
    oddity{"self-test-lights-a-dark-device", A_HANDHELD, OFF | SLEEP, is_self_test,
           "A self-test leaves the red battery LED lit, also on a device that is off or asleep: it asks for neither."},
    oddity{"unheard-of-charging-state", A_HANDHELD, HEALS, is_odd_charging,
           "The power management writes a charging state that nobody knows. The battery LEDs then keep what they showed, "
           "even over a restart of the daemon."},
    oddity{"switched-on-asleep", A_HANDHELD, SLEEP, is_asleep_when_switched_on,
           "A device that is told to be on while it sleeps, or was told to sleep while it was off, is asleep without the "
           "scene of falling asleep: instead of breathing it shows what it finds."},
    oddity{"relight-wakes-the-lights", A_HANDHELD | A_SINGLE_CHIP, SLEEP, is_relit_asleep,
           "A relight while asleep, such as the one that ends a night, lights the net and signal LEDs: it asks for the "
           "power state only."},
    oddity{"message-timer-lost", A_HANDHELD, TIMERS, is_message_timer,
           "Switched on again while a new message blinks, the device shows the message anew and starts a second timer; "
           "the first one runs on and nobody can stop it. The charging and the quick ways of switching off let it run too."},
    oddity{"message-lights-a-dark-device", A_HANDHELD, OFF | SLEEP, is_message_led,
           "Ten seconds after a message the timer lights the message LED steadily, also on a device that has gone off or "
           "to sleep meanwhile in a way that lets the timer run."},
    oddity{"reminder-runs-on-while-off", A_HANDHELD, TIMERS, is_reminder_while_unreal,
           "Off but only for the eye, the device lets the data-volume check and the reminder run, and they go on after it is "
           "switched on, also when the call has ended or sleep was told meanwhile."},
    oddity{"reminder-lights-a-dark-device", A_HANDHELD, OFF, is_net_while_unreal,
           "Off but only for the eye, the device lets the data-volume reminder run, and so it blinks on the net LED of a "
           "device that should be dark."},
    oddity{"close-all-lights-the-net", A_HANDHELD | A_SINGLE_CHIP, OFF, is_net_shown_while_off,
           "Something that only re-applies the net LED lights it on a device that is off: a changed close-all setting of "
           "the night on every product, a wake-up on the single-chip terminal. Neither asks for the power state."},
    oddity{"reminder-runs-on-asleep", A_PAPER_KITE, TIMERS, is_reminder_asleep,
           "A paper-kite has no scene for falling asleep, so the data-volume reminder and its check run on; if the call ends "
           "meanwhile, the reminder outlives it."},
    oddity{"alarm-is-not-for-the-night", ANY_PRODUCT & ~A_DATA_CARD, NIGHTS | HEALS, is_alarm_at_night,
           "A device that starts hot at night blinks its alarm brightly: the alarm is looked at before the night, and the "
           "relight that would darken it is refused while the device is not yet on. A killed daemon leaves the blink lit."},
    oddity{"pairing-by-relight", A_PAPER_KITE | A_SINGLE_CHIP, NIGHTS | HEALS, is_wifi_while_pairing,
           "While Wi-Fi pairing runs a relight shows it and a start does not: the one reads it from NV, the other does not."},
    oddity{"sleep-value-5-darkens-wifi", A_HANDHELD, NIGHTS | HEALS, is_dark_wifi,
           "A sleep value that is neither asleep nor awake reaches a device that is off. Switched on, most of it counts "
           "as awake, but Wi-Fi stays dark until the next wake-up."},
    oddity{"net-change-asleep", ANY_PRODUCT & ~A_MODULE, NOISE, is_net_said_asleep,
           "While asleep every network or data-call notification switches the dark net LEDs off once more."},
    oddity{"wifi-told-twice", A_HANDHELD | A_PAPER_KITE | A_SINGLE_CHIP, NOISE, is_wifi_said,
           "Wi-Fi remembers nothing: every notification of it sets the LED, changed or not."},
    oddity{"another-message", A_HANDHELD, NOISE, is_new_message_said,
           "Each new message starts the ten seconds of blinking anew, so the second one changes the timer."},
    oddity{"voicemail-told-twice", A_MODULE, NOISE, is_voicemail_said,
           "The voicemail LED is set with every notification, changed or not."},
    oddity{"battery-told-twice", A_HANDHELD, NOISE, is_battery_said,
           "The battery LEDs are switched off and set with every notification, changed or not."},
    oddity{"data-card-lit-as-a-terminal", A_DATA_CARD, COLOURS | OWN | NIGHTS | HEALS, is_terminal_led,
           "Right after its start a data card lights a power LED, a Wi-Fi LED and a second signal LED. Night mode ends "
           "every start that finds it off or outside its window with a relight, and the relight is the single-chip "
           "terminal's."},
    oddity{"data-card-shines-at-night", A_DATA_CARD, NIGHTS, is_sig_6,
           "The signal LED of a data card stays lit in a night that darkens everything: what the night re-applies leaves "
           "it out until the bars change."},
    oddity{"more-bars-than-five", A_DATA_CARD, HEALS, is_sig_6_out_of_range,
           "The network service writes more bars than there are. The signal LED keeps what it showed, over a restart too."},
    oddity{"card-sleeps-through-a-change", A_DATA_CARD | A_PAPER_KITE, NIGHTS, is_net,
           "A network change that comes while asleep is dropped, and this product has no scene for waking up that would "
           "read it again: it shows the old network, or none."},
    oddity{"module-two-net-colours", A_MODULE, COLOURS, is_module_net,
           "A module terminal shows two networks at once: net_14 and net_16 are not switched off with the other net LEDs."},
    oddity{"module-net-lit-while-off", A_MODULE, OFF, is_module_net_of_its_own,
           "A module terminal that has been switched off shows its network all the same: switching everything off leaves "
           "net_14 and net_16 out."},
    oddity{"module-has-no-night", A_MODULE, NIGHTS, is_module_net,
           "The night does not reach what a module terminal shows: its relight is refused, because the terminal keeps a "
           "power state of its own. What was lit stays lit until it changes."},
    oddity{"module-without-5g", A_MODULE, HEALS, is_module_5g,
           "On a 5G network a module terminal asks for no net LED at all, so it goes on showing whatever was lit before."},
    oddity{"module-remembers-its-net", A_MODULE, HEALS, is_module_net,
           "net_14 and net_16 of a module terminal stay lit when it is switched off and on, so it shows networks of its "
           "past beside the present one."},
    oddity{"module-more-bars-than-five", A_MODULE, HEALS, is_module_out_of_range,
           "The network service writes more bars than there are. The signal LED of a module terminal keeps what it showed."},
    oddity{"module-dark-after-a-call", A_MODULE, HEALS, is_module_without_bars,
           "After a call the signal LED of a module terminal stays dark until the bars change: the phone LED is of the "
           "same group and switches it off, and nothing lights it again."},
    oddity{"single-chip-two-signal-leds", A_SINGLE_CHIP, COLOURS, is_any_sig,
           "A single-chip terminal that has been woken lights a second signal LED: the scene of waking up sets sig_6, "
           "which everything else leaves alone."},
    oddity{"single-chip-sig-6-stays", A_SINGLE_CHIP, OFF | SLEEP | NIGHTS | HEALS, is_sig_6,
           "Once woken, a single-chip terminal keeps sig_6 lit: off, asleep and at night nothing puts it out."},
    oddity{"single-chip-level-in-the-dark", A_SINGLE_CHIP, OFF | SLEEP, is_level_while_off,
           "When the temperature alarm ends, or its setting is read again, a single-chip terminal shows its signal level, "
           "also while it is off or asleep."},
    oddity{"single-chip-keeps-reset-white", A_SINGLE_CHIP, NIGHTS | HEALS, is_of_the_reset_scene,
           "Switched on after a factory reset, a single-chip terminal keeps the white net LED and the signal LED of the "
           "reset scene, also at night, as long as network and bars are the ones that it remembers."},
    oddity{"single-chip-bright-at-night", A_SINGLE_CHIP, NIGHTS, is_taken_for_shown_at_night,
           "Lit while off, the net or signal LED of a single-chip terminal is bright when the terminal is switched on at "
           "night: network and bars are the ones that it remembers, so nothing dims them."},
    oddity{"single-chip-dark-after-off-and-on", A_SINGLE_CHIP, HEALS, is_taken_for_shown,
           "Switched off and on again, a single-chip terminal shows neither network nor signal: both are the ones that it "
           "remembers, so it takes them for shown."},
    oddity{"refused-request-remembered", A_DATA_CARD | A_SINGLE_CHIP, bit(FAILURES_HEAL), is_refused_and_remembered,
           "The board refuses a request for the signal or net LED. The daemon takes it for shown all the same, and so does "
           "what it does at the next start or power-on: the LED stays wrong until something else changes."},
};
// clang-format on
} // namespace

std::span<const oddity> all_oddities()
{
    return oddity_rows;
}

const oddity *oddity_of(unsigned product, const breach &what)
{
    for (const oddity &row : oddity_rows) {
        if ((row.products >> product & 1) != 0 && (row.breaks >> what.broken & 1) != 0 && row.is(what)) {
            return &row;
        }
    }
    return nullptr;
}
