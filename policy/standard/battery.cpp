#include "policy/standard/battery.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"

#include <array>
#include <climits>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

enum charging_status : int { NOT_CHARGING = 0, CHARGING = 1, CHARGED = 2, NO_BATTERY = 3 };

struct charge_row {
    int up_to_percent;
    const char *line; // followed by the percentage
    led_step step;
};

constexpr auto charge_rows = std::array{
    charge_row{12,      "power red blink,power_percent=", {LED_BAT_RED, LED_OP_BLINK, 800, 1200, 4}},
    charge_row{23,      "power red on,power_percent=",    {LED_BAT_RED, LED_OP_ON, 0, 0, 4}        },
    charge_row{INT_MAX, "power green on,power_percent=",  {LED_BAT_GREEN, LED_OP_ON, 0, 0, 4}      },
};

static void kiv_led_set_led_when_power_percent_change()
{
    LED_INFO("enter kiv_led_set_led_when_power_percent_change\n");

    const nv_text text = kiv_led_read_nv_text("battery_value");
    LED_INFO("kiv_led_set_led_when_power_percent_change buf_percent = %s", text.data());

    const int percent = kiv_led_text_to_int(text.data());
    for (const charge_row &row : charge_rows) {
        if (percent <= row.up_to_percent) {
            LED_INFO("%s%d\n", row.line, percent);
            kiv_led_set_bat_led_operation(row.step);
            return;
        }
    }
}

static void kiv_led_set_led_when_charging_status_change(int charging_status)
{
    LED_INFO("enter kiv_led_set_led_when_charging_status_change charging_status=%d\n", charging_status);
    switch (charging_status) {
    case NOT_CHARGING:
        kiv_led_set_led_when_power_percent_change();
        break;
    case CHARGING:
        LED_INFO("power green blink\n");
        kiv_led_set_bat_led_operation(LED_BAT_GREEN, LED_OP_BLINK, 800, 1200, 4);
        break;
    case CHARGED:
        LED_INFO("power green on\n");
        kiv_led_set_bat_led_operation(LED_BAT_GREEN, LED_OP_ON, 0, 0, 4);
        break;
    case NO_BATTERY:
        kiv_led_set_bat_led_off();
        break;
    default: // NV may hold any number
        break;
    }
}

static bool shows_battery_in(int state)
{
    return state == POWER_ON || state == POWER_OFF_CHARGE || state == POWER_OFF_CHARGE_QUICKEN;
}

void kiv_led_query_battery_state()
{
    if (cur_led_sleep_status == ASLEEP) {
        LED_INFO("recv_battery_state, KIV_LED_SLEEP");
        return;
    }
    if (!shows_battery_in(led_power_state)) {
        return;
    }
    const int charging = kiv_led_read_nv_int("battery_charging");
    const int exist = kiv_led_read_nv_int("battery_exist");
    const int status = exist == 0 ? NO_BATTERY : charging;

    LED_INFO("kiv_led_query_battery_state battery_charging = %d", status);
    kiv_led_set_led_when_charging_status_change(status);
}
