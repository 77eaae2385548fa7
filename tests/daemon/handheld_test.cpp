// The handheld: power, sleep, battery.
#include "harness.h"

#include <climits>

static void battery(const char *exist, const char *charging, const char *percent)
{
    nv("battery_exist", exist);
    nv("battery_charging", charging);
    nv("battery_value", percent);
    notify(KIV_MODULE_MAIN, REG_MC_BATTERY_VALUE);
}

// On, in a data call whose allowance is used up, with a message that has just come.
static void in_the_middle_of_everything()
{
    switched_on(LED_PRODUCT_UFI);
    led_net_type = 4;
    nv("data_volume_limit_switch", "1");
    nv("data_volume_limit_unit", "data");
    nv("monthly_tx_bytes", "1");
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    fire_timers(5000);
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS);
    expect_effects(R"(
        only net_blue on 2
        timer 5000 repeat
        timer 1000 repeat
        only sms_blue blink 800/1200 4
        timer 10000 once)");
}

DEVICE_TEST(handheld, ShuttingDown)
{
    in_the_middle_of_everything();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_SHUTTING_DOWN);
    expect_effects(R"(
        deleted timer 1000
        deleted timer 5000
        deleted timer 10000
        handheld off
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4096" 8)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_SHUTTING_DOWN \n"
        info "enter kiv_led_set_led_when_power_off\n"
        info "enter kiv_set_net_led_state type=0 , ppp=1\n"
        info "enter kiv_led_del_new_sms_timer"
        info "enter kiv_led_set_all_leds_off\n"
        info "kiv_led_send_common_reverser_msg: send common reverser success.\n")");
    EXPECT_EQ(int{led_power_state}, POWER_OFF);
    EXPECT_EQ(int{led_sms_state}, SMS_UNREAD);
    EXPECT_EQ(int{led_net_type}, 0) << "the next class counts as a change";
}

DEVICE_TEST(handheld, ShuttingDownWhileResettingKeepsTheScene)
{
    in_the_middle_of_everything();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_RESETTING);
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        handheld off
        bat_green on 4
        id_41 on 4
        sms_blue on 4
        net_red on 4
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4097" 8)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_RESETTING \n"
        info "enter kiv_led_set_led_when_resetting\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_led_set_all_leds_off\n"
        info "enter kiv_led_set_all_leds_on\n"
        info "kiv_led_send_common_reverser_msg: send common reverser success.\n")");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_SHUTTING_DOWN);
    expect_effects(R"(
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4096" 8)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_SHUTTING_DOWN \n"
        info "enter kiv_led_set_led_when_power_off\n"
        info "Now is ressetting, needn't close led\n"
        info "kiv_led_send_common_reverser_msg: send common reverser success.\n")");
    EXPECT_EQ(int{led_power_state}, POWER_RESETTING);
}

DEVICE_TEST(handheld, RestartingKeepsTheState)
{
    in_the_middle_of_everything();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_RESTARTING);
    expect_effects("handheld off");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_RESTARTING \n"
        info "enter kiv_led_set_all_leds_off\n")");
    EXPECT_EQ(int{led_power_state}, POWER_ON);
}

DEVICE_TEST(handheld, OffAndCharging)
{
    in_the_middle_of_everything();
    nv("battery_exist", "1");
    nv("battery_charging", "1");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_CHARGE);
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        handheld off
        only bat_green blink 800/1200 4)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_POWER_OFF_CHARGE \n"
        info "enter kiv_led_set_led_when_power_off_charge\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_led_set_all_leds_off\n"
        info "kiv_led_query_battery_state battery_charging = 1"
        info "enter kiv_led_set_led_when_charging_status_change charging_status=1\n"
        info "power green blink\n")");
    EXPECT_EQ(int{led_power_state}, POWER_OFF_CHARGE);
}

