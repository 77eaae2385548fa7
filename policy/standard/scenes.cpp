#include "policy/standard/scenes.h"

#include "alarms/kiv_led_data_limit.h"
#include "core/bsp_ready.h"
#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/reverser.h"
#include "kiv/adabsp.h"
#include "kiv/reg.h"
#include "output/led_groups.h"
#include "policy/battery_query.h"
#include "policy/mc_event.h"
#include "policy/standard/net_led.h"
#include "policy/standard/network.h"
#include "policy/standard/sms.h"
#include "policy/standard/voice.h"
#include "policy/standard/wifi.h"

#include <array>
#include <span>
#include <unistd.h>

constexpr char led_log_source[] = "kiv_mirta_led";

constexpr int rolling_leds_poll_ms = 50;
constexpr int rolling_leds_polls = 100;
constexpr int initial_flash_ms = 200;
constexpr int us_per_ms = 1000;

constexpr auto all_on_steps = std::array{
    led_step{LED_BAT_GREEN, LED_OP_ON, 0, 0, 4},
    led_step{LED_ID_41,     LED_OP_ON, 0, 0, 4},
    led_step{LED_SMS_BLUE,  LED_OP_ON, 0, 0, 4},
    led_step{LED_NET_RED,   LED_OP_ON, 0, 0, 4},
};
constexpr auto flash_steps = std::array{
    led_step{LED_BAT_GREEN, LED_OP_OFF, 0, 0, 0},
    led_step{LED_BAT_RED,   LED_OP_ON,  0, 0, 4},
    led_step{LED_ID_41,     LED_OP_ON,  0, 0, 4},
    led_step{LED_SMS_BLUE,  LED_OP_ON,  0, 0, 4},
    led_step{LED_NET_14,    LED_OP_ON,  0, 0, 4},
};
// The red battery LED stays lit.
constexpr auto flash_end_steps = std::array{
    led_step{LED_ID_41,    LED_OP_OFF, 0, 0, 0},
    led_step{LED_SMS_BLUE, LED_OP_OFF, 0, 0, 0},
    led_step{LED_NET_14,   LED_OP_OFF, 0, 0, 0},
};

// clang-format off
constexpr auto mc_event_rows = std::array{
    mc_event_row{REG_MC_EVENT_POWERON, "recv REG_MC_EVENT_POWERON \n", kiv_led_set_led_when_power_on},
    mc_event_row{REG_MC_EVENT_SHUTTING_DOWN, "recv REG_MC_EVENT_SHUTTING_DOWN \n", kiv_led_set_led_when_power_off,
                 REVERSER_SHUTTING_DOWN},
    mc_event_row{REG_MC_EVENT_RESETTING, "recv REG_MC_EVENT_RESETTING \n", kiv_led_set_led_when_resetting,
                 REVERSER_RESETTING},
    mc_event_row{REG_MC_EVENT_RESTARTING, "recv REG_MC_EVENT_RESTARTING \n", kiv_led_set_all_leds_off},
    mc_event_row{REG_MC_EVENT_POWER_OFF_CHARGE, "recv REG_MC_EVENT_POWER_OFF_CHARGE \n",
                 kiv_led_set_led_when_power_off_charge},
    mc_event_row{REG_MC_EVENT_POWER_OFF_UNREADL, "recv REG_MC_EVENT_POWER_OFF_UNREADL \n",
                 kiv_led_set_led_when_power_off_unreal},
    mc_event_row{REG_MC_EVENT_POWER_OFF_QUICKEN, "recv REG_MC_EVENT_POWER_OFF_QUICKEN\n",
                 kiv_led_set_led_when_power_off_quicken},
    mc_event_row{REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN, "recv REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN\n",
                 kiv_led_set_led_when_power_off_charge_quicken},
    mc_event_row{REG_MC_EVENT_POWER_OFF_QUICKEN_ACK, nullptr, kiv_led_set_led_when_power_off_quicken,
                 REVERSER_POWER_OFF_QUICKEN},
    mc_event_row{REG_MC_EVENT_INITAL, "recv REG_MC_EVENT_INITAL\n", kiv_led_set_led_when_initial},
    mc_event_row{REG_MC_CHARGIN_STATUS, "recv REG_MC_CHARGIN_STATUS\n", kiv_led_battery_query_dispatch},
    mc_event_row{REG_MC_BATTERY_VALUE, "recv REG_MC_BATTERY_VALUE\n", kiv_led_battery_query_dispatch},
};
// clang-format on

static void set_leds(std::span<const led_step> steps)
{
    for (const led_step &step : steps) {
        kiv_led_apply(kiv_led_set_led_operation, step);
    }
}

static void enter_power_state(power_state state)
{
    led_power_state = state;
    kiv_led_end_data_limit();
    kiv_led_set_all_leds_off();
}

