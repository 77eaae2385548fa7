#include "policy/singlechip/relight.h"

#include "harness.h"

#include <gtest/gtest.h>

static void on()
{
    product_on(LED_PRODUCT_UNI_CORE_CPE);
    nv("network_type", "LTE"), nv("signalbar", "2"), nv("wifi_onoff_state", "1");
}

static void off_charge_and_relight()
{
    led_power_state = POWER_OFF_CHARGE, kiv_led_handle_relight_msg();
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(singlechip, PowerEvents)
{
    expect_effects("power on", "led 52 on 2 | net off | led 15 on 2 | led 8 on 2 | led 43 on 2 | power 1 sleep 0",
        [] { on(); led_power_state = POWER_NOT_YET; led_bsp_ready = 0; mc(0x40); note_power(); });
    expect_effects("shutting down",
        "led 52 off | led 43 off | net off | led 8 off |" + reverser + "4096\" | power 2 sleep 0",
        [] { on(); mc(0x20); note_power(); });
    expect_effects("shutting down while resetting keeps all white",
        "led 52 off | led 43 off | net off | led 8 off | led 52 on 2 | led 43 on 2 | led 17 on 2 | led 8 on 3 |" +
        reverser + "4097\" |" + reverser + "4096\" | power 7 sleep 0",
        [] { on(); mc(0x80); mc(0x20); note_power(); });
    expect_effects("unreal is off, restarting keeps the state", R"(
        led 52 off | led 43 off | net off | led 8 off | power 1 sleep 0 | led 52 off | led 43 off | net off
        led 8 off | power 2 sleep 0)", [] { on(); mc(0x100); note_power(); mc(0x800); note_power(); });
    expect_effects("handheld's events and battery", "power 1 sleep 0",
        [] { on(); mc(0x400); mc(2); mc(0x40000010); mc(0x200); mc(0x40000200); mc(0x40000400); mc(0x40004000);
             note_power(); });
}

TEST(singlechip, SleepIsFive)
{
    expect_effects("asleep, then 1 wakes up", R"(
        net off | led 8 off | power 1 sleep 1 | net off | led 15 on 2 | led 6 on 4 | timer 5000 repeat "" = 1
        power 1 sleep 0)",
        [] { on(); mc(0x40);
             led_ppp_state = 1; forget(); notify(27, 1, "5"); notify(10, 0x10, "0"); nv("signalbar", "3");
             notify(23, 1); nv("signalbar", "2"); note_power(); notify(27, 1, "1"); note_power(); });
    expect_effects("each power state", "net off | led 8 off | led 6 off | power 2 sleep 0",
        [] { on(); led_power_state = POWER_OFF; notify(27, 1, "5"); notify(27, 1, "0"); note_power(); });
}

TEST(singlechip, Relight)
{
    expect_effects("as it was, also asleep", R"(
        led 8 on 2 | led 52 on 2 | led 43 on 2 | net off | led 15 on 2 | led 8 on 2 | led 52 on 2 | led 43 off
        net off | led 15 on 2)",
        [] { on(); mc(0x40); forget(); command(6934); cur_led_sleep_status = 1; command(6934); });
    expect_calls("too hot", R"(
        0 "Enter kiv_led_handle_relight_msg" | 0 "kiv_cpe_led_relight_signal_state, OVER TEMP!"
        6_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=2\n" | led 8 blink 1000/1000 3
        6_operation "enter kiv_led_set_power_led_operation led_id=52,led_operation=0\n" | led 52 on 2
        nv wifi_onoff_state 64 | nv wifi_chip1_wps_state 64 | nv wifi_chip2_wps_state 64
        6 "WIFI status:   WPS status: ,\n" | 6 "wifi_wps_state: wifi led off\n" | 6 "wifi led off\n"
        6_operation "kiv_led_set_wifi_led_off" | led 43 off | 6 "enter kiv_set_net_led_state type=0 , ppp=0\n"
        0 "Exit kiv_led_handle_relight_msg")",
        [] { led_power_state = POWER_ON; over_temp_enable = 1; is_over_temp = 1; kiv_led_handle_relight_msg(); });
    expect_logs("off", R"(0 "Enter kiv_led_handle_relight_msg" | 0 "Power OFF, Ignore relight msg!!")",
        off_charge_and_relight);
}
// clang-format on