DEVICE_TEST(handheld, QuicklyOffAndCharging)
{
    in_the_middle_of_everything();
    nv("battery_exist", "1");
    nv("battery_charging", "2");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN);
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        handheld off
        only bat_green on 4)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN\n"
        info "enter kiv_led_set_led_when_power_off_charge_quicken\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_led_set_all_leds_off\n"
        info "kiv_led_query_battery_state battery_charging = 2"
        info "enter kiv_led_set_led_when_charging_status_change charging_status=2\n"
        info "power green on\n")");
    EXPECT_EQ(int{led_power_state}, POWER_OFF_CHARGE_QUICKEN);
}

DEVICE_TEST(handheld, OffForTheEyeThenQuicklyOff)
{
    in_the_middle_of_everything();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_UNREADL);
    expect_effects("handheld off");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_POWER_OFF_UNREADL \n"
        info "enter kiv_led_set_led_when_power_off_unreal\n"
        info "enter kiv_led_set_all_leds_off\n")");
    EXPECT_EQ(int{led_power_state}, POWER_OFF_UNREAL);
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN);
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        handheld off)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_POWER_OFF_QUICKEN\n"
        info "enter kiv_led_set_led_when_power_off_quicken\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_led_set_all_leds_off\n")");
    EXPECT_EQ(int{led_power_state}, POWER_OFF_QUICKEN);
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK); // the same again, and answered
    expect_effects(R"(
        handheld off
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4104" 8)");
    fire_timers(10000); // the new message turns steady all the same
    expect_effects("only sms_blue on 4");
}

DEVICE_TEST(handheld, SelfTest)
{
    switched_on(LED_PRODUCT_UFI);
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_INITAL);
    expect_effects(R"(
        bat_green off
        bat_red on 4
        id_41 on 4
        sms_blue on 4
        net_14 on 4
        sleep 200000 us
        id_41 off
        sms_blue off
        net_14 off)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_EVENT_INITAL\n")");
}

DEVICE_TEST(handheld, EveryCallOfAPowerOn)
{
    switched_on(LED_PRODUCT_UFI);
    led_power_state = POWER_OFF;
    nv("battery_exist", "1");
    nv("battery_value", "80");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
    expect_calls(R"(
        info kiv_mirta_led "recv REG_MC_EVENT_POWERON \n"
        info kiv_mirta_led "enter kiv_led_set_led_when_power_on\n"
        info kiv_mirta_led "enter kiv_ledstartupdate_stop_rolling_leds\n"
        info kiv_mirta_led "bsp ready, needn't stop rolling leds\n"
        nv battery_charging 64
        nv battery_exist 64
        info kiv_mirta_led "kiv_led_query_battery_state battery_charging = 0"
        info kiv_mirta_led "enter kiv_led_set_led_when_charging_status_change charging_status=0\n"
        info kiv_mirta_led "enter kiv_led_set_led_when_power_percent_change\n"
        nv battery_value 64
        info kiv_mirta_led "kiv_led_set_led_when_power_percent_change buf_percent = 80"
        info kiv_mirta_led "power green on,power_percent=80\n"
        info kiv_mirta_led_operation "enter kiv_led_set_bat_led_operation led_id=1,led_operation=0\n"
        info kiv_mirta_led_operation "kiv_led_set_bat_led_off"
        only bat_green on 4
        nv sim_states 64
        info kiv_mirta_led "[NVinfo]sim_states: \n"
        info kiv_mirta_led "kiv_led_handle_sms_state:sms_state=: 0 \n "
        info kiv_mirta_led_operation "kiv_led_set_sms_led_off"
        sms off
        info kiv_mirta_led_operation "enter kiv_led_set_sms_led_operation led_id=50,led_operation=1\n"
        sms_blue off
        info kiv_mirta_led "enter kiv_set_net_led_state type=0 , ppp=0\n"
        nv network_type 64
        error kiv_mirta_led "recv nettype \n"
        info kiv_mirta_led "enter kiv_led_handle_nwinfoStatus : 1\n "
        info kiv_mirta_led "kiv_set_net_led_state :state changed!\n"
        info kiv_mirta_led "enter kiv_set_net_led_state type=1 , ppp=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_operation led_id=13,led_operation=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_off\n"
        only net_red on 2
        info kiv_mirta_led "enter kiv_led_set_led_wifi_init\n"
        nv wifi_onoff_state 64
        info kiv_mirta_led "WIFI status: \n"
        info kiv_mirta_led "enter kiv_led_set_led_wifi_status wifi_status=0, cur_led_sleep_status=0\n"
        info kiv_mirta_led "wifi led off\n"
        info kiv_mirta_led_operation "kiv_led_set_wifi_led_off"
        wifi_blue off)");
}

