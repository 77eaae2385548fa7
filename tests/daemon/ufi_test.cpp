// The handheld: power scenes, sleep, battery.
#include "policy/standard/battery.h"

#include "harness.h"

#include <gtest/gtest.h>

static void on()
{
    product_on(LED_PRODUCT_UFI);
}

static void battery(const char *exist, const char *charging, const char *percent)
{
    nv("battery_exist", exist), nv("battery_charging", charging), nv("battery_value", percent);
    kiv_led_query_battery_state();
}

static void power_on_with(std::deque<std::string> rolling_leds)
{
    on(), led_bsp_ready = 0, led_power_state = POWER_NOT_YET;
    fake_platform().rolling_leds = std::move(rolling_leds);
    mc(0x40);
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(ufi, PowerEvents)
{
    expect_effects("shutting down, with a new SMS and a shown net",
        "delete 1 | handheld off |" + reverser + "4096\" | power 2 sleep 0 | net 0 sms 1",
        [] { on(); notify(5, 4); notify(23, 0x40); forget(); mc(0x20); note_power();
             fake_note("net " + std::to_string(led_net_type) + " sms " + std::to_string(led_sms_state)); });
    expect_effects("shutting down while resetting keeps the scene",
        "handheld off | led 1 on 4 | led 41 on 4 | led 50 on 4 | led 13 on 4 |" + reverser + "4097\" |" + reverser +
        "4096\" | power 7 sleep 0",
        [] { on(); mc(0x80); mc(0x20); note_power(); });
    expect_effects("restarting keeps the state", "handheld off | power 1 sleep 0",
        [] { on(); mc(0x100); note_power(); });
    expect_effects("charging and quick charging show the battery", R"(
        handheld off | bat off | led 1 blink 800/1200 4 | power 3 sleep 0 |handheld off | bat off
        led 1 blink 800/1200 4 | power 6 sleep 0)",
        [] { on(); nv("battery_exist", "1"); nv("battery_charging", "1"); mc(0x400); note_power(); mc(0x40000400);
             note_power(); });
    expect_effects("unreal keeps the SMS timer, quick answers only its ack",
        "handheld off | power 4 sleep 0 | handheld off | power 5 sleep 0 | handheld off |" + reverser + "4104\"",
        [] { on(); notify(5, 4); forget(); mc(0x800); note_power(); mc(0x40000200); note_power(); mc(0x40004000); });
    expect_effects("self-test flash", R"(
        led 1 off | led 0 on 4 | led 41 on 4 | led 50 on 4 | led 14 on 4 | usleep 200000 | led 41 off | led 50 off
        led 14 off | power 1 sleep 0)", [] { on(); mc(0x200); note_power(); });
    expect_effects("two events at once", "", [] { on(); mc(0x60); mc(0x10); });
}

TEST(ufi, PowerOn)
{
    const std::string shown = R"(bat off | sms off | led 50 off | net off | led 13 on 2 | led 43 off)";
    expect_calls("all calls, ready before", R"(
        recv 0 1036 | 6 "[info] enter messageParse fun\n" | 6 "recv_msg.us_source_module_id is 1"
        6 "recv_msg.us_cmd is 12034" | 6 "[info] msg MSG_CMD_SERVICE_NOTIFY \n"
        6 "regDecodeMsg source_id 1, mask1 64" | 6 "[info] source msg KIV_MODULE_MAIN\n"
        6 "recv REG_MC_EVENT_POWERON \n" | 6 "enter kiv_led_set_led_when_power_on\n"
        6 "enter kiv_ledstartupdate_stop_rolling_leds\n" | 6 "bsp ready, needn't stop rolling leds\n"
        nv battery_charging 64 | nv battery_exist 64 | 6 "kiv_led_query_battery_state battery_charging = 0"
        6 "enter kiv_led_set_led_when_charging_status_change charging_status=0\n"
        6 "enter kiv_led_set_led_when_power_percent_change\n" | nv battery_value 64
        6 "kiv_led_set_led_when_power_percent_change buf_percent = 80" | 6 "power green on,power_percent=80\n"
        6_operation "enter kiv_led_set_bat_led_operation led_id=1,led_operation=0\n"
        6_operation "kiv_led_set_bat_led_off" | bat off | led 1 on 4 | nv sim_states 64 | 6 "[NVinfo]sim_states: \n"
        6 "kiv_led_handle_sms_state:sms_state=: 0 \n " | 6_operation "kiv_led_set_sms_led_off" | sms off
        6_operation "enter kiv_led_set_sms_led_operation led_id=50,led_operation=1\n" | led 50 off
        6 "enter kiv_set_net_led_state type=0 , ppp=0\n" | nv network_type 64 | 0 "recv nettype \n"
        6 "enter kiv_led_handle_nwinfoStatus : 1\n " | 6 "kiv_set_net_led_state :state changed!\n"
        6 "enter kiv_set_net_led_state type=1 , ppp=0\n"
        6_operation "enter kiv_led_set_net_led_operation led_id=13,led_operation=0\n"
        6_operation "enter kiv_led_set_net_led_off\n" | net off | led 13 on 2 | 6 "enter kiv_led_set_led_wifi_init\n"
        nv wifi_onoff_state 64 | 6 "WIFI status: \n"
        6 "enter kiv_led_set_led_wifi_status wifi_status=0, cur_led_sleep_status=0\n" | 6 "wifi led off\n"
        6_operation "kiv_led_set_wifi_led_off" | led 43 off)",
        [] { on(); led_power_state = POWER_OFF; nv("battery_exist", "1"); nv("battery_value", "80"); mc(0x40); });
    expect_effects("ready at the first look", "system echo 1 > /sys/class/leds/led:rolling_leds/brightness |" + shown,
        [] { power_on_with({"2"}); });
    expect_effects("ready at the second",
        "system echo 1 > /sys/class/leds/led:rolling_leds/brightness | usleep 50000 |" + shown,
        [] { power_on_with({"1", "2"}); });
    expect_errors("timing", R"(
        0 "i=0, bsp sync rolling led cost time = 0 ms\n" | 0 "recv nettype \n"
        0 "i=1, bsp sync rolling led cost time = 50 ms\n" | 0 "recv nettype \n"
        0 "i=100, bsp sync rolling led cost time = 5000 ms\n" | 0 "recv nettype \n")",
        [] { power_on_with({"2"}); power_on_with({"1", "2"}); power_on_with({"1"}); });
    expect_effects("100 pauses at most, then taken over for good", "100 pauses |" + shown,
        [] { power_on_with({"0"}); const std::string record = fake_take_record();
             int pauses = 0;
             for (size_t at = 0; (at = record.find("usleep 50000\n", at)) != std::string::npos; ++at) { ++pauses; }
             fake_note(std::to_string(pauses) + " pauses"); led_net_type = 0; mc(0x40); });
}

