#include "policy/singlechip/scenes.h"

#include "alarms/kiv_led_data_limit.h"
#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/reverser.h"
#include "kiv/adabsp.h"
#include "kiv/reg.h"
#include "kiv/socket.h"
#include "output/led_groups.h"
#include "painters/net_led.h"
#include "policy/common/data_call.h"
#include "policy/common/network.h"
#include "policy/common/wifi.h"
#include "policy/singlechip/setters.h"

#include <array>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";
constexpr int SLEEP_STATUS_ASLEEP = 5; // on this product 1 is a wake-up

constexpr auto white_steps = std::array{
    led_step{LED_WIFI_BLUE, LED_OP_ON, 0, 0, 2},
    led_step{LED_NET_WHITE, LED_OP_ON, 0, 0, 2},
    led_step{LED_SIG_BLUE,  LED_OP_ON, 0, 0, 3},
};

// Power, Wi-Fi, net and signal; the phone LED and the SMS LED stay as they are.
static void kiv_singlechip_330x_led_set_all_leds_off()
{
    LED_INFO("enter kiv_singlechip_330x_led_set_all_leds_off\n");
    kiv_led_set_power_led_off();
    kiv_led_set_wifi_led_off();
    kiv_led_set_net_led_off();
    kiv_led_set_sig_led_off();
}

static void kiv_singlechip_led_set_all_white_leds_on()
{
    LED_INFO("kiv_singlechip_led_set_all_white_leds_on start!\n");
    kiv_led_set_power_led_operation(LED_POWER_BLUE, LED_OP_ON, 0, 0, 2);
    for (const led_step &step : white_steps) {
        kiv_led_set_led_operation(step);
    }
}

static void kiv_singelchip_led_set_led_when_power_on()
{
    LED_INFO("enter kiv_singelchip_led_set_led_when_power_on\n");
    led_power_state = POWER_ON;
    kiv_led_set_power_led_operation(LED_POWER_BLUE, LED_OP_ON, 0, 0, 2);
    kiv_led_singlechip_init();
}

static void kiv_singelchip_led_set_led_when_power_off()
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

static void kiv_singelchip_led_set_led_when_resetting()
{
    LED_INFO("enter kiv_singelchip_led_set_led_when_resetting\n");
    led_power_state = POWER_RESETTING;
    kiv_led_end_data_limit();
    kiv_singlechip_330x_led_set_all_leds_off();
    kiv_singlechip_led_set_all_white_leds_on();
}

static void kiv_singlechip_led_set_led_when_wakeup()
{
    LED_INFO("enter kiv_singlechip_led_set_led_when_wakeup\n");
    kiv_set_net_led_state(led_net_type, led_ppp_state);
    recv_nwNetType();
    kiv_singlechip_led_set_sigal_status(led_signal_level);
    recv_nwSigStatus();
    kiv_led_handle_pppStatus(led_ppp_state);
}

static void kiv_singlechip_led_set_all_leds_off_when_sleep()
{
    LED_INFO("enter kiv_singlechip_led_set_all_leds_off_when_sleep\n");
    kiv_led_set_net_led_off();
    kiv_led_set_sig_led_off();
}

void kiv_singlechip_led_handle_mc_event(uint32_t event)
{
    switch (event) {
    case REG_MC_EVENT_POWERON:
        LED_INFO("recv REG_MC_EVENT_POWERON \n");
        kiv_singelchip_led_set_led_when_power_on();
        break;
    case REG_MC_EVENT_SHUTTING_DOWN:
        LED_INFO("recv REG_MC_EVENT_SHUTTING_DOWN \n");
        kiv_singelchip_led_set_led_when_power_off();
        kiv_led_send_common_reverser_msg(KIV_MODULE_MAIN, REVERSER_SHUTTING_DOWN);
        break;
    case REG_MC_EVENT_RESETTING:
        LED_INFO("recv REG_MC_EVENT_RESETTING \n");
        kiv_singelchip_led_set_led_when_resetting();
        kiv_led_send_common_reverser_msg(KIV_MODULE_MAIN, REVERSER_RESETTING);
        break;
    case REG_MC_EVENT_RESTARTING:
        LED_INFO("recv REG_MC_EVENT_RESTARTING \n");
        kiv_singlechip_330x_led_set_all_leds_off();
        break;
    case REG_MC_EVENT_POWER_OFF_UNREADL:
        LED_INFO("recv REG_MC_EVENT_POWER_OFF_UNREADL \n");
        kiv_singelchip_led_set_led_when_power_off();
        break;
    case REG_MC_CHARGIN_STATUS:
        LED_INFO("recv REG_MC_CHARGIN_STATUS\n");
        break;
    case REG_MC_EVENT_POWER_OFF_CHARGE:
        LED_INFO("recv REG_MC_EVENT_POWER_OFF_CHARGE \n");
        break;
    case REG_MC_BATTERY_VALUE:
        LED_INFO("recv REG_MC_BATTERY_VALUE\n");
        break;
    default: // of no concern to the LEDs of this product
        break;
    }
}

void kiv_singlechip_led_handle_sleep_status_change(int sleep_status)
{
    LED_INFO("enter kiv_singlechip_led_handle_sleep_status_change sleep_status=%d\n", sleep_status);
    if (sleep_status == SLEEP_STATUS_ASLEEP) {
        LED_INFO("start power led breathe \n");
        cur_led_sleep_status = ASLEEP;
        kiv_led_end_data_limit();
        kiv_singlechip_led_set_all_leds_off_when_sleep();
        return;
    }
    LED_INFO(" start wakeup \n");
    cur_led_sleep_status = AWAKE;
    kiv_singlechip_led_set_led_when_wakeup();
}

void kiv_led_singlechip_init()
{
    recv_nwNetType();
    recv_nwSigStatus();
    kiv_led_set_led_wifi_init();
}
