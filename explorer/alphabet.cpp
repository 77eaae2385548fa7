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
constexpr unsigned ON_POWERED = ON_UFI | ON_MODULE | ON_UNI_CORE;
constexpr unsigned ON_WIFI = ON_UFI | ON_PAPER_KITE | ON_UNI_CORE;
constexpr unsigned ON_REMINDED = ON_WIFI;

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
    family_row{WIFI,     ON_WIFI,                                "wifi"    },
    family_row{MESSAGES, ON_UFI,                                 "messages"},
    family_row{CALLS,    ON_MODULE | ON_UNI_CORE,                "calls"   },
    family_row{NIGHT,    ON_EVERY,                               "night"   },
    family_row{FAULTS,   ON_EVERY,                               "faults"  },
    family_row{REFUSALS, ON_EVERY,                               "refusals"},
};

struct stimulus_row {
    unsigned products;
    family of;
    std::string_view text;
};

// A value comes with the notification of it. One row for each class of values that the daemon tells apart; {a|b} stands
// for one row with a and one with b, in all braces of the row alike.
// clang-format off
constexpr stimulus_row stimulus_rows[] = {
    {ON_POWERED, POWER, "notify MAIN {POWERON|SHUTTING_DOWN|RESTARTING|POWER_OFF_UNREADL|POWER_OFF_CHARGE}"},
    {ON_UFI | ON_UNI_CORE, POWER, "notify MAIN RESETTING"},
    {ON_UFI, POWER, "notify MAIN INITAL\nafter 1s"},
    {ON_UFI, POWER, "notify MAIN {POWER_OFF_QUICKEN|POWER_OFF_QUICKEN_ACK|POWER_OFF_CHARGE_QUICKEN}"},
    {ON_EVERY & ~ON_UNI_CORE, POWER, "notify SLEEP 1"},
    {ON_UFI | ON_UNI_CORE, POWER, "notify SLEEP 5"}, // asleep on the single-chip, awake on the handheld
    {ON_EVERY, POWER, "notify SLEEP 0"},
    {ON_EVERY, POWER, "clock {23:00|12:00}"},
    {ON_EVERY, POWER, "sensor 0 {75|25}"},
    {ON_EVERY, POWER, "command RELIGHT"},
    {ON_EVERY, POWER, "kill\nstart"},

    {ON_UFI | ON_MODULE, BATTERY, "nv battery_value=80\nnotify MAIN BATTERY_VALUE"},
    {ON_UFI, BATTERY, "nv battery_value=20\nnotify MAIN BATTERY_VALUE"},
    {ON_MODULE, BATTERY, "nv battery_value=40\nnotify MAIN BATTERY_VALUE"},
    {ON_UFI | ON_MODULE, BATTERY, "nv battery_value=10\nnotify MAIN BATTERY_VALUE"},
    {ON_UFI | ON_MODULE, BATTERY, "nv battery_charging={0|1}\nnotify MAIN CHARGIN_STATUS"},
    {ON_UFI, BATTERY, "nv battery_charging=2\nnotify MAIN CHARGIN_STATUS"},
    {ON_UFI | ON_MODULE, BATTERY, "nv battery_charging=3\nnotify MAIN CHARGIN_STATUS"},
    {ON_UFI, BATTERY, "nv battery_charging=4\nnotify MAIN CHARGIN_STATUS"},
    {ON_UFI, BATTERY, "nv battery_exist={0|1}\nnotify MAIN BATTERY_VALUE"},
    {ON_MODULE, BATTERY, "battery {1|0}\nindication {1350|1351}"},
    {ON_MODULE, BATTERY, "charger {1|0}\nindication {1356|1357}"},

    {ON_EVERY, NETWORK, "nv network_type={NO_SERVICE|EDGE|LTE|SA}\nnotify NWINFO NETTYPE"},
    {ON_MODULE, NETWORK, "nv simcard_roam={Home|Roaming}\nnotify NWINFO ROAMING_STATUS"},
    {ON_EVERY, NETWORK, "nv q6_ppp_status={q6_ppp_connected|idle}\nnotify PPP PPP_STATUS {1|0}"},
    {ON_EVERY, NETWORK, "nv q6_ppp_status={q6_ppp_connected|idle}\nnotify PPP Q6_PPP_STATUS"},
    {ON_REMINDED, NETWORK, "nv monthly_tx_bytes={4294967296|0}"},
    {ON_REMINDED, NETWORK, "nv data_volume_limit_switch={0|1}"},

    {ON_DATA_CARD | ON_MODULE | ON_UNI_CORE, SIGNAL, "nv signalbar=0\nnotify NWINFO SIG_BAR"},
    {ON_DATA_CARD | ON_UNI_CORE, SIGNAL, "nv signalbar=1\nnotify NWINFO SIG_BAR"},
    {ON_UNI_CORE, SIGNAL, "nv signalbar=2\nnotify NWINFO SIG_BAR"},
    {ON_DATA_CARD | ON_MODULE | ON_UNI_CORE, SIGNAL, "nv signalbar=4\nnotify NWINFO SIG_BAR"},
    {ON_DATA_CARD | ON_MODULE, SIGNAL, "nv signalbar=9\nnotify NWINFO SIG_BAR"},
    {ON_EVERY, SIGNAL, "nv thermal_led_enable={60|0}\ncommand OVER_TEMP"},

    {ON_UFI, WIFI, "nv wifi_onoff_state={1|0} RadioOff={1|0}\nnotify WLAN CURRENT_STATUS {1|0}"},
    {ON_WIFI & ~ON_UFI, WIFI, "nv wifi_onoff_state={1|0}\nnotify WLAN CURRENT_STATUS {1|0}"},
    {ON_WIFI, WIFI, "notify WLAN CURRENT_STATUS 2"},
    {ON_PAPER_KITE | ON_UNI_CORE, WIFI, "nv wifi_chip1_wps_state={1|0}\nnotify WLAN AP_WPS_STATE {1|0}"},
    {ON_PAPER_KITE | ON_UNI_CORE, WIFI, "nv wifi_chip2_wps_state={1|0}\nnotify WLAN AP_WPS_STATE_CHIP2 {1|0}"},

    {ON_UFI, MESSAGES, "nv sms_nvunread_count=1\nnotify SMS {NEW_SMS|NV_UNREAD_SMS}"},
    {ON_UFI, MESSAGES, "nv sms_nvunread_count=0\nnotify SMS NV_UNREAD_SMS"},
    {ON_UFI, MESSAGES, "nv sms_nvtotal_count=100\nnotify SMS MEMORY_FULL"},
    {ON_UFI, MESSAGES, "nv sms_nvtotal_count=1"},
    {ON_UFI, MESSAGES, "notify MDM SIM_STATUS"},

    {ON_MODULE | ON_UNI_CORE, CALLS, "notify VOICE \"PHONE {LED ON|BLINK|LED OFF}\""},
    {ON_MODULE, CALLS, "notify SMS VOCEMAIL_SET_FLAG {1|0}"},

    {ON_EVERY, NIGHT, "nv night_mode_switch={0|1|2}\ncommand NIGHT_MODE"},
    {ON_EVERY, NIGHT, "nv night_mode_close_all_led={0|1}\ncommand NIGHT_MODE"},
    {ON_EVERY, NIGHT, "nv syn_done={0|1}"},

    {ON_EVERY, FAULTS, "fail {kiv_bsp_set_leds_sync|kiv_timer} * {-1|0}"},
    {ON_EVERY, FAULTS, "fail kiv_nvconfig_read * -1"},
    {ON_EVERY, FAULTS, "repair all"},

    {ON_EVERY, REFUSALS, "fail {kiv_nvconfig_write|kiv_bsp_get_sensor_temp_sync} * -1"},
    {ON_EVERY, REFUSALS, "fail {kiv_cfg_get_item|kiv_lib_led_relight_msg} * -1"},
    {ON_MODULE, REFUSALS,
     "fail kiv_bsp_get_battery_online_status_sync * -1\nfail kiv_bsp_get_charger_connect_status_sync * -1"},
    {ON_EVERY, REFUSALS, "repair all"},
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

struct refusal_row {
    std::string_view call;
    refused_call refused;
};

constexpr std::array refusal_rows = {
    refusal_row{"kiv_bsp_set_leds_sync",                   REFUSED_LEDS         },
    refusal_row{"kiv_timer",                               REFUSED_TIMERS       },
    refusal_row{"kiv_nvconfig_read",                       REFUSED_NV_READS     },
    refusal_row{"kiv_nvconfig_write",                      REFUSED_NV_WRITES    },
    refusal_row{"kiv_bsp_get_battery_online_status_sync",  REFUSED_SUPPLY       },
    refusal_row{"kiv_bsp_get_charger_connect_status_sync", REFUSED_SUPPLY       },
    refusal_row{"kiv_bsp_get_sensor_temp_sync",            REFUSED_SENSORS      },
    refusal_row{"kiv_cfg_get_item",                        REFUSED_CONFIGURATION},
    refusal_row{"kiv_lib_led_relight_msg",                 REFUSED_RELIGHT      },
};

uint8_t refused_bit(std::string_view call)
{
    for (const refusal_row &row : refusal_rows) {
        if (row.call == call) {
            return row.refused;
        }
    }
    give_up("the world cannot refuse " + std::string(call));
}

action tell(const std::string &bytes)
{
    action one = {.what = verb::SEND, .message = received_of(bytes)};
    const svc_msg &message = one.message.message;
    one.module = message.us_cmd == MSG_CMD_SERVICE_NOTIFY ? message.us_source_module_id : uint16_t{0};
    one.event = message.ul_event_mask;
    one.number = atoi(message.p_data);
    return one;
}

action as_action(const statement &from)
{
    switch (from.what) {
    case verb::SEND:
        return tell(from.bytes);
    case verb::INDICATE:
        return {.what = from.what, .number = atoi(from.bytes.c_str())};
    case verb::FAIL:
        return {.what = from.what, .value = refused_bit(from.key)};
    case verb::START:
    case verb::KILL:
    case verb::TIME_OF_DAY:
    case verb::REPAIR:
    case verb::AFTER:
        return {.what = from.what, .number = from.number};
    default:
        give_up("the world does not know '" + from.text + "'");
    }
}

void add_actions(const statement &from, std::vector<action> &to)
{
    if (from.what != verb::WRITE) {
        to.push_back(as_action(from));
    }
    for (const file_write &file : from.files) {
        const uint8_t key = key_number(file.path);
        to.push_back({.what = verb::WRITE, .key = key, .value = text_number(key, file.text)});
    }
}

bool is_indication(const action &one)
{
    if (one.what != verb::SEND || one.module == 0 || one.module == KIV_MODULE_SLEEP) {
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

// The text with the first word of every pair of braces; what remains is the text without those words.
static std::string take_first_words(std::string &text)
{
    std::string first;
    std::string rest;
    for (size_t at = 0; at < text.size();) {
        const size_t open = std::min(text.find('{', at), text.size());
        const size_t close = std::min(text.find('}', open), text.size());
        const size_t bar = std::min(text.find('|', open), close);
        const std::string before = text.substr(at, open - at);
        first += before + (open < close ? text.substr(open + 1, bar - open - 1) : "");
        rest += before;
        if (bar < close) {
            rest += "{" + text.substr(bar + 1, close - bar);
        }
        at = close + 1;
    }
    text = rest;
    return first;
}

static void add_stimuli(std::string text, std::vector<stimulus> &to)
{
    const bool has_words = text.find('{') != std::string::npos;
    do {
        to.push_back(stimulus_of(take_first_words(text)));
    } while (has_words && text.find('{') != std::string::npos);
}

std::vector<stimulus> alphabet_of(unsigned product, unsigned families)
{
    std::vector<stimulus> alphabet;
    for (const stimulus_row &row : stimulus_rows) {
        if ((row.products >> product & 1) != 0 && ((families | POWER) & row.of) != 0) {
            add_stimuli(std::string(row.text), alphabet);
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