TEST(ufi, Sleep)
{
    expect_effects("falls asleep, shows nothing, wakes up", R"(
        delete 1 | handheld off | bat off | led 1 blink 300/5000 4 | net off | power 1 sleep 1 | bat off | net off
        led 15 on 2 | net off | led 13 on 2 | led 43 on 2 | sms off | led 50 on 4 | power 1 sleep 0)",
        [] { on(); nv("network_type", "LTE"); nv("RadioOff", "1"); notify(23, 0x40);
             notify(5, 4); forget(); notify(27, 1, "1"); mc(2); nv("network_type", "GONE"); notify(23, 0x40);
             notify(23, 1); note_power(); notify(27, 1, "5"); note_power(); });
    expect_logs("wake-up lines", R"(
        6 "[info] enter messageParse fun\n" | 6 "recv_msg.us_source_module_id is 27" | 6 "recv_msg.us_cmd is 12034"
        6 "[info] msg MSG_CMD_SERVICE_NOTIFY \n" | 6 "regDecodeMsg source_id 27, mask1 1"
        6 "[info] source msg KIV_MODULE_SLEEP\n" | 6 "recv REG_SLEEP_STATUS_EVENT p_data=0\n"
        6 "enter kiv_led_set_led_when_sleep_status_change sleep_status=0\n"
        6 "kiv_led_handle_sleep_status_change:  not power on !\n ")",
        [] { on(); led_power_state = POWER_OFF; notify(27, 1, "0"); });
    expect_effects("while off the raw value stays, whatever its size",
        "power 2 sleep 1 | power 2 sleep 2147483647 | power 2 sleep -2147483648 | power 2 sleep 0",
        [] { on(); led_power_state = POWER_OFF; notify(27, 1, "1"); note_power(); notify(27, 1, "99999999999999999999");
             note_power(); notify(27, 1, "-99999999999"); note_power(); notify(27, 1, "x"); note_power(); });
}

TEST(ufi, Battery)
{
    expect_effects("thresholds", R"(
        bat off | led 0 blink 800/1200 4 | bat off | led 0 on 4 | bat off | led 0 on 4 | bat off | led 1 on 4
        bat off | led 0 blink 800/1200 4 | bat off | led 0 blink 800/1200 4 | bat off | led 1 on 4)",
        [] { on(); battery("1", "0", "12"); battery("1", "0", "13"); battery("1", "0", "23"); battery("1", "0", "24");
             battery("1", "0", "-1"); battery("1", "0", "?"); battery("1", "0", "99999999999999999999"); });
    expect_effects("charging, charged, no battery, unknown",
        "bat off | led 1 blink 800/1200 4 | bat off | led 1 on 4 | bat off",
        [] { on(); battery("1", "1", "5"); battery("1", "2", "5"); battery("0", "1", "5"); battery("1", "4", "5"); });
    expect_effects("power states 2, 4, 5, 7 and sleep show nothing", "bat off | bat off",
        [] { for (int state = 2; state < 8; ++state) { led_power_state = state, battery("0", "0", "5"); }
             led_power_state = POWER_ON;
             cur_led_sleep_status = 1; battery("0", "0", "5"); });
}
// clang-format on
