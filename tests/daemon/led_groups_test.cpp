#include "output/led_groups.h"

#include "harness.h"
#include "kiv/adabsp.h"

static void night(int close_all)
{
    is_night_mode = 1;
    night_mode_close_all_led = close_all;
}

static void operate_each_group()
{
    kiv_led_set_sig_led_operation(LED_SIG_6, LED_OP_ON, 0, 0, 4);
    kiv_led_set_net_led_operation(LED_NET_WHITE, LED_OP_BLINK, 400, 600, 2);
    kiv_led_set_rssi_led_operation(LED_RSSI_GREEN, LED_OP_BLINK, 1, 2, 3);
    kiv_led_set_power_led_operation(LED_POWER_BLUE, LED_OP_ON, 0, 0, 2);
    kiv_led_set_bat_led_operation(LED_BAT_GREEN, LED_OP_BLINK, 800, 1200, 4);
    kiv_led_set_wifi_led_operation(LED_WIFI_BLUE, LED_OP_BLINK, 400, 1600, 2);
    kiv_led_set_sms_led_operation(LED_SMS_BLUE, LED_OP_ON, 0, 0, 4);
    kiv_led_set_flow_led_operation(LED_FLOW_GREEN, LED_OP_ON, 0, 0, 1);
    kiv_led_set_voicemail_led_operation(LED_VOICEMAIL_GREEN, LED_OP_BLINK, 1000, 1000, 1);
    kiv_led_set_voicemail_led_operation(LED_VOICEMAIL_GREEN, LED_OP_OFF, 0, 0, 0);
    kiv_led_set_voice_led_operation(LED_VOICE_BLUE, LED_OP_ON, 0, 0, 4);
    kiv_led_set_sigbar_led_operation(LED_SIGBAR_0 + 4, LED_OP_ON, 0, 0, 1);
    kiv_led_set_led_operation(LED_NET_RED, LED_OP_ON, 0, 0, 4);
}

static void operate_what_is_refused()
{
    kiv_led_set_power_led_operation(LED_POWER_54, LED_OP_ON, 0, 0, 1);
    kiv_led_set_voicemail_led_operation(LED_VOICEMAIL_RED - 1, LED_OP_ON, 0, 0, 1);
    kiv_led_set_voicemail_led_operation(LED_VOICEMAIL_YELLOW + 1, LED_OP_OFF, 0, 0, 0);
}

static void switch_each_group_off()
{
    kiv_led_set_sig_led_off();
    kiv_led_set_net_led_off();
    kiv_led_set_rssi_led_off();
    kiv_led_set_power_led_off();
    kiv_led_set_bat_led_off();
    kiv_led_set_wifi_led_off();
    kiv_led_set_sms_led_off();
    kiv_led_set_flow_led_off();
    kiv_led_set_voicemail_led_off();
    kiv_led_set_voice_led_off();
    kiv_led_set_sigbar_led_off();
}

DEVICE_TEST(led_groups, ByDayRequestsPassUnchanged)
{
    step(operate_each_group);
    expect_effects(R"(
        sig_6 on 4
        only net_white blink 400/600 2
        only rssi_green blink 1/2 3
        power_blue on 2
        only bat_green blink 800/1200 4
        wifi_blue blink 400/1600 2
        only sms_blue on 4
        only flow_green on 1
        only voicemail_green blink 1000/1000 1
        voicemail_green off
        only voice_blue on 4
        sigbar off
        sigbar_4 on 1
        net_red on 4)");
}

