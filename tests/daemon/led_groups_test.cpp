#include "output/led_groups.h"

#include "harness.h"

#include <gtest/gtest.h>

static void fail_all()
{
    for (int id = 0; id <= LED_SIGBAR_15; ++id) {
        fake_platform().led_results[id] = -5;
    }
}

static void night(int close_all)
{
    is_night_mode = 1;
    night_mode_close_all_led = close_all;
}

static void operate_each_group()
{
    kiv_led_set_sig_led_operation(6, 0, 0, 0, 4);
    kiv_led_set_net_led_operation(17, 0, 0, 0, 2);
    kiv_led_set_rssi_led_operation(45, 2, 1, 2, 3);
    kiv_led_set_power_led_operation(52, 0, 0, 0, 2);
    kiv_led_set_power_led_operation(54, 0, 0, 0, 1);
    kiv_led_set_bat_led_operation(1, 2, 800, 1200, 4);
    kiv_led_set_wifi_led_operation(43, 0, 0, 0, 2);
    kiv_led_set_sms_led_operation(50, 0, 0, 0, 4);
    kiv_led_set_flow_led_operation(10, 0, 0, 0, 1);
    kiv_led_set_voicemail_led_operation(63, 2, 1000, 1000, 1);
    kiv_led_set_voicemail_led_operation(63, 1, 0, 0, 0);
    kiv_led_set_voicemail_led_operation(65, 0, 0, 0, 1);
    kiv_led_set_voicemail_led_operation(61, 0, 0, 0, 1);
    kiv_led_set_voicemail_led_operation(66, 1, 0, 0, 0);
    kiv_led_set_voice_led_operation(60, 0, 0, 0, 4);
    kiv_led_set_sigbar_led_operation(70, 0, 0, 0, 1);
    kiv_led_set_led_operation(41, 0, 0, 0, 4);
}

