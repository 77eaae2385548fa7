#include "alarms/kiv_led_over_temp.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/nv_read.h"
#include "kiv/adabsp.h"
#include "kiv/ipc.h"
#include "output/led_groups.h"
#include "policy/standard/signal_led.h"

constexpr char led_log_source[] = "kiv_led_over_temp";
constexpr int poll_period_ms = 20000;

static led_word over_temp_threshold; // in the board's unit; 0 or less: the alarm is off
static led_word over_temp_timer;     // 0 when none
static char no_argument[] = "";

static void give_signal_led_back()
{
    kiv_led_set_sig_led_off();
    kiv_qt330x_set_led_signal_state(led_signal_level);
}

// A sensor that does not answer counts with the reading of the one before it, the first with 0.
static int scan_sensors()
{
    bsp_sensor_temp reading = {};

    for (int sensor = 0; sensor < BSP_SENSOR_COUNT; ++sensor) {
        kiv_bsp_get_sensor_temp_sync(sensor, &reading);
        if (reading.temperature > over_temp_threshold) {
            return 1;
        }
    }
    return 0;
}

static void switch_off()
{
    kiv_delete_timer(over_temp_timer);
    over_temp_timer = 0;
    is_over_temp = 0;
    over_temp_enable = 0;
    give_signal_led_back();
    LED_INFO("Delete over temp timer AND EXIT over temp mode\n");
}

static void start_poll_timer()
{
    if (over_temp_timer != 0) {
        return;
    }
    over_temp_timer = kiv_timer(kiv_led_over_temp_check, no_argument, poll_period_ms, 1);
    if (over_temp_timer != 0) {
        LED_ERROR("Enable temp led FUNC!!");
    }
}

static void enter_alarm()
{
    if (over_temp_enable == 1) {
        LED_ERROR("OVER temp led FUNC and blink!!");
        kiv_led_show_over_temp_blink();
    } else {
        LED_INFO("Over temp switch is OFF.");
    }
    is_over_temp = 1;
}

static void leave_alarm()
{
    LED_ERROR("Not over temp led FUNC and relight!!");
    give_signal_led_back();
    is_over_temp = 0;
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
    start_poll_timer();
}

void kiv_led_over_temp_check(void *)
{
    kiv_led_set_over_temp_state(scan_sensors());
}

void kiv_led_set_over_temp_state(int over)
{
    if (is_over_temp == 0 && over == 1) {
        enter_alarm();
    } else if (is_over_temp == 1 && over == 0) {
        leave_alarm();
    }
}

// Requested once, on the change: the board keeps it running.
void kiv_led_show_over_temp_blink()
{
    kiv_led_set_sig_led_operation(LED_SIG_BLUE, LED_OP_BLINK, 1000, 1000, 3);
}