// The gate comes first and the entry line shows what it has made of the request. Some groups are switched off before
// their entry line, some after it. Only net, sig, power and wifi pass the gate.
DEVICE_TEST(led_groups, ByNightEveryStepOfEachGroup)
{
    night(0);
    step(operate_each_group);
    expect_trace(R"(
        info kiv_mirta_led_operation "Night mode check: led_id=6 brightness=0"
        info kiv_mirta_led_operation "enter kiv_led_set_sig_led_operation led_id=6,led_operation=1\n"
        sig_6 off
        info kiv_mirta_led_operation "Night mode check: led_id=17 brightness=1"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_operation led_id=17,led_operation=2\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_off\n"
        only net_white blink 400/600 1
        info kiv_mirta_led_operation "kiv_led_set_rssi_led_operation led_id=45,led_operation=2\n"
        info kiv_mirta_led_operation "kiv_led_set_rssi_led_off"
        only rssi_green blink 1/2 3
        info kiv_mirta_led_operation "Night mode check: led_id=52 brightness=0"
        info kiv_mirta_led_operation "enter kiv_led_set_power_led_operation led_id=52,led_operation=1\n"
        power_blue off
        info kiv_mirta_led_operation "enter kiv_led_set_bat_led_operation led_id=1,led_operation=2\n"
        info kiv_mirta_led_operation "kiv_led_set_bat_led_off"
        only bat_green blink 800/1200 4
        info kiv_mirta_led_operation "Night mode check: led_id=43 brightness=0"
        info kiv_mirta_led_operation "enter kiv_led_set_wifi_led_operation led_id=43,led_operation=1\n"
        wifi_blue off 400/1600
        info kiv_mirta_led_operation "kiv_led_set_sms_led_off"
        sms off
        info kiv_mirta_led_operation "enter kiv_led_set_sms_led_operation led_id=50,led_operation=0\n"
        sms_blue on 4
        info kiv_mirta_led_operation "kiv_led_set_flow_led_off"
        flow off
        info kiv_mirta_led_operation "enter kiv_led_set_flow_led_operation led_id=10,led_operation=0\n"
        flow_green on 1
        info kiv_mirta_led_operation "kiv_led_set_voicemail_led_off"
        voicemail off
        info kiv_mirta_led_operation "kiv_led_set_voicemail_led_operation led_id=63,led_operation=2\n"
        voicemail_green blink 1000/1000 1
        voicemail_green off
        info kiv_mirta_led_operation "kiv_led_set_voice_led_off"
        voice off
        info kiv_mirta_led_operation "kiv_led_set_voice_led_operation led_id=60,led_operation=0\n"
        voice_blue on 4
        info kiv_mirta_led_operation "kiv_led_set_sigbar_led_off"
        sigbar off
        info kiv_mirta_led_operation "kiv_led_set_sigbar_led_operation led_id = 70 , led_operation=0\n"
        sigbar_4 on 1
        net_red on 4)");
}

DEVICE_TEST(led_groups, WhatTheGateLeavesLit)
{
    night(0);
    step([] {
        kiv_led_set_net_led_operation(LED_NET_RED, LED_OP_ON, 0, 0, 2);
        kiv_led_set_net_led_operation(LED_NET_14, LED_OP_BLINK, 1000, 1000, 1);
        kiv_led_set_net_led_operation(LED_NET_BLUE, LED_OP_ON, 0, 0, 2);
        kiv_led_set_sig_led_operation(LED_SIG_BLUE, LED_OP_ON, 0, 0, 3);
    });
    expect_effects(R"(
        only net_red on 1
        only net_14 off 1000/1000
        only net_blue on 1
        sig_blue off)");

    night(1);
    step([] { kiv_led_set_net_led_operation(LED_NET_WHITE, LED_OP_ON, 0, 0, 2); });
    expect_effects("only net_white off");

    is_night_mode = 2;
    step([] { kiv_led_set_net_led_operation(LED_NET_WHITE, LED_OP_ON, 0, 0, 2); });
    expect_effects("only net_white on 2");
}

DEVICE_TEST(led_groups, RefusesWhatIsNotOfTheGroup)
{
    step(operate_what_is_refused);
    expect_trace(R"(
        info kiv_mirta_led_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=0\n"
        error kiv_mirta_led_operation "led id error!\n"
        error kiv_mirta_led_operation "kiv_led_set_voicemail_led_operation led_id error\n"
        error kiv_mirta_led_operation "kiv_led_set_voicemail_led_operation led_id error\n")");
    night(1);
    step([] { kiv_led_set_power_led_operation(LED_POWER_54, LED_OP_ON, 0, 0, 1); });
    expect_trace(R"(
        info kiv_mirta_led_operation "Night mode check: led_id=54 brightness=0"
        info kiv_mirta_led_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=1\n"
        error kiv_mirta_led_operation "led id error!\n")");
}

