#include "names.h"

#include "kiv/adabsp.h"
#include "kiv/reg.h"
#include "kiv/socket.h"

#include <array>

namespace
{
struct led_row {
    int id;
    std::string_view name;
};

constexpr std::array led_rows = {
    led_row{LED_BAT_RED,          "bat_red"         },
    led_row{LED_BAT_GREEN,        "bat_green"       },
    led_row{LED_BAT_BLUE,         "bat_blue"        },
    led_row{LED_BAT_YELLOW,       "bat_yellow"      },
    led_row{LED_SIG_6,            "sig_6"           },
    led_row{LED_SIG_BLUE,         "sig_blue"        },
    led_row{LED_FLOW_RED,         "flow_red"        },
    led_row{LED_FLOW_GREEN,       "flow_green"      },
    led_row{LED_FLOW_BLUE,        "flow_blue"       },
    led_row{LED_FLOW_YELLOW,      "flow_yellow"     },
    led_row{LED_NET_RED,          "net_red"         },
    led_row{LED_NET_14,           "net_14"          },
    led_row{LED_NET_BLUE,         "net_blue"        },
    led_row{LED_NET_16,           "net_16"          },
    led_row{LED_NET_WHITE,        "net_white"       },
    led_row{LED_ID_41,            "id_41"           },
    led_row{LED_WIFI_BLUE,        "wifi_blue"       },
    led_row{LED_RSSI_RED,         "rssi_red"        },
    led_row{LED_RSSI_GREEN,       "rssi_green"      },
    led_row{LED_RSSI_BLUE,        "rssi_blue"       },
    led_row{LED_RSSI_YELLOW,      "rssi_yellow"     },
    led_row{LED_SMS_GREEN,        "sms_green"       },
    led_row{LED_SMS_BLUE,         "sms_blue"        },
    led_row{LED_POWER_BLUE,       "power_blue"      },
    led_row{LED_POWER_54,         "power_54"        },
    led_row{LED_VOICE_RED,        "voice_red"       },
    led_row{LED_VOICE_GREEN,      "voice_green"     },
    led_row{LED_VOICE_BLUE,       "voice_blue"      },
    led_row{LED_VOICE_YELLOW,     "voice_yellow"    },
    led_row{LED_VOICEMAIL_RED,    "voicemail_red"   },
    led_row{LED_VOICEMAIL_GREEN,  "voicemail_green" },
    led_row{LED_VOICEMAIL_BLUE,   "voicemail_blue"  },
    led_row{LED_VOICEMAIL_YELLOW, "voicemail_yellow"},
    led_row{66,                   "sigbar_0"        },
    led_row{67,                   "sigbar_1"        },
    led_row{68,                   "sigbar_2"        },
    led_row{69,                   "sigbar_3"        },
    led_row{70,                   "sigbar_4"        },
    led_row{71,                   "sigbar_5"        },
    led_row{72,                   "sigbar_6"        },
    led_row{73,                   "sigbar_7"        },
    led_row{74,                   "sigbar_8"        },
    led_row{75,                   "sigbar_9"        },
    led_row{76,                   "sigbar_10"       },
    led_row{77,                   "sigbar_11"       },
    led_row{78,                   "sigbar_12"       },
    led_row{79,                   "sigbar_13"       },
    led_row{80,                   "sigbar_14"       },
    led_row{81,                   "sigbar_15"       },
};

constexpr std::array modules = {
    module_name{"MAIN",   KIV_MODULE_MAIN,   "MSG_ID_MAIN"  },
    module_name{"PPP",    KIV_MODULE_PPP,    "MSG_ID_PPP"   },
    module_name{"SMS",    KIV_MODULE_SMS,    "MSG_ID_SMS"   },
    module_name{"WLAN",   KIV_MODULE_WLAN,   "MSG_ID_WLAN"  },
    module_name{"MDM",    KIV_MODULE_MDM,    "MSG_ID_MDM"   },
    module_name{"NWINFO", KIV_MODULE_NWINFO, "MSG_ID_NWINFO"},
    module_name{"DST",    KIV_MODULE_DST,    "MSG_ID_DST"   },
    module_name{"SLEEP",  KIV_MODULE_SLEEP,  "MSG_ID_SLEEP" },
    module_name{"VOICE",  KIV_MODULE_VOICE,  "MSG_ID_VOICE" },
};

#define EVENT(module, name)                                                                                            \
    event_name                                                                                                         \
    {                                                                                                                  \
        module, #name, static_cast<uint32_t>(name)                                                                     \
    }
constexpr std::array events = {
    EVENT(KIV_MODULE_MAIN, REG_MC_CHARGIN_STATUS),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_SHUTTING_DOWN),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_RESETTING),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_RESTARTING),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_INITAL),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_CHARGE),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_UNREADL),
    EVENT(KIV_MODULE_MAIN, REG_MC_BATTERY_VALUE),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN),
    EVENT(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK),
    EVENT(KIV_MODULE_MDM, REG_SIM_STATUS),
    EVENT(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR),
    EVENT(KIV_MODULE_NWINFO, REG_NWINFO_ROAMING_STATUS),
    EVENT(KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE),
    EVENT(KIV_MODULE_PPP, REG_PPP_STATUS),
    EVENT(KIV_MODULE_PPP, REG_Q6_PPP_STATUS),
    EVENT(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS),
    EVENT(KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE),
    EVENT(KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE_CHIP2),
    EVENT(KIV_MODULE_SMS, REG_WMS_SMS_NV_UNREAD_SMS),
    EVENT(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS),
    EVENT(KIV_MODULE_SMS, REG_WMS_SMS_MEMORY_FULL),
    EVENT(KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG),
    EVENT(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT),
    EVENT(KIV_MODULE_DST, REG_DST_FLOW_STATUS),
    EVENT(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE),
};
#undef EVENT

