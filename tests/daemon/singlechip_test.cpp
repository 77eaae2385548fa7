// The single-chip terminal: power, sleep, relight.
#include "harness.h"
#include "policy/singlechip/setters.h"

static void on_with_lte()
{
    switched_on(LED_PRODUCT_UNI_CORE_CPE);
    nv("network_type", "LTE");
    nv("signalbar", "2");
    nv("wifi_onoff_state", "1");
}

// On, in a data call whose allowance is used up.
static void reminding()
{
    on_with_lte();
    led_net_type = 4;
    nv("data_volume_limit_switch", "1");
    nv("data_volume_limit_unit", "time");
    nv("monthly_time", "1");
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    fire_timers(5000);
    expect_effects(R"(
        only net_blue on 2
        timer 5000 repeat
        timer 1000 repeat)");
}

DEVICE_TEST(single_chip, PowerOn)
{
    on_with_lte();
    led_power_state = POWER_NOT_YET;
    led_bsp_ready = 0;
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
    expect_effects(R"(
        power_blue on 2
        only net_blue on 2
        sig_blue on 2
        wifi_blue on 2)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_POWERON \n"
        info "enter kiv_singelchip_led_set_led_when_power_on\n"
        error "recv nettype LTE\n"
        info "enter kiv_led_handle_nwinfoStatus : 4\n "
        info "kiv_set_net_led_state :state changed!\n"
        info "enter kiv_set_net_led_state type=4 , ppp=0\n"
        info "recv_nwSigStatus :2"
        info "kiv_led_handle_signal_state :2"
        info "kiv_qt330x_set_led_signal_state: sig = 2"
        info "enter kiv_led_set_led_wifi_init\n"
        info "WIFI status: 1\n"
        info "enter kiv_led_set_led_wifi_status wifi_status=1, cur_led_sleep_status=0\n"
        info "wifi blue on\n")");
    EXPECT_EQ(int{led_power_state}, POWER_ON);
}

DEVICE_TEST(single_chip, ShuttingDown)
{
    reminding();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_SHUTTING_DOWN);
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        power_blue off
        wifi_blue off
        net off
        sig_blue off
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4096" 8)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_SHUTTING_DOWN \n"
        info "enter kiv_singelchip_led_set_led_when_power_off\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_singlechip_330x_led_set_all_leds_off\n"
        info "kiv_led_send_common_reverser_msg: send common reverser success.\n")");
    EXPECT_EQ(int{led_power_state}, POWER_OFF);
}

DEVICE_TEST(single_chip, ShuttingDownWhileResettingKeepsAllWhite)
{
    reminding();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_RESETTING);
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        power_blue off
        wifi_blue off
        net off
        sig_blue off
        power_blue on 2
        wifi_blue on 2
        net_white on 2
        sig_blue on 3
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4097" 8)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_RESETTING \n"
        info "enter kiv_singelchip_led_set_led_when_resetting\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_singlechip_330x_led_set_all_leds_off\n"
        info "kiv_singlechip_led_set_all_white_leds_on start!\n"
        info "kiv_led_send_common_reverser_msg: send common reverser success.\n")");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_SHUTTING_DOWN);
    expect_effects(R"(
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4096" 8)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_SHUTTING_DOWN \n"
        info "enter kiv_singelchip_led_set_led_when_power_off\n"
        info "Now is ressetting, needn't close led\n"
        info "kiv_led_send_common_reverser_msg: send common reverser success.\n")");
    EXPECT_EQ(int{led_power_state}, POWER_RESETTING);
}

DEVICE_TEST(single_chip, RestartingKeepsTheState)
{
    reminding();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_RESTARTING);
    expect_effects(R"(
        power_blue off
        wifi_blue off
        net off
        sig_blue off)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_RESTARTING \n"
        info "enter kiv_singlechip_330x_led_set_all_leds_off\n")");
    EXPECT_EQ(int{led_power_state}, POWER_ON);
}

DEVICE_TEST(single_chip, UnrealIsOff)
{
    reminding();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_UNREADL);
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        power_blue off
        wifi_blue off
        net off
        sig_blue off)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_POWER_OFF_UNREADL \n"
        info "enter kiv_singelchip_led_set_led_when_power_off\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_singlechip_330x_led_set_all_leds_off\n")");
    EXPECT_EQ(int{led_power_state}, POWER_OFF);
}

DEVICE_TEST(single_chip, HearsOfABatteryAndShowsNothing)
{
    on_with_lte();
    for (const uint32_t event :
         {REG_MC_CHARGIN_STATUS, REG_MC_BATTERY_VALUE, REG_MC_EVENT_POWER_OFF_CHARGE, REG_MC_EVENT_INITAL,
          REG_MC_EVENT_POWER_OFF_QUICKEN, REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK}) {
        notify(KIV_MODULE_MAIN, event);
    }
    expect_effects("");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_CHARGIN_STATUS\n"
        info "recv REG_MC_BATTERY_VALUE\n"
        info "recv REG_MC_EVENT_POWER_OFF_CHARGE \n")");
    EXPECT_EQ(int{led_power_state}, POWER_ON);
}

