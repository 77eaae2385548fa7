#include "alarms/kiv_led_over_temp.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "ground/timer.h"
#include "kiv/adabsp.h"
#include "kiv/ipc.h"
#include "output/led_groups.h"
#include "painters/signal_led.h"

#include <array>

constexpr char LED_LOG_SOURCE[] = "kiv_led_over_temp";
constexpr int POLL_PERIOD_MS = 20000;

static led_word over_temp_threshold; // in the board's unit; 0 or less: the alarm is off
static led_word over_temp_timer;     // 0 when none
static char no_argument[] = "";

static void give_signal_led_back()
{
    kiv_led_set_sig_led_off();
    kiv_qt330x_set_led_signal_state(led_signal_level);
}

// 1 when a sensor is above the limit, which a set-up on another thread may change meanwhile. A sensor that does not
// answer counts with the reading of the one before it, the first with 0.
static int scan_sensors()
{
    const int limit = over_temp_threshold;
    bsp_sensor_temp reading = {};

    for (int sensor = 0; sensor < BSP_SENSOR_COUNT; ++sensor) {
        kiv_bsp_get_sensor_temp_sync(sensor, &reading);
        if (reading.temperature > limit) {
            return 1;
        }
    }
    return 0;
}

static void switch_off()
{
    kiv_delete_timer(kiv_led_take_timer(over_temp_timer));
    is_over_temp = 0;
    over_temp_enable = 0;
    give_signal_led_back();
    LED_INFO("Delete over temp timer AND EXIT over temp mode\n");
}

// Both change is_over_temp before they touch the LED: a signal notification that comes in between then leaves the blink
// alone, or shows its level behind the alarm's end.
static void enter_alarm()
{
    is_over_temp = 1;
    if (over_temp_enable != 1) {
        LED_INFO("Over temp switch is OFF.");
        return;
    }
    LED_ERROR("OVER temp led FUNC and blink!!");
    kiv_led_show_over_temp_blink();
}

static void leave_alarm()
{
    is_over_temp = 0;
    LED_ERROR("Not over temp led FUNC and relight!!");
    give_signal_led_back();
}

// Acts on a change only.
static void kiv_led_set_over_temp_state(int over)
{
    if (is_over_temp == 0 && over == 1) {
        enter_alarm();
    } else if (is_over_temp == 1 && over == 0) {
        leave_alarm();
    }
}

// The poll, on the timer thread.
static void kiv_led_over_temp_check(void *)
{
    kiv_led_set_over_temp_state(scan_sensors());
}

void kiv_led_over_temp_init()
{
    std::array<char, 8> text;
    kiv_led_read_nv("thermal_led_enable", text);

    const int threshold = kiv_led_text_to_int(text.data());
    over_temp_threshold = threshold;
    LED_INFO("Cur Temp LED switch:%d", threshold);
    if (threshold <= 0) {
        switch_off();
        return;
    }
    over_temp_enable = 1;
    kiv_led_set_over_temp_state(scan_sensors());
    if (kiv_led_start_timer(over_temp_timer, kiv_led_over_temp_check, no_argument, POLL_PERIOD_MS)) {
        LED_ERROR("Enable temp led FUNC!!");
    }
}

void kiv_led_show_over_temp_blink()
{
    kiv_led_set_sig_led_operation(LED_SIG_BLUE, LED_OP_BLINK, 1000, 1000, 3);
}