constexpr std::array commands = {
    command_name{"CIRCLE_LED_CTRL", KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL},
    command_name{"DATA_LIMIT",      KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG },
    command_name{"RESET",           KIV_MSG_CMD_LED_CPE_RESET_MSG      },
    command_name{"OVER_TEMP",       KIV_MSG_CMD_LED_OVER_TEMP_MSG      },
    command_name{"NIGHT_MODE",      KIV_MSG_CMD_LED_NIGHT_MODE_MSG     },
    command_name{"RELIGHT",         KIV_MSG_CMD_LED_RELIGHT_MSG        },
};

constexpr std::array products = {
    product_name{"UFI",          "NO_DRIVER_UFI" },
    product_name{"DATA_CARD",    "ONLY_DATA_CARD"},
    product_name{"PAPER_KITE",   "PAPER_KITE"    },
    product_name{"MODULE",       "MODULE"        },
    product_name{"UNI_CORE_CPE", "UNI_CORE_CPE"  },
};

// The tails of a constant that a scenario may write in its place: POWERON stands for REG_MC_EVENT_POWERON.
bool is_short_for(std::string_view name, std::string_view full_name)
{
    if (name == full_name)
        return true;
    constexpr std::array<std::string_view, 9> prefixes = {"REG_MC_EVENT_", "REG_MC_",      "REG_NWINFO_",
                                                          "REG_WLAN_",     "REG_WMS_SMS_", "REG_SLEEP_",
                                                          "REG_DST_",      "REG_VOICE_",   "REG_"};
    for (const std::string_view prefix : prefixes) {
        if (full_name.starts_with(prefix) && full_name.substr(prefix.size()) == name)
            return true;
    }
    return false;
}

void append(std::string &list, std::string_view name)
{
    if (!list.empty())
        list += ", ";
    list += name;
}
} // namespace

std::span<const module_name> all_modules()
{
    return modules;
}

std::span<const product_name> all_products()
{
    return products;
}

std::string_view led_name(int led_id)
{
    for (const led_row &row : led_rows) {
        if (row.id == led_id)
            return row.name;
    }
    return {};
}

std::optional<int> find_led(std::string_view name)
{
    for (const led_row &row : led_rows) {
        if (row.name == name)
            return row.id;
    }
    return std::nullopt;
}

std::string led_names()
{
    std::string list;
    for (const led_row &row : led_rows) {
        if (row.id < LED_SIGBAR_0)
            append(list, row.name);
    }
    return list + ", sigbar_0 to sigbar_15";
}

const module_name *find_module(std::string_view name)
{
    for (const module_name &module : modules) {
        if (module.name == name)
            return &module;
    }
    return nullptr;
}

std::string module_names()
{
    std::string list;
    for (const module_name &module : modules)
        append(list, module.name);
    return list;
}

std::optional<uint32_t> find_event(int module_id, std::string_view name)
{
    for (const event_name &event : events) {
        if (event.module_id == module_id && is_short_for(name, event.full_name))
            return event.value;
    }
    return std::nullopt;
}

std::optional<uint32_t> only_event(int module_id)
{
    std::optional<uint32_t> found;
    for (const event_name &event : events) {
        if (event.module_id != module_id)
            continue;
        if (found)
            return std::nullopt;
        found = event.value;
    }
    return found;
}

std::string event_names(int module_id)
{
    std::string list;
    for (const event_name &event : events) {
        if (event.module_id == module_id)
            append(list, event.full_name);
    }
    return list;
}

std::optional<int> find_command(std::string_view name)
{
    for (const command_name &command : commands) {
        if (command.name == name)
            return command.value;
    }
    return std::nullopt;
}

std::string command_names()
{
    std::string list;
    for (const command_name &command : commands)
        append(list, command.name);
    return list;
}

const product_name *find_product(std::string_view name)
{
    for (const product_name &product : products) {
        if (product.name == name)
            return &product;
    }
    return nullptr;
}

std::string product_names()
{
    std::string list;
    for (const product_name &product : products)
        append(list, product.name);
    return list;
}