DEVICE_TEST(single_chip, SleepIsFive)
{
    reminding();
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "5");
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        net off
        sig_blue off)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_SLEEP_STATUS_EVENT p_data=5\n"
        info "enter kiv_singlechip_led_handle_sleep_status_change sleep_status=5\n"
        info "start power led breathe \n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_singlechip_led_set_all_leds_off_when_sleep\n")");
    EXPECT_EQ(int{cur_led_sleep_status}, 1);

    notify(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR);
    expect_effects("");
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "1"); // awake
    expect_effects(R"(
        only net_blue on 2
        sig_6 off
        sig_blue on 2
        timer 5000 repeat)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_SLEEP_STATUS_EVENT p_data=1\n"
        info "enter kiv_singlechip_led_handle_sleep_status_change sleep_status=1\n"
        info " start wakeup \n"
        info "enter kiv_singlechip_led_set_led_when_wakeup\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        error "recv nettype LTE\n"
        info "enter kiv_led_handle_nwinfoStatus : 4\n "
        info "kiv_set_net_led_state :state same!\n"
        info "recv_nwSigStatus :2"
        info "kiv_led_handle_signal_state :2"
        info "kiv_qt330x_set_led_signal_state: sig = 2")");
    expect_log("kiv_led_data_limit", R"(
        info "[info] enter the pppStatus fun p_data:1\n"
        info "[info]PPP connect, start check data remind\n"
        info "[IN FUNC]:kiv_led_start_remind_data_limit_check\n")");
    EXPECT_EQ(int{cur_led_sleep_status}, 0);
}

DEVICE_TEST(single_chip, SleepsAlsoWhileOff)
{
    on_with_lte();
    led_power_state = POWER_OFF;
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "5");
    expect_effects(R"(
        net off
        sig_blue off)");
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "0");
    expect_effects("sig_6 off");
}

// What is remembered of the signal shows on an LED of its own at wake-up.
DEVICE_TEST(single_chip, SignalStatusAtWakeUp)
{
    for (int state = -1; state <= 6; ++state) {
        step([state] { kiv_singlechip_led_set_sigal_status(state); });
    }
    expect_effects(R"(
        sig_6 off
        sig_6 blink 800/1200 4
        sig_6 on 4
        sig_6 on 4
        sig_6 on 4
        sig_6 on 4)");
    step([] { kiv_singlechip_led_set_sigal_status(1); });
    expect_log("kiv_mirta_led_set_status_singlechip",
               R"(info "enter kiv_singlechip_led_set_sigal_status signal_state=1\n")");
}

DEVICE_TEST(single_chip, Relight)
{
    on_with_lte();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
    nv("wifi_chip2_wps_state", "1");
    expect_effects(R"(
        power_blue on 2
        only net_blue on 2
        sig_blue on 2
        wifi_blue on 2)");
    command(KIV_MSG_CMD_LED_RELIGHT_MSG);
    expect_effects(R"(
        sig_blue on 2
        power_blue on 2
        wifi_blue blink 400/1600 2
        only net_blue on 2)");
    expect_log("kiv_mirta_led", R"(
        error "Enter kiv_led_handle_relight_msg"
        error "kiv_cpe_led_relight_signal_state, NOT OVER TEMP!"
        info "kiv_qt330x_set_led_signal_state: sig = 2"
        info "WIFI status: 1  WPS status: ,1\n"
        info "WPS active, wifi blue blink 2 mins\n"
        info "enter kiv_set_net_led_state type=4 , ppp=0\n"
        error "Exit kiv_led_handle_relight_msg")");

    cur_led_sleep_status = 1; // only the Wi-Fi LED stays dark
    command(KIV_MSG_CMD_LED_RELIGHT_MSG);
    expect_effects(R"(
        sig_blue on 2
        power_blue on 2
        wifi_blue off
        only net_blue on 2)");

    led_power_state = POWER_OFF_CHARGE;
    command(KIV_MSG_CMD_LED_RELIGHT_MSG);
    expect_effects("");
    expect_log("kiv_mirta_led", R"(
        error "Enter kiv_led_handle_relight_msg"
        error "Power OFF, Ignore relight msg!!")");
}

DEVICE_TEST(single_chip, EveryCallOfARelightWhileTooHot)
{
    switched_on(LED_PRODUCT_UNI_CORE_CPE);
    over_temp_enable = 1;
    is_over_temp = 1;
    command(KIV_MSG_CMD_LED_RELIGHT_MSG);
    expect_calls(R"(
        error kiv_mirta_led "Enter kiv_led_handle_relight_msg"
        error kiv_mirta_led "kiv_cpe_led_relight_signal_state, OVER TEMP!"
        info kiv_mirta_led_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=2\n"
        sig_blue blink 1000/1000 3
        info kiv_mirta_led_operation "enter kiv_led_set_power_led_operation led_id=52,led_operation=0\n"
        power_blue on 2
        nv wifi_onoff_state 64
        nv wifi_chip1_wps_state 64
        nv wifi_chip2_wps_state 64
        info kiv_mirta_led "WIFI status:   WPS status: ,\n"
        info kiv_mirta_led "wifi_wps_state: wifi led off\n"
        info kiv_mirta_led "wifi led off\n"
        info kiv_mirta_led_operation "kiv_led_set_wifi_led_off"
        wifi_blue off
        info kiv_mirta_led "enter kiv_set_net_led_state type=0 , ppp=0\n"
        error kiv_mirta_led "Exit kiv_led_handle_relight_msg")");
}
