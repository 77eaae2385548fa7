#include "policy/cpe/battery.h"

#include "core/led_log.h"
#include "core/nv_read.h"
#include "kiv/adabsp.h"
#include "policy/cpe/setters.h"
#include "policy/cpe/state.h"

#include <array>
#include <climits>

constexpr char led_log_source[] = "kiv_mirta_led_cpe";

enum charging_text : int { TEXT_CHARGING = 1, TEXT_NO_BATTERY = 3 }; // NV "battery_charging"

struct level_row {
    int up_to_percent;
    cpe_battery_status discharging;
    cpe_battery_status charging;
};

constexpr auto level_rows = std::array{
    level_row{20,      CPE_BAT_LOW,    CPE_BAT_CHARGING_LOW   },
    level_row{50,      CPE_BAT_MIDDLE, CPE_BAT_CHARGING_MIDDLE},
    level_row{INT_MAX, CPE_BAT_HIGH,   CPE_BAT_CHARGING_HIGH  },
};

static cpe_battery_status status_of_level(int percent, bool charging)
{
    for (const level_row &row : level_rows) {
        if (percent <= row.up_to_percent) {
            return charging ? row.charging : row.discharging;
        }
    }
    return CPE_BAT_NOTHING;
}

static cpe_battery_status read_battery_status()
{
    if (cur_cpe_power_state != POWER_ON && cur_cpe_power_state != POWER_OFF_CHARGE) {
        return CPE_BAT_NOTHING;
    }
    if (getBatteryExist() == 0) {
        return CPE_BAT_NONE;
    }
    const int charging = kiv_led_read_nv_int("battery_charging");
    LED_INFO("kiv_cpe_led_handle_battery_state battery_charging = %d", charging);

    const nv_text percent = kiv_led_read_nv_text("battery_value");
    LED_INFO("kiv_cpe_led_handle_battery_state buf_percent = %s", percent.data());

    if (charging == TEXT_NO_BATTERY) {
        return CPE_BAT_NONE;
    }
    return status_of_level(kiv_led_text_to_int(percent.data()), charging == TEXT_CHARGING);
}

void kiv_cpe_led_handle_battery_state()
{
    const cpe_battery_status status = read_battery_status();

    if (status != cur_cpe_battery_status) {
        kiv_cpe_led_set_bat_status(status, cur_cpe_power_state);
    }
    cur_cpe_battery_status = status;
}

void kiv_cpe_led_handle_charger_state(int state)
{
    LED_INFO("kiv_cpe_led_handle_charger_state: %d!", state);
    cur_cpe_charger_state = state;
    kiv_cpe_led_set_power_status(state);
}

void getChargerConnect()
{
    LED_INFO("[info] enter getChargerConnect");

    bsp_query_result result = {};
    if (kiv_bsp_get_charger_connect_status_sync(&result) == 0) {
        LED_INFO("[info] isUsbCharged ret %d,data %d!!", result.ret, result.data);
        if (result.ret == 0 && (result.data == 0 || result.data == 1)) {
            cur_cpe_charger_state = result.data;
        }
    }
    const int charger = cur_cpe_charger_state;
    LED_INFO("getChargerConnect: %d", charger);
    kiv_cpe_led_handle_charger_state(charger);
}

int getBatteryExist()
{
    LED_INFO("[info] enter getBatteryExist");

    bsp_query_result result = {};
    if (kiv_bsp_get_battery_online_status_sync(&result) != 0) {
        return 0;
    }
    LED_INFO("[info] isBattExist ret %d,data %d!!", result.ret, result.data);
    if (result.ret != 0) {
        LED_ERROR("getBatteryExist error = %d", result.ret);
        return 0;
    }
    return result.data == 1 ? 1 : 0;
}
