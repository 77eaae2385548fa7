#include "alphabet.h"

#include "ground/led_ctx.h"
#include "kiv/adabsp.h"
#include "kiv/reg.h"

// What the device's services make of what happens, whatever the daemon makes of it; and what excuses the daemon.
namespace
{
bool is_off()
{
    return world.power != POWER_ON && world.power != POWER_NOT_YET;
}

bool is_message_timed()
{
    for (size_t kind = 0; kind < known_timers().size(); kind++) {
        if (known_timers()[kind].purpose == timer_purpose::NEW_MESSAGE) {
            return running_of(kind) > 0;
        }
    }
    return false;
}

bool is_net_lit()
{
    return (world.leds[LED_NET_RED] | world.leds[LED_NET_BLUE] | world.leds[LED_NET_WHITE]) != 0;
}

bool is_to_be_dark()
{
    return is_off() || world.asleep != 0;
}

// What a product's oddities need; more would only multiply its states.
unsigned excuses_of(unsigned product)
{
    switch (product) {
    case UFI:
        return NET_SHOWN_WHILE_OFF | SWITCHED_ON_ASLEEP | RELIT_ASLEEP | MESSAGE_TIMER_LEFT | SETTINGS_UNREAD |
               CONFIGURATION_UNREAD | NIGHT_UNTOLD | SELF_TESTED | SLEEP_VALUE_UNKNOWN;
    case DATA_CARD:
        return NET_CHANGED_ASLEEP | NET_REFUSED | SIG_6_REFUSED | SIG_BLUE_REFUSED;
    case PAPER_KITE:
        return NET_CHANGED_ASLEEP;
    case MODULE:
        return SETTINGS_UNREAD | CONFIGURATION_UNREAD | LIT_AS_ANOTHER;
    default:
        return NET_SHOWN_WHILE_OFF | SWITCHED_ON_ASLEEP | RELIT_ASLEEP | SETTINGS_UNREAD | CONFIGURATION_UNREAD |
               NIGHT_UNTOLD | SWITCHED_ON_LIT | LEVEL_SHOWN_AGAIN | NET_REFUSED | SIG_6_REFUSED | SIG_BLUE_REFUSED;
    }
}

// The settings of the night and of the temperature are about to be read.
void read_settings()
{
    excuse_by((world.refused & (REFUSED_NV_READS | REFUSED_TIMERS)) != 0 ? SETTINGS_UNREAD : 0);
}

void drop_unless(bool lasts, excuse what)
{
    drop_excuse(lasts ? 0U : unsigned{what});
}

// An excuse lasts as long as what it explains.
void settle_excuses(unsigned product)
{
    const bool is_signal_lit = is_lit(world.leds[LED_SIG_BLUE]);
    drop_unless(is_net_lit(), NET_SHOWN_WHILE_OFF);
    drop_unless(is_net_lit() || is_signal_lit, SWITCHED_ON_LIT);
    drop_unless(is_message_timed(), MESSAGE_TIMER_LEFT);
    drop_unless(is_signal_lit, LEVEL_SHOWN_AGAIN);
    drop_unless(look_at(world.leds[LED_BAT_RED]) == led_look{led_mode::ON, 4, 0, 0}, SELF_TESTED);
    excuse_by(is_excused(CONFIGURATION_UNREAD) ? LIT_AS_ANOTHER : 0);
    drop_unless(is_signal_lit || is_lit(world.leds[LED_SIG_6]), LIT_AS_ANOTHER);
    drop_excuse(happened.accepted);
    excuse_by(happened.refused);
    happened.accepted = 0;
    happened.refused = 0;
    world.excused = static_cast<uint16_t>(world.excused & excuses_of(product));
}

// What main control makes of the power, from what it tells the daemon.
void hear_power(unsigned product, uint32_t event)
{
    const bool resetting = world.power == POWER_RESETTING;
    if (event == REG_MC_CHARGIN_STATUS || event == REG_MC_BATTERY_VALUE) {
        return;
    }
    world.restarting = product == MODULE && event == REG_MC_EVENT_RESTARTING ? 1 : 0;
    switch (event) {
    case REG_MC_EVENT_POWERON:
        if (product == UNI_CORE && (is_net_lit() || world.leds[LED_SIG_BLUE] != 0)) {
            excuse_by(SWITCHED_ON_LIT);
        }
        world.power = POWER_ON;
        excuse_by(world.asleep != 0 ? SWITCHED_ON_ASLEEP : 0);
        excuse_by(is_message_timed() ? MESSAGE_TIMER_LEFT : 0);
        break;
    case REG_MC_EVENT_SHUTTING_DOWN:
        world.power = resetting ? POWER_RESETTING : POWER_OFF;
        break;
    case REG_MC_EVENT_POWER_OFF_UNREADL:
        world.power = product == UNI_CORE ? (resetting ? POWER_RESETTING : POWER_OFF) : POWER_OFF_UNREAL;
        break;
    case REG_MC_EVENT_POWER_OFF_CHARGE:
        world.power = product == UNI_CORE ? world.power : uint8_t{POWER_OFF_CHARGE};
        break;
    case REG_MC_EVENT_RESETTING:
        world.power = POWER_RESETTING;
        break;
    case REG_MC_EVENT_POWER_OFF_QUICKEN:
    case REG_MC_EVENT_POWER_OFF_QUICKEN_ACK:
        world.power = POWER_OFF_QUICKEN;
        break;
    case REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN:
        world.power = POWER_OFF_CHARGE_QUICKEN;
        break;
    case REG_MC_EVENT_INITAL:
        excuse_by(SELF_TESTED);
        break;
    default:
        break;
    }
}

void hear_sleep(unsigned product, int value)
{
    world.asleep = value == (product == UNI_CORE ? 5 : 1) ? 1 : 0;
    drop_excuse(SWITCHED_ON_ASLEEP | RELIT_ASLEEP | SLEEP_VALUE_UNKNOWN);
    excuse_by(product == UFI && value == 5 ? SLEEP_VALUE_UNKNOWN : 0);
    if (product == UNI_CORE && world.asleep == 0 && is_off()) {
        excuse_by(NET_SHOWN_WHILE_OFF);
    }
    if (product == UFI && world.asleep == 0 && world.power == POWER_ON && is_message_timed()) {
        excuse_by(MESSAGE_TIMER_LEFT); // woken while awake, it shows the message anew
    }
}

void set_text(const action &one)
{
    static const uint8_t close_all = key_number("nv/night_mode_close_all_led");
    if (one.key == close_all && world.texts[one.key] != one.value) {
        excuse_by(is_off() ? NET_SHOWN_WHILE_OFF : 0);
        excuse_by(world.asleep != 0 ? RELIT_ASLEEP : 0);
    }
    world.texts[one.key] = one.value;
}

bool is_net_type(const action &one)
{
    return one.module == KIV_MODULE_NWINFO && one.event == REG_NWINFO_NETTYPE;
}

void hear(unsigned product, const action &one)
{
    if (one.message.message.us_cmd == KIV_MSG_CMD_LED_RELIGHT_MSG) {
        excuse_by(world.asleep != 0 ? RELIT_ASLEEP : 0);
    } else if (one.module == 0) {
        read_settings();
        excuse_by(is_to_be_dark() ? LEVEL_SHOWN_AGAIN : 0);
    } else if (one.module == KIV_MODULE_MAIN) {
        hear_power(product, one.event);
    } else if (one.module == KIV_MODULE_SLEEP) {
        hear_sleep(product, static_cast<int>(one.number));
    } else if (one.module == KIV_MODULE_SMS && (world.power != POWER_ON || world.asleep != 0) && is_message_timed()) {
        excuse_by(MESSAGE_TIMER_LEFT);
    } else if (is_net_type(one) || one.module == KIV_MODULE_PPP) {
        excuse_by(world.asleep != 0 ? NET_CHANGED_ASLEEP : 0);
        const std::string *state = text_of("nv/q6_ppp_status");
        world.call_up = state != nullptr && *state == "q6_ppp_connected" ? 1 : 0;
    }
}

void start(unsigned product)
{
    kill_daemon();
    read_settings();
    excuse_by((world.refused & REFUSED_CONFIGURATION) != 0 ? CONFIGURATION_UNREAD : 0);
    world.power = product == DATA_CARD || product == PAPER_KITE ? POWER_ON : POWER_NOT_YET;
    start_daemon();
}

void act_on(const action &one, unsigned product)
{
    constexpr int64_t SECONDS_AN_HOUR = 3600;
    switch (one.what) {
    case verb::WRITE:
        set_text(one);
        break;
    case verb::SEND:
        hear(product, one);
        deliver(one.message);
        if (world.asleep == 0 && is_net_type(one) && is_net_lit()) {
            drop_excuse(NET_CHANGED_ASLEEP); // it has been read again
        }
        break;
    case verb::INDICATE:
        indicate(static_cast<int>(one.number));
        break;
    case verb::START:
        start(product);
        break;
    case verb::KILL:
        kill_daemon();
        break;
    case verb::TIME_OF_DAY:
        world.hour = static_cast<uint8_t>(one.number / SECONDS_AN_HOUR);
        break;
    case verb::FAIL:
        world.refused = static_cast<uint8_t>(world.refused | one.value);
        break;
    case verb::REPAIR:
        world.refused = 0;
        break;
    default: // time passes only where a history is played by the clock
        break;
    }
}
} // namespace

bool apply(const stimulus &what, unsigned product)
{
    if (what.fires) {
        if (!fire_timer_of(*what.fires)) {
            return false;
        }
        excuse_by(*what.fires == timer_purpose::TEMPERATURE && is_to_be_dark() ? LEVEL_SHOWN_AGAIN : 0);
        settle_excuses(product);
        return true;
    }
    for (const action &one : what.actions) {
        act_on(one, product);
    }
    settle_excuses(product);
    return true;
}
