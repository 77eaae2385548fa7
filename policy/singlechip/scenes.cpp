#include "policy/singlechip/scenes.h"

#include "alarms/kiv_led_data_limit.h"
#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/reverser.h"
#include "kiv/adabsp.h"
#include "kiv/reg.h"
#include "output/led_groups.h"
#include "policy/mc_event.h"
#include "policy/singlechip/setters.h"
#include "policy/standard/net_led.h"
#include "policy/standard/network.h"
#include "policy/standard/wifi.h"

#include <array>

constexpr char led_log_source[] = "kiv_mirta_led";
constexpr int sleep_status_asleep = 5; // on this product 1 is a wake-up

// clang-format off
constexpr auto mc_event_rows = std::array{
    mc_event_row{REG_MC_EVENT_POWERON, "recv REG_MC_EVENT_POWERON \n", kiv_singelchip_led_set_led_when_power_on},
    mc_event_row{REG_MC_EVENT_SHUTTING_DOWN, "recv REG_MC_EVENT_SHUTTING_DOWN \n",
                 kiv_singelchip_led_set_led_when_power_off, REVERSER_SHUTTING_DOWN},
    mc_event_row{REG_MC_EVENT_RESETTING, "recv REG_MC_EVENT_RESETTING \n", kiv_singelchip_led_set_led_when_resetting,
                 REVERSER_RESETTING},
    mc_event_row{REG_MC_EVENT_RESTARTING, "recv REG_MC_EVENT_RESTARTING \n", kiv_singlechip_330x_led_set_all_leds_off},
    mc_event_row{REG_MC_EVENT_POWER_OFF_UNREADL, "recv REG_MC_EVENT_POWER_OFF_UNREADL \n",
                 kiv_singelchip_led_set_led_when_power_off},
    mc_event_row{REG_MC_CHARGIN_STATUS, "recv REG_MC_CHARGIN_STATUS\n", nullptr},
    mc_event_row{REG_MC_EVENT_POWER_OFF_CHARGE, "recv REG_MC_EVENT_POWER_OFF_CHARGE \n", nullptr},
    mc_event_row{REG_MC_BATTERY_VALUE, "recv REG_MC_BATTERY_VALUE\n", nullptr},
};
// clang-format on

constexpr auto white_steps = std::array{
    led_step{LED_WIFI_BLUE, LED_OP_ON, 0, 0, 2},
    led_step{LED_NET_WHITE, LED_OP_ON, 0, 0, 2},
    led_step{LED_SIG_BLUE,  LED_OP_ON, 0, 0, 3},
};

void kiv_singlechip_led_handle_mc_event(uint32_t event)
{
    kiv_led_run_mc_event(mc_event_rows, event, led_log_source);
}

void kiv_singlechip_led_handle_sleep_status_change(int sleep_status)
{
    LED_INFO("enter kiv_singlechip_led_handle_sleep_status_change sleep_status=%d\n", sleep_status);
    if (sleep_status == sleep_status_asleep) {
        LED_INFO("start power led breathe \n");
        cur_led_sleep_status = 1;
        kiv_led_end_data_limit();
        kiv_singlechip_led_set_all_leds_off_when_sleep();
        return;
    }
    LED_INFO(" start wakeup \n");
    cur_led_sleep_status = 0;
    kiv_singlechip_led_set_led_when_wakeup();
}

void kiv_led_singlechip_init()
{
    recv_nwNetType();
    recv_nwSigStatus();
    kiv_led_set_led_wifi_init();
}

void kiv_singelchip_led_set_led_when_power_on()
{
    LED_INFO("enter kiv_singelchip_led_set_led_when_power_on\n");
    led_power_state = POWER_ON;
    kiv_led_set_power_led_operation(LED_POWER_BLUE, LED_OP_ON, 0, 0, 2);
    kiv_led_singlechip_init();
}

void kiv_singelchip_led_set_led_when_power_off()
{
    LED_INFO("enter kiv_singelchip_led_set_led_when_power_off\n");
    if (led_power_state == POWER_RESETTING) {
        LED_INFO("Now is ressetting, needn't close led\n");
        return;
    }
    led_power_state = POWER_OFF;
    kiv_led_end_data_limit();
    kiv_singlechip_330x_led_set_all_leds_off();
}

void kiv_singelchip_led_set_led_when_resetting()
{
    LED_INFO("enter kiv_singelchip_led_set_led_when_resetting\n");
    led_power_state = POWER_RESETTING;
    kiv_led_end_data_limit();
    kiv_singlechip_330x_led_set_all_leds_off();
    kiv_singlechip_led_set_all_white_leds_on();
}

void kiv_singlechip_330x_led_set_all_leds_off()
{
    LED_INFO("enter kiv_singlechip_330x_led_set_all_leds_off\n");
    kiv_led_set_power_led_off();
    kiv_led_set_wifi_led_off();
    kiv_led_set_net_led_off();
    kiv_led_set_sig_led_off();
}

void kiv_singlechip_led_set_all_white_leds_on()
{
    LED_INFO("kiv_singlechip_led_set_all_white_leds_on start!\n");
    kiv_led_set_power_led_operation(LED_POWER_BLUE, LED_OP_ON, 0, 0, 2);
    for (const led_step &step : white_steps) {
        kiv_led_apply(kiv_led_set_led_operation, step);
    }
}

void kiv_singlechip_led_set_led_when_wakeup()
{
    LED_INFO("enter kiv_singlechip_led_set_led_when_wakeup\n");
    kiv_set_net_led_state(led_net_type, led_ppp_state);
    recv_nwNetType();
    kiv_singlechip_led_set_sigal_status(led_signal_level);
    recv_nwSigStatus();
    kiv_led_handle_pppStatus(led_ppp_state);
}

void kiv_singlechip_led_set_all_leds_off_when_sleep()
{
    LED_INFO("enter kiv_singlechip_led_set_all_leds_off_when_sleep\n");
    kiv_led_set_net_led_off();
    kiv_led_set_sig_led_off();
}
