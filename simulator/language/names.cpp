#include "language/names.h"

#include "kiv/reg.h"

#include <algorithm>
#include <array>
#include <numeric>
#include <vector>

using namespace product_set;

namespace
{
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
    product_name{"UFI",          "NO_DRIVER_UFI",  UFI         },
    product_name{"DATA_CARD",    "ONLY_DATA_CARD", DATA_CARD   },
    product_name{"PAPER_KITE",   "PAPER_KITE",     PAPER_KITE  },
    product_name{"MODULE",       "MODULE",         MODULE      },
    product_name{"UNI_CORE_CPE", "UNI_CORE_CPE",   UNI_CORE_CPE},
};

// What may be left out of a constant; the longer one first.
constexpr std::array<std::string_view, 9> prefixes = {"REG_MC_EVENT_", "REG_MC_",      "REG_NWINFO_",
                                                      "REG_WLAN_",     "REG_WMS_SMS_", "REG_SLEEP_",
                                                      "REG_DST_",      "REG_VOICE_",   "REG_"};

constexpr std::array platform_calls = {
    std::string_view("kiv_syslog_append"),
    std::string_view("kiv_init_msg"),
    std::string_view("kiv_send_msg"),
    std::string_view("kiv_recv_msg"),
    std::string_view("kiv_msg_send"),
    std::string_view("kiv_reg_table_init"),
    std::string_view("kiv_reg_proc"),
    std::string_view("kiv_reg_func"),
    std::string_view("kiv_cfg_get_item"),
    std::string_view("kiv_nvconfig_read"),
    std::string_view("kiv_nvconfig_write"),
    std::string_view("kiv_ipc_init"),
    std::string_view("kiv_timer"),
    std::string_view("kiv_delete_timer"),
    std::string_view("kiv_bsp_set_leds_sync"),
    std::string_view("kiv_bsp_get_sensor_temp_sync"),
    std::string_view("kiv_bsp_get_charger_connect_status_sync"),
    std::string_view("kiv_bsp_get_battery_online_status_sync"),
    std::string_view("kiv_bsp_register_battery_online_ind"),
    std::string_view("kiv_bsp_register_battery_offline_ind"),
    std::string_view("kiv_bsp_register_charger_connect_ind"),
    std::string_view("kiv_bsp_register_charger_disconnect_ind"),
    std::string_view("kiv_lib_led_relight_msg"),
    std::string_view("libkiv_tr181_Init"),
    std::string_view("libkiv_tr181_set_tbl"),
};

// How many letters must be put in, taken out or changed.
size_t distance(std::string_view from, std::string_view to)
{
    std::vector<size_t> row(to.size() + 1);
    std::iota(row.begin(), row.end(), 0);
    for (size_t i = 1; i <= from.size(); i++) {
        size_t diagonal = row[0]++;
        for (size_t j = 1; j <= to.size(); j++) {
            const size_t changed = diagonal + (from[i - 1] != to[j - 1]);
            diagonal = row[j];
            row[j] = std::min({row[j] + 1, row[j - 1] + 1, changed});
        }
    }
    return row[to.size()];
}

// The tails of a constant that a scenario may write in its place: POWERON stands for REG_MC_EVENT_POWERON.
bool is_short_for(std::string_view name, std::string_view full_name)
{
    if (name == full_name) {
        return true;
    }
    for (const std::string_view prefix : prefixes) {
        if (full_name.starts_with(prefix) && full_name.substr(prefix.size()) == name) {
            return true;
        }
    }
    return false;
}

void append(std::string &list, std::string_view name)
{
    if (!list.empty()) {
        list += ", ";
    }
    list += name;
}
} // namespace

std::span<const product_name> all_products()
{
    return products;
}

std::span<const event_name> all_events()
{
    return events;
}

std::span<const command_name> all_commands()
{
    return commands;
}

std::string_view led_name(int led_id)
{
    const char *name = find_led_name(led_id);
    return name ? name : std::string_view();
}

std::optional<int> find_led(std::string_view name)
{
    const int led_id = find_led_id(name);
    return led_id >= 0 ? std::optional(led_id) : std::nullopt;
}

std::string led_names()
{
    std::string list;
    for (const led_row &row : led_rows) {
        if (row.led_id < LED_SIGBAR_0) {
            append(list, row.name);
        }
    }
    return list + ", sigbar_0 to sigbar_15";
}

const module_row *find_module(std::string_view name)
{
    for (const module_row &module : module_rows) {
        if (module.name == name && module.module_id != KIV_MODULE_LED) {
            return &module;
        }
    }
    return nullptr;
}

std::string module_names()
{
    std::string list;
    for (const module_row &module : module_rows) {
        if (module.module_id != KIV_MODULE_LED) {
            append(list, module.name);
        }
    }
    return list;
}

std::optional<uint32_t> find_event(int module_id, std::string_view name)
{
    for (const event_name &event : events) {
        if (event.module_id == module_id && is_short_for(name, event.full_name)) {
            return event.value;
        }
    }
    return std::nullopt;
}

std::optional<uint32_t> only_event(int module_id)
{
    std::optional<uint32_t> found;
    for (const event_name &event : events) {
        if (event.module_id != module_id) {
            continue;
        }
        if (found) {
            return std::nullopt;
        }
        found = event.value;
    }
    return found;
}

std::string event_names(int module_id)
{
    std::string list;
    for (const event_name &event : events) {
        if (event.module_id == module_id) {
            append(list, event.full_name);
        }
    }
    return list;
}

std::string event_word(int module_id, uint32_t value)
{
    for (const event_name &event : events) {
        if (event.module_id != module_id || event.value != value) {
            continue;
        }
        for (const std::string_view prefix : prefixes) {
            if (event.full_name.starts_with(prefix)) {
                return std::string(event.full_name.substr(prefix.size()));
            }
        }
    }
    return {};
}

std::optional<int> find_command(std::string_view name)
{
    for (const command_name &command : commands) {
        if (command.name == name) {
            return command.value;
        }
    }
    return std::nullopt;
}

std::string command_names()
{
    std::string list;
    for (const command_name &command : commands) {
        append(list, command.name);
    }
    return list;
}

std::string_view command_name_of(int value)
{
    for (const command_name &command : commands) {
        if (command.value == value) {
            return command.name;
        }
    }
    return {};
}

bool is_platform_call(std::string_view name)
{
    return std::find(platform_calls.begin(), platform_calls.end(), name) != platform_calls.end();
}

std::string nearest_platform_call(std::string_view name)
{
    return nearest(name, platform_calls);
}

std::string nearest(std::string_view name, std::span<const std::string_view> known)
{
    return std::string(
        *std::min_element(known.begin(), known.end(), [name](std::string_view one, std::string_view other) {
            return distance(name, one) < distance(name, other);
        }));
}

const product_name *find_product(std::string_view name)
{
    for (const product_name &product : products) {
        if (product.name == name) {
            return &product;
        }
    }
    return nullptr;
}

std::string product_names()
{
    std::string list;
    for (const product_name &product : products) {
        append(list, product.name);
    }
    return list;
}