// Each LED is still tried; every failure is one error line with the board's result.
DEVICE_TEST(led_groups, FailuresAreLoggedAndPassedOver)
{
    for (int id = 0; id <= LED_SIGBAR_0; ++id) {
        fake_platform().led_results[id] = -5;
    }
    fake_platform().led_results[LED_SIGBAR_15] = -6;
    step(switch_each_group_off);
    expect_log("kiv_mirta_led_operation", R"(
        info "enter kiv_led_set_sig_led_off\n"
        error "set sig blue off fail:-5\n"
        info "enter kiv_led_set_net_led_off\n"
        error "set net red off fail:-5\n"
        error "set net blue off fail:-5\n"
        error "set net white off fail:-5\n"
        info "kiv_led_set_rssi_led_off"
        error "set rssi red off fail: -5\n"
        error "set rssi green off fail:-5\n"
        error "set rssi blue off fail:-5\n"
        error "set rssi yellow off fail:-5\n"
        info "enter kiv_led_set_power_led_off\n"
        error "set power blue off fail:-5\n"
        info "kiv_led_set_bat_led_off"
        error "set bat red off fail: -5\n"
        error "set bat green off fail:-5\n"
        error "set bat blue off fail:-5\n"
        error "set bat yellow off fail:-5\n"
        info "kiv_led_set_wifi_led_off"
        error "set wifi blue off fail:-5\n"
        info "kiv_led_set_sms_led_off"
        error "set sms green off fail:-5\n"
        error "set sms blue off fail:-5\n"
        info "kiv_led_set_flow_led_off"
        error "set flow red off fail: -5\n"
        error "set flow yellow off fail:-5\n"
        error "set flow green off fail:-5\n"
        error "set flow blue off fail:-5\n"
        info "kiv_led_set_voicemail_led_off"
        error "set voicemail red off fail: -5\n"
        error "set voicemail green off fail:-5\n"
        error "set voicemail blue off fail:-5\n"
        error "set voicemail yellow off fail:-5\n"
        info "kiv_led_set_voice_led_off"
        error "set voice red off fail: -5\n"
        error "set voice green off fail:-5\n"
        error "set voice blue off fail:-5\n"
        error "set voice yellow off fail:-5\n"
        info "kiv_led_set_sigbar_led_off"
        error "set sigbar 66 off fail:-5\n"
        error "set sigbar 81 off fail:-6\n")");

    fake_platform().led_results.clear();
    for (const int id : {6, 13, 17, 43, 45, 50, 52, 63, 70}) { // those that it asks for
        fake_platform().led_results[id] = -7;
    }
    step(operate_each_group);
    expect_errors(R"(
        error kiv_mirta_led_operation "set sig blue led fail: -7\n"
        error kiv_mirta_led_operation "set net red off fail:-7\n"
        error kiv_mirta_led_operation "set net white off fail:-7\n"
        error kiv_mirta_led_operation "set net led fail: -7\n"
        error kiv_mirta_led_operation "set rssi green off fail:-7\n"
        error kiv_mirta_led_operation "set 45  fail:-7\n"
        error kiv_mirta_led_operation "set power led fail: -7\n"
        error kiv_mirta_led_operation "set 43  fail:-7\n"
        error kiv_mirta_led_operation "set sms blue off fail:-7\n"
        error kiv_mirta_led_operation "set 50  fail:-7\n"
        error kiv_mirta_led_operation "set voicemail green off fail:-7\n"
        error kiv_mirta_led_operation "set 63  fail:-7\n"
        error kiv_mirta_led_operation "set 63  off fail:-7\n"
        error kiv_mirta_led_operation "set sigbar 70 off fail:-7\n"
        error kiv_mirta_led_operation "set 70  fail:-7\n"
        error kiv_mirta_led_operation "set 13  fail:-7\n")");
}

// A board library that writes its result only on failure: what failed before does not stick to the next LED.
DEVICE_TEST(led_groups, ResultsAreClearedBeforeEachRequest)
{
    fake_platform().writes_failures_only = true;
    fake_platform().led_results[LED_BAT_RED] = -5;
    step(kiv_led_set_bat_led_off);
    expect_errors(R"(
        error kiv_mirta_led_operation "set bat red off fail: -5\n")");
}