// The board drives the LEDs until its animation has stopped; after 5 s the daemon takes them over all the same.
static void wait_for_bsp()
{
    int i = 0;

    while (kiv_led_bsp_ready() == 0 && i < rolling_leds_polls) {
        ++i;
        usleep(rolling_leds_poll_ms * us_per_ms);
    }
    LED_ERROR("i=%d, bsp sync rolling led cost time = %d ms\n", i, i * rolling_leds_poll_ms);
}

static void kiv_ledstartupdate_stop_rolling_leds()
{
    LED_INFO("enter kiv_ledstartupdate_stop_rolling_leds\n");
    if (led_bsp_ready == 1) {
        LED_INFO("bsp ready, needn't stop rolling leds\n");
        return;
    }
    kiv_led_stop_rolling_leds();
    wait_for_bsp();
    led_bsp_ready = 1;
}

static void fall_asleep()
{
    LED_INFO("start power led breathe \n");
    kiv_led_end_data_limit();
    kiv_led_settle_new_sms();
    kiv_led_set_all_leds_off();
    LED_INFO(" power led blink \n");
    kiv_led_set_bat_led_operation(LED_BAT_GREEN, LED_OP_BLINK, 300, 5000, 4);
    cur_led_sleep_status = 1;
}

void kiv_led_handle_mc_event(uint32_t event)
{
    kiv_led_run_mc_event(mc_event_rows, event, led_log_source);
}

void kiv_led_set_led_when_sleep_status_change(int sleep_status)
{
    LED_INFO("enter kiv_led_set_led_when_sleep_status_change sleep_status=%d\n", sleep_status);
    if (led_power_state != POWER_ON) {
        LED_INFO("kiv_led_handle_sleep_status_change:  not power on !\n ");
        return;
    }
    if (sleep_status == 1) {
        fall_asleep();
        return;
    }
    LED_INFO(" start wakeup \n");
    cur_led_sleep_status = 0;
    kiv_led_set_led_when_wakeup();
}

void kiv_led_std_init()
{
    kiv_led_battery_query_dispatch();
    recv_simStatus();
    if (led_power_state == POWER_ON) {
        kiv_led_handle_sms_state(led_sms_state);
        kiv_set_net_led_state(led_net_type, led_ppp_state);
    }
    recv_nwNetType();
    kiv_led_set_led_wifi_init();
}

void kiv_led_set_all_leds_off()
{
    LED_INFO("enter kiv_led_set_all_leds_off\n");
    kiv_led_set_bat_led_off();
    kiv_led_set_net_led_off();
    kiv_led_set_wifi_led_off();
    kiv_led_set_sms_led_off();
}

void kiv_led_set_all_leds_on()
{
    LED_INFO("enter kiv_led_set_all_leds_on\n");
    set_leds(all_on_steps);
}

void kiv_led_set_led_when_initial()
{
    set_leds(flash_steps);
    usleep(initial_flash_ms * us_per_ms);
    set_leds(flash_end_steps);
}

void kiv_led_set_led_when_power_on()
{
    LED_INFO("enter kiv_led_set_led_when_power_on\n");
    kiv_ledstartupdate_stop_rolling_leds();
    led_power_state = POWER_ON;
    kiv_led_std_init();
}

void kiv_led_set_led_when_power_off()
{
    LED_INFO("enter kiv_led_set_led_when_power_off\n");
    if (led_power_state == POWER_RESETTING) {
        LED_INFO("Now is ressetting, needn't close led\n");
        return;
    }
    led_power_state = POWER_OFF;
    led_net_type = 0; // the class read at the next power-on counts as a change
    kiv_led_end_data_limit();
    kiv_led_settle_new_sms();
    kiv_led_set_all_leds_off();
}

void kiv_led_set_led_when_power_off_quicken()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_quicken\n");
    enter_power_state(POWER_OFF_QUICKEN);
}

void kiv_led_set_led_when_power_off_charge()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_charge\n");
    enter_power_state(POWER_OFF_CHARGE);
    kiv_led_battery_query_dispatch();
}

void kiv_led_set_led_when_power_off_charge_quicken()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_charge_quicken\n");
    enter_power_state(POWER_OFF_CHARGE_QUICKEN);
    kiv_led_battery_query_dispatch();
}

// Looks off while it stays up: its timers run on.
void kiv_led_set_led_when_power_off_unreal()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_unreal\n");
    led_power_state = POWER_OFF_UNREAL;
    kiv_led_set_all_leds_off();
}

void kiv_led_set_led_when_resetting()
{
    LED_INFO("enter kiv_led_set_led_when_resetting\n");
    enter_power_state(POWER_RESETTING);
    kiv_led_set_all_leds_on();
}

void kiv_led_set_led_when_wakeup()
{
    LED_INFO("enter kiv_led_set_led_when_wakeup\n");
    kiv_led_battery_query_dispatch();
    kiv_set_net_led_state(led_net_type, led_ppp_state);
    recv_nwNetType();
    kiv_led_set_led_wakeup_wlan();
    kiv_led_handle_sms_state(led_sms_state);
}
