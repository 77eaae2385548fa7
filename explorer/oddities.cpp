#include "oddities.h"

#include "ground/led_ctx.h"
#include "kiv/adabsp.h"

#include <algorithm>

namespace
{
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

constexpr std::initializer_list<int> MODULE_NET = {LED_NET_RED, LED_NET_14, LED_NET_16};
constexpr std::initializer_list<int> MODULE_BARS = {LED_VOICE_RED, LED_VOICE_GREEN, LED_VOICE_YELLOW};

bool is_battery_or_message(const breach &what)
{
    return is_of(what, {LED_BAT_RED, LED_BAT_GREEN, LED_SMS_BLUE});
}

bool is_net(const breach &what)
{
    return is_of(what, {LED_NET_RED, LED_NET_BLUE, LED_NET_WHITE});
}

bool is_net_or_signal(const breach &what)
{
    return is_net(what) || what.led == LED_SIG_BLUE;
}

bool is_look(const breach &what, const led_look &look)
{
    return look_at(what.shown) == look;
}

bool said(const breach &what, std::string_view piece)
{
    return what.said.find(piece) != std::string_view::npos;
}

// Also when the daemon could not write its word of it.
bool may_be_night()
{
    return is_night() || is_excused(NIGHT_UNTOLD);
}

// Plain power-off and sleep delete the timer, unless it is one that was lost before.
bool is_message_timer(const breach &what)
{
    return what.timer == timer_purpose::NEW_MESSAGE &&
           (what.is_lost || (world.power != POWER_OFF && world.power != POWER_ON) ||
            is_excused(SWITCHED_ON_ASLEEP | MESSAGE_TIMER_LEFT));
}

bool is_message_led(const breach &what)
{
    return what.led == LED_SMS_BLUE && (is_look(what, {led_mode::ON, 4, 0, 0}) || world.asleep != 0);
}

// Going off in earnest deletes both.
bool is_idle_reminder(const breach &what)
{
    return !what.is_lost && (what.timer == timer_purpose::LIMIT_CHECK || what.timer == timer_purpose::REMINDER) &&
           (world.power == POWER_OFF_UNREAL || world.asleep != 0 || world.call_up == 0);
}

// In the night or the morning after it; or switched on before the night's beginning or end was noticed.
bool is_left_by_the_night(const breach &what)
{
    return what.broken == NIGHT_IS_DIM || (!what.restarted && (what.shown == 0) != is_night());
}

bool is_alarm(const breach &what)
{
    return what.led == LED_SIG_BLUE &&
           (look_at(what.shown).mode == led_mode::BLINK || look_at(what.due).mode == led_mode::BLINK);
}

bool is_kept_without_bars(const breach &what)
{
    return is_of(what, {LED_SIG_6, LED_SIG_BLUE}) && what.due == 0 && what.restarted && nv_is("nv/signalbar", "0");
}

bool is_pairing()
{
    return nv_is("nv/wifi_chip1_wps_state", "1") || nv_is("nv/wifi_chip2_wps_state", "1");
}

bool is_of_the_reset_scene(const breach &what)
{
    return what.led == LED_NET_WHITE || (what.led == LED_SIG_BLUE && is_look(what, {led_mode::ON, 3, 0, 0}));
}

// The first row that fits counts.
// clang-format off
constexpr oddity oddity_rows[] = {
    {"product-read-at-the-start", ON_UFI | ON_MODULE | ON_UNI_CORE, bit(FAILURES_HEAL),
     [](const breach &what) {
         return (is_excused(CONFIGURATION_UNREAD) && !what.restarted) ||
                (is_excused(LIT_AS_ANOTHER) && is_of(what, {LED_SIG_6, LED_SIG_BLUE}));
     },
     "When the device configuration cannot be read at the start, the daemon serves another product: what it shows "
     "stays wrong when the device is switched off and on, and only a restart reads the configuration again. A module "
     "terminal then keeps the signal LEDs that it has lit as another product."},
    {"settings-read-at-the-start", ON_UFI | ON_MODULE | ON_UNI_CORE, bit(FAILURES_HEAL),
     [](const breach &what) { return is_excused(SETTINGS_UNREAD) && is_gated_at_night(what.led); },
     "When the settings of the night or of the temperature alarm cannot be read, or their timers not started, at the "
     "start, they stay without effect: switching off and on reads neither, only a restart or their commands do."},
    {"relight-lights-a-power-led", ON_UFI | ON_PAPER_KITE, OWN | OFF | SLEEP | NIGHTS | HEALS,
     [](const breach &what) { return what.led == LED_POWER_BLUE && is_look(what, {led_mode::ON, 2, 0, 0}); },
     "A power LED lights up on a device that has none to show. Every relight, and so every end of a night, lights "
     "the set of the single-chip terminal whatever the product is, and nothing of this product puts it out again."},
    {"reset-light-stays", ON_UFI, OFF | SLEEP | HEALS,
     [](const breach &what) { return what.led == LED_ID_41; },
     "One light of the factory-reset scene stays lit when the device goes off, because switching everything off "
     "leaves it out. Only the next self-test puts it out."},
    {"self-test-lights-a-dark-device", ON_UFI, OFF | SLEEP,
     [](const breach &what) { return is_excused(SELF_TESTED) && what.led == LED_BAT_RED; },
     "A self-test leaves the red battery LED lit, also on a device that is off or asleep: it asks for neither."},
    {"unheard-of-charging-state", ON_UFI, HEALS,
     [](const breach &what) { return is_of(what, {LED_BAT_RED, LED_BAT_GREEN}) && nv_is("nv/battery_charging", "4"); },
     "The power management writes a charging state that nobody knows. The battery LEDs then keep what they showed, "
     "even over a restart of the daemon."},
    {"switched-on-asleep", ON_UFI, SLEEP,
     [](const breach &what) { return is_excused(SWITCHED_ON_ASLEEP) && is_battery_or_message(what); },
     "A device that is told to be on while it sleeps, or was told to sleep while it was off, is asleep without the "
     "scene of falling asleep: instead of breathing it shows what it finds."},
    {"relight-wakes-the-lights", ON_UFI | ON_UNI_CORE, SLEEP,
     [](const breach &what) { return is_excused(RELIT_ASLEEP | SWITCHED_ON_ASLEEP) && is_net_or_signal(what); },
     "A relight while asleep, such as the one that ends a night, lights the net and signal LEDs: it asks for the "
     "power state only."},
    {"message-timer-lost", ON_UFI, TIMERS,
     [](const breach &what) { return is_message_timer(what); },
     "Switched on again while a new message blinks, the device shows the message anew and starts a second timer; "
     "the first one runs on and nobody can stop it. The charging and the quick ways of switching off let it run too."},
    {"message-lights-a-dark-device", ON_UFI, OFF | SLEEP,
     [](const breach &what) { return is_message_led(what); },
     "Ten seconds after a message the timer lights the message LED steadily, also on a device that has gone off or "
     "to sleep meanwhile in a way that lets the timer run."},
    {"reminder-runs-on-while-off", ON_UFI, TIMERS,
     [](const breach &what) { return is_idle_reminder(what); },
     "Off but only for the eye, the device lets the data-volume check and the reminder run, and they go on after it is "
     "switched on, also when the call has ended or sleep was told meanwhile."},
    {"reminder-lights-a-dark-device", ON_UFI, OFF,
     [](const breach &what) { return world.power == POWER_OFF_UNREAL && is_net(what) && is_reminding(); },
     "Off but only for the eye, the device lets the data-volume reminder run, and so it blinks on the net LED of a "
     "device that should be dark."},
    {"close-all-lights-the-net", ON_UFI | ON_UNI_CORE, OFF,
     [](const breach &what) { return is_excused(NET_SHOWN_WHILE_OFF) && is_net(what); },
     "Something that only re-applies the net LED lights it on a device that is off: a changed close-all setting of "
     "the night on every product, a wake-up on the single-chip terminal. Neither asks for the power state."},
    {"reminder-runs-on-asleep", ON_PAPER_KITE, TIMERS,
     [](const breach &what) { return is_idle_reminder(what); },
     "A paper-kite has no scene for falling asleep, so the data-volume reminder and its check run on; if the call ends "
     "meanwhile, the reminder outlives it."},
    {"alarm-is-not-for-the-night", ON_EVERY & ~ON_DATA_CARD, NIGHTS | HEALS,
     [](const breach &what) { return is_alarm(what); },
     "A device that starts hot at night blinks its alarm brightly: the alarm is looked at before the night, and the "
     "relight that would darken it is refused while the device is not yet on. A killed daemon leaves the blink lit."},
    {"pairing-by-relight", ON_PAPER_KITE | ON_UNI_CORE, NIGHTS | HEALS,
     [](const breach &what) { return what.led == LED_WIFI_BLUE && is_pairing(); },
     "While Wi-Fi pairing runs a relight shows it and a start does not: the one reads it from NV, the other does not."},
    {"sleep-value-5-darkens-wifi", ON_UFI, NIGHTS | HEALS,
     [](const breach &what) { return is_excused(SLEEP_VALUE_UNKNOWN) && what.led == LED_WIFI_BLUE; },
     "A sleep value that is neither asleep nor awake reaches a device that is off. Switched on, most of it counts "
     "as awake, but Wi-Fi stays dark until the next wake-up."},
    {"suspended-night-goes-on", ON_UFI | ON_MODULE | ON_UNI_CORE, HEALS,
     [](const breach &what) {
         return may_be_night() && is_gated_at_night(what.led) && nv_is("nv/night_mode_switch", "2");
     },
     "Night mode is suspended in the middle of a night, and the night goes on: only a restart, or the morning, "
     "ends it."},
    {"net-change-asleep", ON_EVERY & ~ON_MODULE, NOISE,
     [](const breach &what) { return world.asleep != 0 && (said(what, "NETTYPE") || said(what, "PPP")); },
     "While asleep every network or data-call notification switches the dark net LEDs off once more."},
    {"wifi-told-twice", ON_UFI | ON_PAPER_KITE | ON_UNI_CORE, NOISE,
     [](const breach &what) { return said(what, "WLAN"); },
     "Wi-Fi remembers nothing: every notification of it sets the LED, changed or not."},
    {"another-message", ON_UFI, NOISE,
     [](const breach &what) { return said(what, "NEW_SMS"); },
     "Each new message starts the ten seconds of blinking anew, so the second one changes the timer."},
    {"voicemail-told-twice", ON_MODULE, NOISE,
     [](const breach &what) { return said(what, "VOCEMAIL"); },
     "The voicemail LED is set with every notification, changed or not."},
    {"battery-told-twice", ON_UFI, NOISE,
     [](const breach &what) { return said(what, "BATTERY_VALUE") || said(what, "CHARGIN_STATUS"); },
     "The battery LEDs are switched off and set with every notification, changed or not."},
    {"data-card-lit-as-a-terminal", ON_DATA_CARD, COLOURS | OWN | NIGHTS | HEALS,
     [](const breach &what) { return is_of(what, {LED_POWER_BLUE, LED_WIFI_BLUE, LED_SIG_BLUE}); },
     "Right after its start a data card lights a power LED, a Wi-Fi LED and a second signal LED. Night mode ends "
     "every start that finds it off or outside its window with a relight, and the relight is the single-chip "
     "terminal's."},
    {"data-card-shines-at-night", ON_DATA_CARD, NIGHTS,
     [](const breach &what) { return what.led == LED_SIG_6; },
     "The signal LED of a data card stays lit in a night that darkens everything: what the night re-applies leaves "
     "it out until the bars change."},
    {"more-bars-than-five", ON_DATA_CARD, HEALS,
     [](const breach &what) { return what.led == LED_SIG_6 && nv_is("nv/signalbar", "9"); },
     "The network service writes more bars than there are. The signal LED keeps what it showed, over a restart too."},
    {"card-sleeps-through-a-change", ON_DATA_CARD | ON_PAPER_KITE, NIGHTS,
     [](const breach &what) { return is_excused(NET_CHANGED_ASLEEP) && is_net(what); },
     "A network change that comes while asleep is dropped, and this product has no scene for waking up that would "
     "read it again: it shows the old network, or none."},
    {"module-two-net-colours", ON_MODULE, COLOURS,
     [](const breach &what) { return is_of(what, MODULE_NET); },
     "A module terminal shows two networks at once: net_14 and net_16 are not switched off with the other net LEDs."},
    {"module-net-lit-while-off", ON_MODULE, OFF,
     [](const breach &what) { return is_of(what, {LED_NET_14, LED_NET_16}); },
     "A module terminal that has been switched off shows its network all the same: switching everything off leaves "
     "net_14 and net_16 out."},
    {"module-has-no-night", ON_MODULE, NIGHTS | HEALS,
     [](const breach &what) { return is_of(what, MODULE_NET) && is_left_by_the_night(what); },
     "The night does not reach what a module terminal shows: its relight is refused, because the terminal keeps a "
     "power state of its own. What was lit stays lit until it changes."},
    {"module-without-5g", ON_MODULE, HEALS,
     [](const breach &what) { return is_of(what, MODULE_NET) && nv_is("nv/network_type", "SA"); },
     "On a 5G network a module terminal asks for no net LED at all, so it goes on showing whatever was lit before."},
    {"module-remembers-its-net", ON_MODULE, HEALS,
     [](const breach &what) { return is_of(what, {LED_NET_14, LED_NET_16}) && what.due == 0; },
     "net_14 and net_16 of a module terminal stay lit when it is switched off and on, so it shows networks of its "
     "past beside the present one."},
    {"module-more-bars-than-five", ON_MODULE, HEALS,
     [](const breach &what) { return is_of(what, MODULE_BARS) && nv_is("nv/signalbar", "9"); },
     "The network service writes more bars than there are. The signal LED of a module terminal keeps what it showed."},
    {"module-dark-after-a-call", ON_MODULE, HEALS,
     [](const breach &what) { return what.led == LED_VOICE_GREEN && what.shown == 0; },
     "After a call the signal LED of a module terminal stays dark until the bars change: the phone LED is of the "
     "same group and switches it off, and nothing lights it again."},
    {"single-chip-two-signal-leds", ON_UNI_CORE, COLOURS,
     [](const breach &what) { return is_of(what, {LED_SIG_6, LED_SIG_BLUE}); },
     "A single-chip terminal that has been woken lights a second signal LED: the scene of waking up sets sig_6, "
     "which everything else leaves alone."},
    {"single-chip-sig-6-stays", ON_UNI_CORE, OFF | SLEEP | NIGHTS | HEALS,
     [](const breach &what) { return what.led == LED_SIG_6; },
     "Once woken, a single-chip terminal keeps sig_6 lit: off, asleep and at night nothing puts it out."},
    {"single-chip-level-in-the-dark", ON_UNI_CORE, OFF | SLEEP,
     [](const breach &what) { return is_excused(LEVEL_SHOWN_AGAIN) && what.led == LED_SIG_BLUE; },
     "When the temperature alarm ends, or its setting is read again, a single-chip terminal shows its signal level, "
     "also while it is off or asleep."},
    {"single-chip-keeps-reset-white", ON_UNI_CORE, NIGHTS | HEALS,
     [](const breach &what) { return is_excused(SWITCHED_ON_LIT) && is_of_the_reset_scene(what); },
     "Switched on after a factory reset, a single-chip terminal keeps the white net LED and the signal LED of the "
     "reset scene, also at night, as long as network and bars are the ones that it remembers."},
    {"single-chip-bright-at-night", ON_UNI_CORE, NIGHTS | HEALS,
     [](const breach &what) { return may_be_night() && is_excused(SWITCHED_ON_LIT) && is_net_or_signal(what); },
     "Lit while off, the net or signal LED of a single-chip terminal is bright when the terminal is switched on at "
     "night: network and bars are the ones that it remembers, so nothing dims them."},
    {"single-chip-dark-after-off-and-on", ON_UNI_CORE, HEALS,
     [](const breach &what) { return is_net_or_signal(what) && what.shown == 0 && !what.restarted; },
     "Switched off and on again, a single-chip terminal shows neither network nor signal: both are the ones that it "
     "remembers, so it takes them for shown."},
    {"refused-request-remembered", ON_DATA_CARD | ON_UNI_CORE, bit(FAILURES_HEAL),
     [](const breach &what) {
         return (is_excused(NET_REFUSED) && is_net(what)) || (is_excused(SIG_6_REFUSED) && what.led == LED_SIG_6) ||
                (is_excused(SIG_BLUE_REFUSED) && what.led == LED_SIG_BLUE);
     },
     "The board refuses a request for the signal or net LED. The daemon takes it for shown all the same, and so does "
     "what it does at the next start or power-on: the LED stays wrong until something else changes."},
    {"starts-without-bars", ON_DATA_CARD | ON_UNI_CORE, HEALS,
     [](const breach &what) { return is_kept_without_bars(what); },
     "A killed daemon leaves the signal LED lit. When no bars are left, the next one starts with that level, takes it "
     "for shown and leaves the LED as it is."},
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
