#include "policy/cpe/battery.h"

#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "kiv/adabsp.h"
#include "policy/cpe/setters.h"
#include "policy/cpe/state.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led_cpe";

constexpr int LOW_UP_TO_PERCENT = 20;
constexpr int MIDDLE_UP_TO_PERCENT = 50;

// NV "battery_charging"; any other number is a battery that does not charge.
enum battery_charging : int { BATTERY_CHARGING = 1, BATTERY_NOT_SHOWN = 3 };

static cpe_battery_status status_of_level(int percent, bool charging)
{
    if (percent <= LOW_UP_TO_PERCENT) {
        return charging ? CPE_BAT_CHARGING_LOW : CPE_BAT_LOW;
    }
    if (percent <= MIDDLE_UP_TO_PERCENT) {
        return charging ? CPE_BAT_CHARGING_MIDDLE : CPE_BAT_MIDDLE;
    }
    return charging ? CPE_BAT_CHARGING_HIGH : CPE_BAT_HIGH;
}

// 1 when the board says that a battery is there, 0 when there is none or the board does not answer.
static int getBatteryExist()
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

    if (charging == BATTERY_NOT_SHOWN) {
        return CPE_BAT_NONE;
    }
    return status_of_level(kiv_led_text_to_int(percent.data()), charging == BATTERY_CHARGING);
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
        if (result.ret == 0 && (result.data == CHARGER_DISCONNECTED || result.data == CHARGER_CONNECTED)) {
            cur_cpe_charger_state = result.data;
        }
    }
    const int charger = cur_cpe_charger_state;
    LED_INFO("getChargerConnect: %d", charger);
    kiv_cpe_led_handle_charger_state(charger);
}
