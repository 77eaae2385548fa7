#include "policy/standard/scenes.h"

#include "alarms/kiv_led_data_limit.h"
#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/reverser.h"
#include "ground/rolling_leds.h"
#include "kiv/adabsp.h"
#include "kiv/reg.h"
#include "kiv/socket.h"
#include "output/led_groups.h"
#include "painters/net_led.h"
#include "policy/common/network.h"
#include "policy/common/sms.h"
#include "policy/common/voice.h"
#include "policy/common/wifi.h"
#include "policy/products.h"

#include <array>
#include <span>
#include <unistd.h>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

constexpr int ROLLING_LEDS_POLL_MS = 50;
constexpr int ROLLING_LEDS_POLLS = 100;
constexpr int INITIAL_FLASH_MS = 200;
constexpr int SLEEP_STATUS_ASLEEP = 1;
constexpr int US_PER_MS = 1000;

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
constexpr auto flash_end_steps = std::array{
    led_step{LED_ID_41,    LED_OP_OFF, 0, 0, 0},
    led_step{LED_SMS_BLUE, LED_OP_OFF, 0, 0, 0},
    led_step{LED_NET_14,   LED_OP_OFF, 0, 0, 0},
};

static void set_leds(std::span<const led_step> steps)
{
    for (const led_step &step : steps) {
        kiv_led_set_led_operation(step);
    }
}

static void kiv_led_set_all_leds_off()
{
    LED_INFO("enter kiv_led_set_all_leds_off\n");
    kiv_led_set_bat_led_off();
    kiv_led_set_net_led_off();
    kiv_led_set_wifi_led_off();
    kiv_led_set_sms_led_off();
}

static void kiv_led_set_all_leds_on()
{
    LED_INFO("enter kiv_led_set_all_leds_on\n");
    set_leds(all_on_steps);
}

// The self-test flash; the receive thread waits meanwhile. The red battery LED stays lit.
static void kiv_led_set_led_when_initial()
{
    set_leds(flash_steps);
    usleep(INITIAL_FLASH_MS * US_PER_MS);
    set_leds(flash_end_steps);
}

// The board drives the LEDs until its animation has stopped; after 5 s the daemon takes them over all the same.
static void wait_for_bsp()
{
    int i = 0;

    while (kiv_led_bsp_ready() == 0 && i < ROLLING_LEDS_POLLS) {
        ++i;
        usleep(ROLLING_LEDS_POLL_MS * US_PER_MS);
    }
    LED_ERROR("i=%d, bsp sync rolling led cost time = %d ms\n", i, i * ROLLING_LEDS_POLL_MS);
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

// The board's animation ends first, so that the two do not draw over each other; then the state is on, because every
// indication that follows asks for it.
static void kiv_led_set_led_when_power_on()
{
    LED_INFO("enter kiv_led_set_led_when_power_on\n");
    kiv_ledstartupdate_stop_rolling_leds();
    led_power_state = POWER_ON;
    kiv_led_std_init();
}

// The reminder ends before the LEDs go dark: its end shows the net LED once more.
static void enter_power_state(power_state state)
{
    led_power_state = state;
    kiv_led_end_data_limit();
    kiv_led_set_all_leds_off();
}

static void kiv_led_set_led_when_power_off()
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

static void kiv_led_set_led_when_power_off_quicken()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_quicken\n");
    enter_power_state(POWER_OFF_QUICKEN);
}

static void kiv_led_set_led_when_power_off_charge()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_charge\n");
    enter_power_state(POWER_OFF_CHARGE);
    kiv_led_battery_query_dispatch();
}

static void kiv_led_set_led_when_power_off_charge_quicken()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_charge_quicken\n");
    enter_power_state(POWER_OFF_CHARGE_QUICKEN);
    kiv_led_battery_query_dispatch();
}

// Looks off while it stays up: its timers run on.
static void kiv_led_set_led_when_power_off_unreal()
{
    LED_INFO("enter kiv_led_set_led_when_power_off_unreal\n");
    led_power_state = POWER_OFF_UNREAL;
    kiv_led_set_all_leds_off();
}

static void kiv_led_set_led_when_resetting()
{
    LED_INFO("enter kiv_led_set_led_when_resetting\n");
    enter_power_state(POWER_RESETTING);
    kiv_led_set_all_leds_on();
}

