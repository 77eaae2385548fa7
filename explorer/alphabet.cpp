#include "alphabet.h"

#include "ground/led_ctx.h"
#include "kiv/adabsp.h"
#include "kiv/reg.h"
#include "language/words.h"

#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace
{
// Products as bits.
constexpr unsigned ON_UFI = 1U << UFI;
constexpr unsigned ON_DATA_CARD = 1U << DATA_CARD;
constexpr unsigned ON_PAPER_KITE = 1U << PAPER_KITE;
constexpr unsigned ON_MODULE = 1U << MODULE;
constexpr unsigned ON_UNI_CORE = 1U << UNI_CORE;
constexpr unsigned ON_POWERED = ON_UFI | ON_MODULE | ON_UNI_CORE;
constexpr unsigned ON_REMINDED = ON_UFI | ON_PAPER_KITE | ON_UNI_CORE;
constexpr unsigned ON_EVERY = (1U << PRODUCTS) - 1;

struct family_row {
    family of;
    unsigned products;
    std::string_view name;
};

constexpr std::array family_rows = {
    family_row{POWER,    ON_EVERY,                               "power"   },
    family_row{BATTERY,  ON_UFI | ON_MODULE,                     "battery" },
    family_row{NETWORK,  ON_EVERY,                               "network" },
    family_row{SIGNAL,   ON_DATA_CARD | ON_MODULE | ON_UNI_CORE, "signal"  },
    family_row{WIFI,     ON_UFI | ON_PAPER_KITE | ON_UNI_CORE,   "wifi"    },
    family_row{MESSAGES, ON_UFI,                                 "messages"},
    family_row{CALLS,    ON_MODULE | ON_UNI_CORE,                "calls"   },
    family_row{NIGHT,    ON_EVERY,                               "night"   },
    family_row{FAULTS,   ON_EVERY,                               "faults"  },
};

struct stimulus_row {
    unsigned products;
    family of;
    std::string_view text;
};

// A value comes with the notification of it. One row for each class of values that the daemon tells apart.
// clang-format off
constexpr std::array stimulus_rows = {
    stimulus_row{ON_POWERED, POWER, "notify MAIN POWERON"},
    stimulus_row{ON_POWERED, POWER, "notify MAIN SHUTTING_DOWN"},
    stimulus_row{ON_POWERED, POWER, "notify MAIN RESTARTING"},
    stimulus_row{ON_POWERED, POWER, "notify MAIN POWER_OFF_UNREADL"},
    stimulus_row{ON_POWERED, POWER, "notify MAIN POWER_OFF_CHARGE"},
    stimulus_row{ON_UFI | ON_UNI_CORE, POWER, "notify MAIN RESETTING"},
    stimulus_row{ON_UFI, POWER, "notify MAIN INITAL\nafter 1s"},
    stimulus_row{ON_UFI, POWER, "notify MAIN POWER_OFF_QUICKEN"},
    stimulus_row{ON_UFI, POWER, "notify MAIN POWER_OFF_QUICKEN_ACK"},
    stimulus_row{ON_UFI, POWER, "notify MAIN POWER_OFF_CHARGE_QUICKEN"},
    stimulus_row{ON_EVERY & ~ON_UNI_CORE, POWER, "notify SLEEP 1"},
    stimulus_row{ON_UFI | ON_UNI_CORE, POWER, "notify SLEEP 5"}, // asleep on the single-chip, awake on the handheld
    stimulus_row{ON_EVERY, POWER, "notify SLEEP 0"},
    stimulus_row{ON_EVERY, POWER, "clock 23:00"},
    stimulus_row{ON_EVERY, POWER, "clock 12:00"},
    stimulus_row{ON_EVERY, POWER, "sensor 0 75"},
    stimulus_row{ON_EVERY, POWER, "sensor 0 25"},
    stimulus_row{ON_EVERY, POWER, "command RELIGHT"},
    stimulus_row{ON_EVERY, POWER, "kill\nstart"},

    stimulus_row{ON_UFI | ON_MODULE, BATTERY, "nv battery_value=80\nnotify MAIN BATTERY_VALUE"},
    stimulus_row{ON_UFI, BATTERY, "nv battery_value=20\nnotify MAIN BATTERY_VALUE"},
    stimulus_row{ON_MODULE, BATTERY, "nv battery_value=40\nnotify MAIN BATTERY_VALUE"},
    stimulus_row{ON_UFI | ON_MODULE, BATTERY, "nv battery_value=10\nnotify MAIN BATTERY_VALUE"},
    stimulus_row{ON_UFI | ON_MODULE, BATTERY, "nv battery_charging=0\nnotify MAIN CHARGIN_STATUS"},
    stimulus_row{ON_UFI | ON_MODULE, BATTERY, "nv battery_charging=1\nnotify MAIN CHARGIN_STATUS"},
    stimulus_row{ON_UFI, BATTERY, "nv battery_charging=2\nnotify MAIN CHARGIN_STATUS"},
    stimulus_row{ON_UFI | ON_MODULE, BATTERY, "nv battery_charging=3\nnotify MAIN CHARGIN_STATUS"},
    stimulus_row{ON_UFI, BATTERY, "nv battery_charging=4\nnotify MAIN CHARGIN_STATUS"},
    stimulus_row{ON_UFI, BATTERY, "nv battery_exist=0\nnotify MAIN BATTERY_VALUE"},
    stimulus_row{ON_UFI, BATTERY, "nv battery_exist=1\nnotify MAIN BATTERY_VALUE"},
    stimulus_row{ON_MODULE, BATTERY, "battery 1\nindication 1350"},
    stimulus_row{ON_MODULE, BATTERY, "battery 0\nindication 1351"},
    stimulus_row{ON_MODULE, BATTERY, "charger 1\nindication 1356"},
    stimulus_row{ON_MODULE, BATTERY, "charger 0\nindication 1357"},

    stimulus_row{ON_EVERY, NETWORK, "nv network_type=NO_SERVICE\nnotify NWINFO NETTYPE"},
    stimulus_row{ON_EVERY, NETWORK, "nv network_type=EDGE\nnotify NWINFO NETTYPE"},
    stimulus_row{ON_EVERY, NETWORK, "nv network_type=LTE\nnotify NWINFO NETTYPE"},
    stimulus_row{ON_EVERY, NETWORK, "nv network_type=SA\nnotify NWINFO NETTYPE"},
    stimulus_row{ON_MODULE, NETWORK, "nv simcard_roam=Home\nnotify NWINFO ROAMING_STATUS"},
    stimulus_row{ON_MODULE, NETWORK, "nv simcard_roam=Roaming\nnotify NWINFO ROAMING_STATUS"},
    stimulus_row{ON_EVERY, NETWORK, "nv q6_ppp_status=q6_ppp_connected\nnotify PPP PPP_STATUS 1"},
    stimulus_row{ON_EVERY, NETWORK, "nv q6_ppp_status=idle\nnotify PPP PPP_STATUS 0"},
    stimulus_row{ON_EVERY, NETWORK, "nv q6_ppp_status=q6_ppp_connected\nnotify PPP Q6_PPP_STATUS"},
    stimulus_row{ON_EVERY, NETWORK, "nv q6_ppp_status=idle\nnotify PPP Q6_PPP_STATUS"},
    stimulus_row{ON_REMINDED, NETWORK, "nv monthly_tx_bytes=4294967296"},
    stimulus_row{ON_REMINDED, NETWORK, "nv monthly_tx_bytes=0"},
    stimulus_row{ON_REMINDED, NETWORK, "nv data_volume_limit_switch=0"},
    stimulus_row{ON_REMINDED, NETWORK, "nv data_volume_limit_switch=1"},

    stimulus_row{ON_DATA_CARD | ON_MODULE | ON_UNI_CORE, SIGNAL, "nv signalbar=0\nnotify NWINFO SIG_BAR"},
    stimulus_row{ON_DATA_CARD | ON_UNI_CORE, SIGNAL, "nv signalbar=1\nnotify NWINFO SIG_BAR"},
    stimulus_row{ON_UNI_CORE, SIGNAL, "nv signalbar=2\nnotify NWINFO SIG_BAR"},
    stimulus_row{ON_DATA_CARD | ON_MODULE | ON_UNI_CORE, SIGNAL, "nv signalbar=4\nnotify NWINFO SIG_BAR"},
    stimulus_row{ON_DATA_CARD | ON_MODULE, SIGNAL, "nv signalbar=9\nnotify NWINFO SIG_BAR"},
    stimulus_row{ON_EVERY, SIGNAL, "nv thermal_led_enable=60\ncommand OVER_TEMP"},
    stimulus_row{ON_EVERY, SIGNAL, "nv thermal_led_enable=0\ncommand OVER_TEMP"},

    stimulus_row{ON_UFI | ON_PAPER_KITE | ON_UNI_CORE, WIFI, "nv wifi_onoff_state=1 RadioOff=1\nnotify WLAN CURRENT_STATUS 1"},
    stimulus_row{ON_UFI | ON_PAPER_KITE | ON_UNI_CORE, WIFI, "nv wifi_onoff_state=0 RadioOff=0\nnotify WLAN CURRENT_STATUS 0"},
    stimulus_row{ON_UFI | ON_PAPER_KITE | ON_UNI_CORE, WIFI, "notify WLAN CURRENT_STATUS 2"},
    stimulus_row{ON_PAPER_KITE | ON_UNI_CORE, WIFI, "nv wifi_chip1_wps_state=1\nnotify WLAN AP_WPS_STATE 1"},
    stimulus_row{ON_PAPER_KITE | ON_UNI_CORE, WIFI, "nv wifi_chip1_wps_state=0\nnotify WLAN AP_WPS_STATE 0"},
    stimulus_row{ON_PAPER_KITE | ON_UNI_CORE, WIFI, "nv wifi_chip2_wps_state=1\nnotify WLAN AP_WPS_STATE_CHIP2 1"},
    stimulus_row{ON_PAPER_KITE | ON_UNI_CORE, WIFI, "nv wifi_chip2_wps_state=0\nnotify WLAN AP_WPS_STATE_CHIP2 0"},

    stimulus_row{ON_UFI, MESSAGES, "nv sms_nvunread_count=1\nnotify SMS NEW_SMS"},
    stimulus_row{ON_UFI, MESSAGES, "nv sms_nvunread_count=1\nnotify SMS NV_UNREAD_SMS"},
    stimulus_row{ON_UFI, MESSAGES, "nv sms_nvunread_count=0\nnotify SMS NV_UNREAD_SMS"},
    stimulus_row{ON_UFI, MESSAGES, "nv sms_nvtotal_count=100\nnotify SMS MEMORY_FULL"},
    stimulus_row{ON_UFI, MESSAGES, "nv sms_nvtotal_count=1"},
    stimulus_row{ON_UFI, MESSAGES, "notify MDM SIM_STATUS"},

    stimulus_row{ON_MODULE | ON_UNI_CORE, CALLS, "notify VOICE \"PHONE LED ON\""},
    stimulus_row{ON_MODULE | ON_UNI_CORE, CALLS, "notify VOICE \"PHONE BLINK\""},
    stimulus_row{ON_MODULE | ON_UNI_CORE, CALLS, "notify VOICE \"PHONE LED OFF\""},
    stimulus_row{ON_MODULE, CALLS, "notify SMS VOCEMAIL_SET_FLAG 1"},
    stimulus_row{ON_MODULE, CALLS, "notify SMS VOCEMAIL_SET_FLAG 0"},

    stimulus_row{ON_EVERY, NIGHT, "nv night_mode_switch=0\ncommand NIGHT_MODE"},
    stimulus_row{ON_EVERY, NIGHT, "nv night_mode_switch=1\ncommand NIGHT_MODE"},
    stimulus_row{ON_EVERY, NIGHT, "nv night_mode_switch=2\ncommand NIGHT_MODE"},
    stimulus_row{ON_EVERY, NIGHT, "nv night_mode_close_all_led=0\ncommand NIGHT_MODE"},
    stimulus_row{ON_EVERY, NIGHT, "nv night_mode_close_all_led=1\ncommand NIGHT_MODE"},
    stimulus_row{ON_EVERY, NIGHT, "nv syn_done=0"},
    stimulus_row{ON_EVERY, NIGHT, "nv syn_done=1"},

    stimulus_row{ON_EVERY, FAULTS, "fail kiv_bsp_set_leds_sync * -1"},
    stimulus_row{ON_EVERY, FAULTS, "fail kiv_timer * 0"},
    stimulus_row{ON_EVERY, FAULTS, "fail kiv_nvconfig_read * -1"},
    stimulus_row{ON_MODULE, FAULTS, "fail kiv_bsp_get_battery_online_status_sync * -1"},
    stimulus_row{ON_EVERY, FAULTS, "repair all"},
};

constexpr std::string_view DEVICE_AT_REST =
    "nv network_type=LTE signalbar=4 simcard_roam=Home wifi_onoff_state=1 RadioOff=1\n"
    "nv battery_exist=1 battery_charging=0 battery_value=80 sms_nvunread_count=0 sms_nv_capability=100\n"
    "nv sms_nvtotal_count=1 night_mode_switch=1 night_mode_start_time=22:00 night_mode_end_time=06:00 syn_done=1\n"
    "nv night_mode_close_all_led=0 thermal_led_enable=60 data_volume_limit_switch=1 data_volume_limit_unit=data\n"
    "nv data_volume_limit_size=4_1024 data_volume_alert_percent=75 monthly_tx_bytes=0 q6_ppp_status=idle\n"
    "nv wifi_chip1_wps_state=0 wifi_chip2_wps_state=0\n"
    "battery 1\n"
    "charger 0\n"
    "sensor 0 25\n"
    "clock 12:00\n";
// clang-format on

[[noreturn]] void give_up(const std::string &why)
{
    fprintf(stderr, "kiv_led_explore: %s\n", why.c_str());
    abort();
}

uint8_t refused_bit(std::string_view call)
{
    if (call == "kiv_bsp_set_leds_sync") {
        return REFUSED_LEDS;
    }
    if (call == "kiv_timer") {
        return REFUSED_TIMERS;
    }
    if (call == "kiv_nvconfig_read") {
        return REFUSED_NV_READS;
    }
    if (call == "kiv_bsp_get_battery_online_status_sync") {
        return REFUSED_BATTERY;
    }
    give_up("the world cannot refuse " + std::string(call));
}

void add_texts(const statement &from, std::vector<action> &to)
{
    for (const file_write &file : from.files) {
        action &one = to.emplace_back();
        one.what = act::TEXT;
        one.key = key_number(file.path);
        one.value = text_number(one.key, file.text);
    }
}

action tell(const std::string &bytes)
{
    action one = {.what = act::TELL, .message = received_of(bytes)};
    const svc_msg &message = one.message.message;
    one.module = message.us_cmd == MSG_CMD_SERVICE_NOTIFY ? message.us_source_module_id : uint16_t{0};
    one.event = message.ul_event_mask;
    one.payload = atoi(message.p_data);
    return one;
}

void add_actions(const statement &from, std::vector<action> &to)
{
    switch (from.what) {
    case verb::WRITE:
        add_texts(from, to);
        return;
    case verb::SEND:
        to.push_back(tell(from.bytes));
        return;
    case verb::INDICATE:
        to.push_back({.what = act::INDICATE, .event_id = atoi(from.bytes.c_str())});
        return;
    case verb::START:
        to.push_back({.what = act::START});
        return;
    case verb::KILL:
        to.push_back({.what = act::KILL});
        return;
    case verb::TIME_OF_DAY:
        to.push_back({.what = act::CLOCK, .value = static_cast<uint8_t>(from.number / 3600)});
        return;
    case verb::FAIL:
        to.push_back({.what = act::REFUSE, .value = refused_bit(from.key)});
        return;
    case verb::REPAIR:
        to.push_back({.what = act::REPAIR});
        return;
    case verb::AFTER:
        to.push_back({.what = act::PASS, .ms = from.number / NS_PER_MS});
        return;
    default:
        give_up("the world does not know '" + from.text + "'");
    }
}

bool is_indication(const action &one)
{
    if (one.what != act::TELL || one.module == 0 || one.module == KIV_MODULE_SLEEP) {
        return false;
    }
    return one.module != KIV_MODULE_MAIN || one.event == REG_MC_CHARGIN_STATUS || one.event == REG_MC_BATTERY_VALUE;
}

void add_timers(unsigned product, unsigned families, std::vector<stimulus> &to)
{
    std::vector<timer_purpose> purposes = {timer_purpose::NIGHT, timer_purpose::TEMPERATURE};
    if ((families & NETWORK) != 0 && (ON_REMINDED >> product & 1) != 0) {
        purposes.push_back(timer_purpose::LIMIT_CHECK);
        purposes.push_back(timer_purpose::REMINDER);
    }
    if ((families & MESSAGES) != 0) {
        purposes.push_back(timer_purpose::NEW_MESSAGE);
    }
    for (const timer_purpose purpose : purposes) {
        to.emplace_back().fires = purpose;
    }
}

void excuse_by(uint8_t what)
{
    world.excused = static_cast<uint8_t>(world.excused | what);
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

// An excuse lasts as long as what it explains.
void drop_excuses()
{
    if (world.leds[LED_NET_RED] == 0 && world.leds[LED_NET_BLUE] == 0 && world.leds[LED_NET_WHITE] == 0) {
        world.excused = static_cast<uint8_t>(world.excused & ~NET_SHOWN_WHILE_OFF);
    }
    if (!is_message_timed()) {
        world.excused = static_cast<uint8_t>(world.excused & ~MESSAGE_TIMER_LEFT);
    }
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
    default:
        break;
    }
}

bool is_off()
{
    return world.power != POWER_ON && world.power != POWER_NOT_YET;
}

void hear_sleep(unsigned product, int value)
{
    world.asleep = value == (product == UNI_CORE ? 5 : 1) ? 1 : 0;
    world.excused = static_cast<uint8_t>(world.excused & ~(SWITCHED_ON_ASLEEP | RELIT_ASLEEP));
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

void hear(unsigned product, const action &one)
{
    if (one.message.message.us_cmd == KIV_MSG_CMD_LED_RELIGHT_MSG && world.asleep != 0) {
        excuse_by(RELIT_ASLEEP);
    } else if (one.module == KIV_MODULE_MAIN) {
        hear_power(product, one.event);
    } else if (one.module == KIV_MODULE_SLEEP) {
        hear_sleep(product, one.payload);
    } else if (one.module == KIV_MODULE_SMS && (world.power != POWER_ON || world.asleep != 0) && is_message_timed()) {
        excuse_by(MESSAGE_TIMER_LEFT);
    } else if (one.module == KIV_MODULE_PPP) {
        const std::string *state = text_of("nv/q6_ppp_status");
        world.call_up = state != nullptr && *state == "q6_ppp_connected" ? 1 : 0;
    }
}

void start(unsigned product)
{
    world.power = product == DATA_CARD || product == PAPER_KITE ? POWER_ON : POWER_NOT_YET;
    world.asleep = 0;
    world.call_up = 0;
    world.restarting = 0;
    world.excused = 0;
    start_daemon();
}

void act_on(const action &one, unsigned product)
{
    switch (one.what) {
    case act::TEXT:
        set_text(one);
        return;
    case act::TELL:
        hear(product, one);
        deliver(one.message);
        drop_excuses();
        return;
    case act::INDICATE:
        indicate(one.event_id);
        return;
    case act::START:
        start(product);
        return;
    case act::KILL:
        kill_daemon();
        return;
    case act::CLOCK:
        world.hour = one.value;
        return;
    case act::REFUSE:
        world.refused = static_cast<uint8_t>(world.refused | one.value);
        return;
    case act::REPAIR:
        world.refused = 0;
        return;
    case act::PASS: // only where a history is played by the clock
        return;
    }
}

bool no_include(const std::string &, std::string &)
{
    return false;
}
} // namespace

std::string family_names(unsigned families)
{
    std::string names;
    for (const family_row &row : family_rows) {
        if (row.of != POWER && (families & row.of) != 0) {
            names += (names.empty() ? "" : " and ") + std::string(row.name);
        }
    }
    return names.empty() ? "power" : names;
}

unsigned families_of(unsigned product)
{
    unsigned families = 0;
    for (const family_row &row : family_rows) {
        families |= (row.products >> product & 1) != 0 ? row.of : 0U;
    }
    return families;
}

stimulus stimulus_of(const std::string &text)
{
    stimulus what = {.text = text, .actions = {}, .fires = {}};
    scenario story;
    std::string error;
    if (!parse_scenario(text, "stimulus", no_include, story, error)) {
        give_up(error);
    }
    for (const statement &one : story.statements) {
        add_actions(one, what.actions);
    }
    what.indication = !what.actions.empty() && is_indication(what.actions.back());
    return what;
}

std::vector<stimulus> alphabet_of(unsigned product, unsigned families)
{
    std::vector<stimulus> alphabet;
    for (const stimulus_row &row : stimulus_rows) {
        if ((row.products >> product & 1) != 0 && ((families | POWER) & row.of) != 0) {
            alphabet.push_back(stimulus_of(std::string(row.text)));
        }
    }
    add_timers(product, families, alphabet);
    return alphabet;
}

std::string furniture(unsigned product)
{
    return "product " + std::string(all_products()[product].name) + "\n" + std::string(DEVICE_AT_REST);
}

void furnish(unsigned product)
{
    open_world();
    apply(stimulus_of(furniture(product)), product);
}

bool apply(const stimulus &what, unsigned product)
{
    if (what.fires) {
        return fire_timer_of(*what.fires);
    }
    for (const action &one : what.actions) {
        act_on(one, product);
    }
    return true;
}