// How long the daemon waits at power-on for the board's animation to end.
static void expect_wait(std::deque<std::string> animation, size_t pauses, const char *line)
{
    on_a_fresh_device(line, [animation, pauses, line] {
        switched_on(LED_PRODUCT_UFI);
        led_bsp_ready = 0;
        fake_platform().rolling_leds = animation;
        notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
        std::string expected = "shell echo 1 > /sys/class/leds/led:rolling_leds/brightness\n";
        for (size_t i = 0; i < pauses; ++i) {
            expected += "sleep 50000 us\n";
        }
        expect_effects(expected + R"(
            bat off
            only sms_blue off
            only net_red on 2
            wifi_blue off)");
        expect_errors(std::string("error kiv_mirta_led \"") + line + "\"\nerror kiv_mirta_led \"recv nettype \\n\"");
        EXPECT_EQ(int{led_bsp_ready}, 1) << "not waited for again";
    });
}

TEST(handheld, PowerOnWaitsForTheAnimation)
{
    expect_wait({"2"}, 0, R"(i=0, bsp sync rolling led cost time = 0 ms\n)");
    expect_wait({"1", "2"}, 1, R"(i=1, bsp sync rolling led cost time = 50 ms\n)");
    expect_wait({"0"}, 100, R"(i=100, bsp sync rolling led cost time = 5000 ms\n)");
}

DEVICE_TEST(handheld, FallsAsleepAndWakesUp)
{
    in_the_middle_of_everything();
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "1");
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000
        deleted timer 10000
        handheld off
        only bat_green blink 300/5000 4)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_SLEEP_STATUS_EVENT p_data=1\n"
        info "enter kiv_led_set_led_when_sleep_status_change sleep_status=1\n"
        info "start power led breathe \n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info "enter kiv_led_del_new_sms_timer"
        info "enter kiv_led_set_all_leds_off\n"
        info " power led blink \n")");

    notify(KIV_MODULE_MAIN, REG_MC_CHARGIN_STATUS);
    nv("network_type", "SA");
    notify(KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE);
    expect_effects("net off"); // as the handler leaves it
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_CHARGIN_STATUS\n"
        info "recv_battery_state, KIV_LED_SLEEP"
        info "recv  REG_NWINFO_NETTYPE \n"
        error "recv nettype SA\n"
        info "enter kiv_led_handle_nwinfoStatus : 5\n "
        info "enter kiv_led_handle_nwinfoStatus, sleep mode \n ")");

    nv("RadioOff", "1");
    nv("WscModeOption", "0");
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "5"); // all but 1 is awake
    expect_effects(R"(
        bat off
        only net_blue on 2
        only net_white on 2
        wifi_blue on 2
        only sms_blue on 4)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_SLEEP_STATUS_EVENT p_data=5\n"
        info "enter kiv_led_set_led_when_sleep_status_change sleep_status=5\n"
        info " start wakeup \n"
        info "enter kiv_led_set_led_when_wakeup\n"
        info "kiv_led_query_battery_state battery_charging = 3"
        info "enter kiv_led_set_led_when_charging_status_change charging_status=3\n"
        info "enter kiv_set_net_led_state type=4 , ppp=1\n"
        error "recv nettype SA\n"
        info "enter kiv_led_handle_nwinfoStatus : 5\n "
        info "kiv_set_net_led_state :state changed!\n"
        info "enter kiv_set_net_led_state type=5 , ppp=1\n"
        info "enter kiv_led_set_led_wakeup_wlan\n"
        info "WIFI status: 1\n"
        info "WPS status: 0\n"
        info "enter kiv_led_set_led_wifi_status wifi_status=1, cur_led_sleep_status=0\n"
        info "wifi blue on\n"
        info "kiv_led_handle_sms_state:sms_state=: 1 \n ")");
    EXPECT_EQ(int{cur_led_sleep_status}, 0);
}

