#include "policy/cpe/scenes.h"

#include "ground/led_log.h"
#include "ground/reverser.h"
#include "kiv/reg.h"
#include "kiv/socket.h"
#include "policy/common/network.h"
#include "policy/cpe/battery.h"
#include "policy/cpe/setters.h"
#include "policy/cpe/state.h"
#include "policy/products.h"

#include <cstdlib>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led_cpe";

static void enter_power_state(power_state state)
{
    cur_cpe_power_state = state;
    kiv_cpe_led_set_all_leds_off();
}

static void power_wifi_leds()
{
    // Nothing depends on whether the board has this supply.
    // NOLINTNEXTLINE(cert-env33-c): the command is a constant, and the shell is how the board wants it written.
    [[maybe_unused]] const int result = std::system("echo 1 > /sys/class/leds/led:wifi_power_ctrl/brightness");
}

// Shows what is remembered, then reads it again: before the first network notification that is no service. What changed
// while the terminal was off was dropped, so roaming, network type and signal are read from NV, in the order in which
// each handler finds the others' values settled.
static void kiv_cpe_led_set_led_when_power_on()
{
    LED_INFO("enter kiv_led_set_led_when_power_on\n");
    cur_cpe_power_state = POWER_ON;
    getChargerConnect();
    kiv_cpe_led_set_bat_status(cur_cpe_battery_status, POWER_ON);
    kiv_cpe_led_handle_battery_state();
    kiv_cpe_set_led_sig_led_status(cur_cpe_net_type, cur_cpe_signal_state, cur_cpe_roam_status);
    kiv_cpe_set_led_net_led_status(cur_cpe_net_type, cur_cpe_roam_status);
    recv_nwRoamStatus();
    recv_nwNetType();
    recv_nwSigStatus();
    kiv_cpe_led_set_voicemail_status(cur_cpe_voicemail_state);
    power_wifi_leds();
}

static void kiv_cpe_led_set_led_when_power_off()
{
    LED_INFO("enter kiv_led_set_led_when_power_off\n");
    enter_power_state(POWER_OFF);
}

static void kiv_cpe_led_set_led_when_power_off_unreal()
{
    LED_INFO("enter kiv_cpe_led_set_led_when_power_off_unreal\n");
    enter_power_state(POWER_OFF_UNREAL);
}

// The battery LEDs end dark: their setter shows nothing unless the device is on. Only the power LED follows the
// charger.
static void kiv_cpe_led_set_led_when_power_off_charge()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_charge\n");
    enter_power_state(POWER_OFF_CHARGE);
    getChargerConnect();
    kiv_led_battery_query_dispatch();
    kiv_cpe_led_set_bat_status(cur_cpe_battery_status, POWER_OFF_CHARGE);
}

void kiv_cpe_led_handle_mc_event(uint32_t event)
{
    switch (event) {
    case REG_MC_EVENT_POWERON:
        LED_INFO("recv REG_MC_EVENT_POWERON \n");
        kiv_cpe_led_set_led_when_power_on();
        break;
    case REG_MC_EVENT_SHUTTING_DOWN:
        LED_INFO("recv REG_MC_EVENT_SHUTTING_DOWN \n");
        kiv_cpe_led_set_led_when_power_off();
        kiv_led_send_common_reverser_msg(KIV_MODULE_MAIN, REVERSER_SHUTTING_DOWN);
        break;
    case REG_MC_EVENT_RESTARTING:
        LED_INFO("recv REG_MC_EVENT_RESTARTING \n");
        kiv_cpe_led_set_all_leds_off();
        break;
    case REG_MC_EVENT_POWER_OFF_UNREADL:
        LED_INFO("recv REG_MC_EVENT_POWER_OFF_UNREADL \n");
        kiv_cpe_led_set_led_when_power_off_unreal();
        break;
    case REG_MC_EVENT_POWER_OFF_CHARGE:
        LED_INFO("recv REG_MC_EVENT_POWER_OFF_CHARGE \n");
        kiv_cpe_led_set_led_when_power_off_charge();
        break;
    case REG_MC_CHARGIN_STATUS:
        LED_INFO("recv REG_MC_CHARGIN_STATUS\n");
        kiv_cpe_led_handle_battery_state();
        break;
    case REG_MC_BATTERY_VALUE:
        LED_INFO("recv REG_MC_BATTERY_VALUE\n");
        kiv_cpe_led_handle_battery_state();
        break;
    default: // of no concern to the LEDs of this product
        break;
    }
}

void kiv_cpe_led_set_led_when_sleep_status_change(int sleep_status)
{
    LED_INFO("enter kiv_led_set_led_when_sleep_status_change sleep_status=%d\n", sleep_status);
}

void kiv_led_cpe_init()
{
    LED_INFO("kiv_led_cpe_init!");
    getChargerConnect();
    kiv_cpe_led_handle_battery_state();
    recv_nwNetType();
    recv_nwSigStatus();
}