static void switch_each_group_off()
{
    kiv_led_set_sig_led_off();
    kiv_led_set_power_led_off();
    kiv_led_set_wifi_led_off();
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(led_groups, OperationsInOrder)
{
    expect_effects("requests", R"(
        led 6 on 4 | net off | led 17 on 2 | led 44 off | led 45 off | led 46 off | led 47 off | led 45 blink 1/2 3
        led 52 on 2 | bat off | led 1 blink 800/1200 4 | led 43 on 2 | sms off | led 50 on 4 | led 9 off | led 12 off
        led 10 off | led 11 off | led 10 on 1 | voicemail off | led 63 blink 1000/1000 1 | led 63 off
        voicemail off | led 65 on 1 | voice off
        led 60 on 4 | led 66 off | led 67 off | led 68 off | led 69 off | led 70 off | led 71 off | led 72 off
        led 73 off | led 74 off | led 75 off | led 76 off | led 77 off | led 78 off | led 79 off | led 80 off
        led 81 off | led 70 on 1 | led 41 on 4)", operate_each_group);
    expect_logs("lines, off before or after the entry", R"(
        6_operation "enter kiv_led_set_sig_led_operation led_id=6,led_operation=0\n"
        6_operation "enter kiv_led_set_net_led_operation led_id=17,led_operation=0\n"
        6_operation "enter kiv_led_set_net_led_off\n"
        6_operation "kiv_led_set_rssi_led_operation led_id=45,led_operation=2\n"
        6_operation "kiv_led_set_rssi_led_off"
        6_operation "enter kiv_led_set_power_led_operation led_id=52,led_operation=0\n"
        6_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=0\n"
        0_operation "led id error!\n" | 6_operation "enter kiv_led_set_bat_led_operation led_id=1,led_operation=2\n"
        6_operation "kiv_led_set_bat_led_off"
        6_operation "enter kiv_led_set_wifi_led_operation led_id=43,led_operation=0\n"
        6_operation "kiv_led_set_sms_led_off"
        6_operation "enter kiv_led_set_sms_led_operation led_id=50,led_operation=0\n"
        6_operation "kiv_led_set_flow_led_off"
        6_operation "enter kiv_led_set_flow_led_operation led_id=10,led_operation=0\n"
        6_operation "kiv_led_set_voicemail_led_off"
        6_operation "kiv_led_set_voicemail_led_operation led_id=63,led_operation=2\n"
        6_operation "kiv_led_set_voicemail_led_off"
        6_operation "kiv_led_set_voicemail_led_operation led_id=65,led_operation=0\n"
        0_operation "kiv_led_set_voicemail_led_operation led_id error\n"
        0_operation "kiv_led_set_voicemail_led_operation led_id error\n" | 6_operation "kiv_led_set_voice_led_off"
        6_operation "kiv_led_set_voice_led_operation led_id=60,led_operation=0\n"
        6_operation "kiv_led_set_sigbar_led_off"
        6_operation "kiv_led_set_sigbar_led_operation led_id = 70 , led_operation=0\n")", operate_each_group);
    expect_calls("off functions", R"(
        6_operation "enter kiv_led_set_sig_led_off\n" | led 8 off | 6_operation "enter kiv_led_set_power_led_off\n"
        led 52 off | 6_operation "kiv_led_set_wifi_led_off" | led 43 off)", switch_each_group_off);
}

// Each LED is still tried; every failure is one error line with the board's result.
TEST(led_groups, FailuresAreLoggedAndPassedOver)
{
    expect_logs("gated groups", R"(
        6_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=0\n"
        0_operation "set sig blue led fail: -5\n"
        6_operation "enter kiv_led_set_net_led_operation led_id=15,led_operation=0\n"
        6_operation "enter kiv_led_set_net_led_off\n" | 0_operation "set net red off fail:-5\n"
        0_operation "set net blue off fail:-5\n" | 0_operation "set net white off fail:-5\n"
        0_operation "set net led fail: -5\n"
        6_operation "enter kiv_led_set_wifi_led_operation led_id=43,led_operation=0\n"
        0_operation "set 43  fail:-5\n" | 6_operation "enter kiv_led_set_sig_led_off\n"
        0_operation "set sig blue off fail:-5\n" | 6_operation "enter kiv_led_set_power_led_off\n"
        0_operation "set power blue off fail:-5\n" | 6_operation "kiv_led_set_wifi_led_off"
        0_operation "set wifi blue off fail:-5\n")",
        [] { fail_all(); kiv_led_set_sig_led_operation(8, 0, 0, 0, 3); kiv_led_set_net_led_operation(15, 0, 0, 0, 2);
             kiv_led_set_wifi_led_operation(43, 0, 0, 0, 2); switch_each_group_off(); });
    expect_logs("groups of four", R"(
        6_operation "enter kiv_led_set_bat_led_operation led_id=1,led_operation=0\n"
        6_operation "kiv_led_set_bat_led_off" | 0_operation "set bat red off fail: -5\n"
        0_operation "set bat green off fail:-5\n" | 0_operation "set bat blue off fail:-5\n"
        0_operation "set bat yellow off fail:-5\n" | 0_operation "set 1  fail:-5\n"
        6_operation "kiv_led_set_rssi_led_off" | 0_operation "set rssi red off fail: -5\n"
        0_operation "set rssi green off fail:-5\n" | 0_operation "set rssi blue off fail:-5\n"
        0_operation "set rssi yellow off fail:-5\n" | 6_operation "kiv_led_set_voice_led_off"
        0_operation "set voice red off fail: -5\n" | 0_operation "set voice green off fail:-5\n"
        0_operation "set voice blue off fail:-5\n" | 0_operation "set voice yellow off fail:-5\n"
        6_operation "kiv_led_set_voicemail_led_off" | 0_operation "set voicemail red off fail: -5\n"
        0_operation "set voicemail green off fail:-5\n" | 0_operation "set voicemail blue off fail:-5\n"
        0_operation "set voicemail yellow off fail:-5\n" | 0_operation "set 63  off fail:-5\n")",
        [] { fail_all(); kiv_led_set_bat_led_operation(1, 0, 0, 0, 4); kiv_led_set_rssi_led_off();
             kiv_led_set_voice_led_off(); kiv_led_set_voicemail_led_off();
             kiv_led_set_voicemail_led_operation(63, 1, 0, 0, 0); });
}

TEST(led_groups, NightModeGate)
{
    expect_effects("net dims, its other colours and the gated rest go dark", R"(
        net off | led 13 blink 400/400 1 | net off | led 14 off 1000/1000 0 | led 43 off 400/1600 0 |led 8 off
        led 52 off | bat off | led 1 on 4 | led 17 on 2)",
        [] { night(0); kiv_led_set_net_led_operation(13, 2, 400, 400, 2);
             kiv_led_set_net_led_operation(14, 2, 1000, 1000, 1); kiv_led_set_wifi_led_operation(43, 2, 400, 1600, 2);
             kiv_led_set_sig_led_operation(8, 0, 0, 0, 3); kiv_led_set_power_led_operation(52, 0, 0, 0, 2);
             kiv_led_set_bat_led_operation(1, 0, 0, 0, 4); kiv_led_set_led_operation(17, 0, 0, 0, 2); });
    expect_logs("dark nets, logged as off", R"(
        6_operation "Night mode check: led_id=17 brightness=0"
        6_operation "enter kiv_led_set_net_led_operation led_id=17,led_operation=1\n"
        6_operation "enter kiv_led_set_net_led_off\n" | 6_operation "Night mode check: led_id=54 brightness=0"
        6_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=1\n"
        0_operation "led id error!\n")",
        [] { night(1); kiv_led_set_net_led_operation(17, 0, 0, 0, 2);
             kiv_led_set_power_led_operation(54, 0, 0, 0, 1); });
    expect_effects("any value but 1 is day", "led 8 on 3",
        [] { night(1); is_night_mode = 2; kiv_led_set_sig_led_operation(8, 0, 0, 0, 3); });
}
// clang-format on