DEVICE_TEST(handheld, SleepWhileOffIsKeptAsItCame)
{
    switched_on(LED_PRODUCT_UFI);
    led_power_state = POWER_OFF;
    const auto kept = [](const char *text) {
        notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, text);
        return int{cur_led_sleep_status};
    };
    EXPECT_EQ(kept("1"), 1);
    expect_log("kiv_mirta_led", R"(
        info "recv REG_SLEEP_STATUS_EVENT p_data=1\n"
        info "enter kiv_led_set_led_when_sleep_status_change sleep_status=1\n"
        info "kiv_led_handle_sleep_status_change:  not power on !\n ")");
    EXPECT_EQ(kept("99999999999999999999"), INT_MAX);
    EXPECT_EQ(kept("-99999999999"), INT_MIN);
    EXPECT_EQ(kept("x"), 0);
}

DEVICE_TEST(handheld, BatteryThresholds)
{
    const auto shows = [](const std::string &percent, const std::string &line, const std::string &led) {
        battery("1", "0", percent.c_str());
        expect_effects("bat off\n" + led);
        expect_log("kiv_mirta_led", R"(
            info "recv REG_MC_BATTERY_VALUE\n"
            info "kiv_led_query_battery_state battery_charging = 0"
            info "enter kiv_led_set_led_when_charging_status_change charging_status=0\n"
            info "enter kiv_led_set_led_when_power_percent_change\n"
            info "kiv_led_set_led_when_power_percent_change buf_percent = )" +
                                        percent + "\"\ninfo \"" + line + "\\n\"");
    };
    switched_on(LED_PRODUCT_UFI);
    shows("12", "power red blink,power_percent=12", "bat_red blink 800/1200 4");
    shows("13", "power red on,power_percent=13", "bat_red on 4");
    shows("23", "power red on,power_percent=23", "bat_red on 4");
    shows("24", "power green on,power_percent=24", "bat_green on 4");
    shows("-1", "power red blink,power_percent=-1", "bat_red blink 800/1200 4");
    shows("?", "power red blink,power_percent=0", "bat_red blink 800/1200 4");
    shows("9999999999999999999", "power green on,power_percent=2147483647", "bat_green on 4");
}

DEVICE_TEST(handheld, BatteryChargingChargedOrNone)
{
    switched_on(LED_PRODUCT_UFI);
    battery("1", "1", "5");
    battery("1", "2", "5");
    battery("0", "1", "5");
    battery("1", "4", "5");
    expect_effects(R"(
        only bat_green blink 800/1200 4
        only bat_green on 4
        bat off)");
}

// Sleep is looked at first, whatever the power state.
DEVICE_TEST(handheld, BatteryGuards)
{
    switched_on(LED_PRODUCT_UFI);
    cur_led_sleep_status = 1;
    led_power_state = POWER_OFF;
    battery("1", "2", "5");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_MC_BATTERY_VALUE\n"
        info "recv_battery_state, KIV_LED_SLEEP")");

    cur_led_sleep_status = 0;
    for (const int state : {POWER_NOT_YET, POWER_OFF, POWER_OFF_UNREAL, POWER_OFF_QUICKEN, POWER_RESETTING}) {
        led_power_state = state;
        battery("1", "2", "5");
        expect_effects("");
    }
    for (const int state : {POWER_OFF_CHARGE, POWER_OFF_CHARGE_QUICKEN}) {
        led_power_state = state;
        battery("1", "2", "5");
        expect_effects("only bat_green on 4");
    }
}