// The sleep state comes last: a timer that runs meanwhile still counts as awake. All LEDs go dark before the battery
// LED breathes, since it is one of them.
static void fall_asleep()
{
    LED_INFO("start power led breathe \n");
    kiv_led_end_data_limit();
    kiv_led_settle_new_sms();
    kiv_led_set_all_leds_off();
    LED_INFO(" power led blink \n");
    kiv_led_set_bat_led_operation(LED_BAT_GREEN, LED_OP_BLINK, 300, 5000, 4);
    cur_led_sleep_status = ASLEEP;
}

// The net LED shows the class from before the sleep, then the one that NV names now, if it is another.
static void kiv_led_set_led_when_wakeup()
{
    LED_INFO("enter kiv_led_set_led_when_wakeup\n");
    kiv_led_battery_query_dispatch();
    kiv_set_net_led_state(led_net_type, led_ppp_state);
    recv_nwNetType();
    kiv_led_set_led_wakeup_wlan();
    kiv_led_handle_sms_state(led_sms_state);
}

void kiv_led_handle_mc_event(uint32_t event)
{
    switch (event) {
    case REG_MC_EVENT_POWERON:
        LED_INFO("recv REG_MC_EVENT_POWERON \n");
        kiv_led_set_led_when_power_on();
        break;
    case REG_MC_EVENT_SHUTTING_DOWN:
        LED_INFO("recv REG_MC_EVENT_SHUTTING_DOWN \n");
        kiv_led_set_led_when_power_off();
        kiv_led_send_common_reverser_msg(KIV_MODULE_MAIN, REVERSER_SHUTTING_DOWN);
        break;
    case REG_MC_EVENT_RESETTING:
        LED_INFO("recv REG_MC_EVENT_RESETTING \n");
        kiv_led_set_led_when_resetting();
        kiv_led_send_common_reverser_msg(KIV_MODULE_MAIN, REVERSER_RESETTING);
        break;
    case REG_MC_EVENT_RESTARTING:
        LED_INFO("recv REG_MC_EVENT_RESTARTING \n");
        kiv_led_set_all_leds_off();
        break;
    case REG_MC_EVENT_POWER_OFF_CHARGE:
        LED_INFO("recv REG_MC_EVENT_POWER_OFF_CHARGE \n");
        kiv_led_set_led_when_power_off_charge();
        break;
    case REG_MC_EVENT_POWER_OFF_UNREADL:
        LED_INFO("recv REG_MC_EVENT_POWER_OFF_UNREADL \n");
        kiv_led_set_led_when_power_off_unreal();
        break;
    case REG_MC_EVENT_POWER_OFF_QUICKEN:
        LED_INFO("recv REG_MC_EVENT_POWER_OFF_QUICKEN\n");
        kiv_led_set_led_when_power_off_quicken();
        break;
    case REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN:
        LED_INFO("recv REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN\n");
        kiv_led_set_led_when_power_off_charge_quicken();
        break;
    case REG_MC_EVENT_POWER_OFF_QUICKEN_ACK:
        kiv_led_set_led_when_power_off_quicken();
        kiv_led_send_common_reverser_msg(KIV_MODULE_MAIN, REVERSER_POWER_OFF_QUICKEN);
        break;
    case REG_MC_EVENT_INITAL:
        LED_INFO("recv REG_MC_EVENT_INITAL\n");
        kiv_led_set_led_when_initial();
        break;
    case REG_MC_CHARGIN_STATUS:
        LED_INFO("recv REG_MC_CHARGIN_STATUS\n");
        kiv_led_battery_query_dispatch();
        break;
    case REG_MC_BATTERY_VALUE:
        LED_INFO("recv REG_MC_BATTERY_VALUE\n");
        kiv_led_battery_query_dispatch();
        break;
    default: // of no concern to the LEDs of this product
        break;
    }
}

void kiv_led_set_led_when_sleep_status_change(int sleep_status)
{
    LED_INFO("enter kiv_led_set_led_when_sleep_status_change sleep_status=%d\n", sleep_status);
    if (led_power_state != POWER_ON) {
        LED_INFO("kiv_led_handle_sleep_status_change:  not power on !\n ");
        return;
    }
    if (sleep_status == SLEEP_STATUS_ASLEEP) {
        fall_asleep();
        return;
    }
    LED_INFO(" start wakeup \n");
    cur_led_sleep_status = AWAKE;
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
