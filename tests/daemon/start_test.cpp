// Start-up: configuration, registration, the initial scene, threads, alarms.
#include "harness.h"

static const std::string HELLO = R"(
        registration table of 38
        sent MSG_ID_DAEMON 104 bytes 4:"kiv_mirta_led" 68:"MSG_ID_LED"
)";
// From the report that all is registered to the end, with neither a limit of temperature nor a night in the settings.
static const std::string STARTED = R"(
        sent MSG_ID_DAEMON 104 bytes 0:"\x06" 4:"kiv_mirta_led" 68:"MSG_ID_LED"
        thread tr181
        deleted timer none
        sig_blue off
        sig_blue on 0
        nv written is_night_mode=0
        deleted timer none
        nv written is_night_mode=0
        relight
        returned 0)";
static const std::string LOG_OF_HELLO = R"(
        error "***************kiv_mirta_led start!***************\n"
        info "kiv_led_wait_for_daemon start...\n"
        info "led init msg success!\n"
        info "recive daemon message to start!!!!\n"
        info "get led cfg success,led_enable: 1\n"
)";

DEVICE_TEST(start_up, EveryCallOnADataCard)
{
    nv("network_type", "LTE");
    start("ONLY_DATA_CARD");
    expect_trace(R"(
        error kiv_mirta_led "***************kiv_mirta_led start!***************\n"
        registration table of 38
        info kiv_mirta_led "kiv_led_wait_for_daemon start...\n"
        open MSG_ID_LED
        info kiv_mirta_led "led init msg success!\n"
        sent MSG_ID_DAEMON 104 bytes 4:"kiv_mirta_led" 68:"MSG_ID_LED"
        receive 7 1036
        fill 0 104
        copy 104
        info kiv_mirta_led "recive daemon message to start!!!!\n"
        cfg 531 1
        info kiv_mirta_led "get led cfg success,led_enable: 1\n"
        cfg 6000 128
        info kiv_mirta_led "get modem type cfg success: ONLY_DATA_CARD\n"
        open led:rolling_leds
        error kiv_mirta_led "open file /sys/class/leds/led:rolling_leds/brightness failed\n"
        error kiv_mirta_led "no rolling leds, neednit wait for bsp\n"
        error kiv_mirta_led "LED enable,  reg and init!\n"
        ipc 31 0
        info kiv_mirta_led "kiv_led_regNotifyMsg"
        register MDM for LED 0x1 0x0 0x0 0x0
        register NWINFO for LED 0x43 0x0 0x0 0x0
        register PPP for LED 0x5 0x0 0x0 0x0
        info kiv_mirta_led "kiv_led_init!"
        info kiv_mirta_led "enter kiv_set_net_led_state type=1 , ppp=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_operation led_id=13,led_operation=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_off\n"
        only net_red on 2
        nv network_type 64
        error kiv_mirta_led "recv nettype LTE\n"
        info kiv_mirta_led "enter kiv_led_handle_nwinfoStatus : 4\n "
        info kiv_mirta_led "kiv_set_net_led_state :state changed!\n"
        info kiv_mirta_led "enter kiv_set_net_led_state type=4 , ppp=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_operation led_id=15,led_operation=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_off\n"
        only net_blue on 2
        nv signalbar 64
        info kiv_mirta_led "recv_nwSigStatus :0"
        info kiv_mirta_led "kiv_led_handle_signal_state :0"
        thread receive
        thread ipc
        sent MSG_ID_DAEMON 104 bytes 0:"\x06" 4:"kiv_mirta_led" 68:"MSG_ID_LED"
        thread tr181
        nv thermal_led_enable 8
        info kiv_led_over_temp "Cur Temp LED switch:0"
        deleted timer none
        info kiv_mirta_led_operation "enter kiv_led_set_sig_led_off\n"
        sig_blue off
        info kiv_mirta_led "kiv_qt330x_set_led_signal_state: sig = 0"
        info kiv_mirta_led_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=0\n"
        sig_blue on 0
        info kiv_led_over_temp "Delete over temp timer AND EXIT over temp mode\n"
        nv written is_night_mode=0
        nv night_mode_start_time 8
        info kiv_led_night_mode "Night mode: start_time:\n"
        nv night_mode_end_time 8
        info kiv_led_night_mode "Night mode: end_time:\n"
        nv night_mode_switch 8
        info kiv_led_night_mode "Cur night mode switch:0\n"
        nv night_mode_close_all_led 8
        info kiv_led_night_mode "Need close all led:0\n"
        deleted timer none
        nv written is_night_mode=0
        relight
        error kiv_led_night_mode "Delete night mode check timer AND EXIT night mode\n"
        returned 0)");
}

DEVICE_TEST(start_up, SwitchedOffItStillTakesPart)
{
    start("DRIVER_UFI", 0);
    expect_effects(HELLO + R"(
        thread receive)" +
                   STARTED);
    expect_errors(R"(
        error kiv_mirta_led "***************kiv_mirta_led start!***************\n"
        error kiv_mirta_led "open file /sys/class/leds/led:rolling_leds/brightness failed\n"
        error kiv_mirta_led "no rolling leds, neednit wait for bsp\n"
        error kiv_led_night_mode "Delete night mode check timer AND EXIT night mode\n")");
}

DEVICE_TEST(start_up, NeitherOnNorOff)
{
    start("MODULE", 2);
    expect_effects(HELLO + R"(
        thread receive)" +
                   STARTED);
}

DEVICE_TEST(start_up, WhatFailsIsSaid)
{
    fake_platform().send_result = -1;
    fake_platform().failing_thread = "tr181";
    fake_platform().rolling_leds = {""};
    start("ONLY_DATA_CARD");
    expect_errors(R"(
        error kiv_mirta_led "***************kiv_mirta_led start!***************\n"
        error kiv_mirta_led "error: kiv_send_msg failed!\n"
        error kiv_mirta_led "read file /sys/class/leds/led:rolling_leds/brightness failed\n"
        error kiv_mirta_led "LED enable,  reg and init!\n"
        error kiv_mirta_led "error: kiv send reg complete msg failed!\n"
        error kiv_mirta_led "Create kiv_tr181_led_init thread failed\n"
        error kiv_led_night_mode "Delete night mode check timer AND EXIT night mode\n")");
}

DEVICE_TEST(start_up, EndsWithoutAReceiveThread)
{
    fake_platform().failing_thread = "receive";
    fake_platform().rolling_leds = {"0"};
    start("ONLY_DATA_CARD");
    expect_effects(HELLO + R"(
        ipc 31 0
        register MDM for LED 0x1 0x0 0x0 0x0
        register NWINFO for LED 0x43 0x0 0x0 0x0
        register PPP for LED 0x5 0x0 0x0 0x0
        thread receive
        returned -1)");
    expect_errors(R"(
        error kiv_mirta_led "***************kiv_mirta_led start!***************\n"
        error kiv_mirta_led "LED enable,  reg and init!\n"
        error kiv_mirta_led "error: Create kiv_led_socket_server_thread failed\n")");
}

DEVICE_TEST(start_up, EndsWithoutAnIpcThread)
{
    fake_platform().failing_thread = "ipc";
    fake_platform().rolling_leds = {"0"};
    start("ONLY_DATA_CARD");
    expect_effects(HELLO + R"(
        ipc 31 0
        register MDM for LED 0x1 0x0 0x0 0x0
        register NWINFO for LED 0x43 0x0 0x0 0x0
        register PPP for LED 0x5 0x0 0x0 0x0
        thread receive
        thread ipc
        returned -1)");
    expect_errors(R"(
        error kiv_mirta_led "***************kiv_mirta_led start!***************\n"
        error kiv_mirta_led "LED enable,  reg and init!\n"
        error kiv_mirta_led "[error]    Create the ipc listen sever thread fail")");
}

// The animation's file: what it begins with, and whether the initial scene is shown.
TEST(start_up, WaitsForTheEndOfTheAnimation)
{
    const auto ready = [](std::deque<std::string> file, int expected) {
        on_a_fresh_device(file.empty() ? "no file" : file.front(), [file, expected] {
            fake_platform().rolling_leds = file;
            start("PAPER_KITE");
            EXPECT_EQ(int{led_bsp_ready}, expected);
            EXPECT_EQ(int{led_power_state}, expected == 1 ? POWER_ON : POWER_NOT_YET);
        });
    };
    ready({}, 1);
    ready({"2\n"}, 1);
    ready({"25"}, 1);
    ready({"1"}, 0);
    ready({"12"}, 0);
    ready({""}, 0);
}

// Configuration item 6000 as it stands in the store: texts of other lengths, without a terminator, missing.
TEST(start_up, ProductOfAText)
{
    const auto product = [](const std::string &text, led_product expected) {
        on_a_fresh_device(text, [text, expected] {
            fake_platform().rolling_leds = {"0"};
            start(text);
            EXPECT_EQ(int{led_product_type}, expected);
        });
    };
    product("NO_DRIVER_UFI", LED_PRODUCT_UFI);
    product("DRIVER_UFI", LED_PRODUCT_UFI);
    product("PAPER_KITE", LED_PRODUCT_PAPER_KITE);
    product("MODULE", LED_PRODUCT_MODULE);
    product("UNI_CORE_CPE", LED_PRODUCT_UNI_CORE_CPE);
    product("ONLY_DATA_CARD", LED_PRODUCT_DATA_CARD);
    product("module", LED_PRODUCT_DATA_CARD);
    product("MODULES", LED_PRODUCT_DATA_CARD);
    product("", LED_PRODUCT_DATA_CARD);
    product(std::string(300, 'x'), LED_PRODUCT_DATA_CARD);
}

// The texts that name a data card are told from unknown ones by a device that was another product before.
TEST(start_up, DataCardTexts)
{
    for (const char *text : {"ONLY_DATA_CARD", "NO_DRIVER_DATA_CARD", "DRIVER_DATA_CARD"}) {
        on_a_fresh_device(text, [text] {
            led_product_type = LED_PRODUCT_MODULE;
            start(text, 0);
            EXPECT_EQ(int{led_product_type}, LED_PRODUCT_DATA_CARD);
        });
    }
}

DEVICE_TEST(start_up, ConfigurationThatCannotBeRead)
{
    fake_platform().cfg_fails = true;
    start("MODULE");
    EXPECT_EQ(int{led_enable}, 0);
    EXPECT_EQ(int{led_product_type}, LED_PRODUCT_DATA_CARD);
    expect_errors(R"(
        error kiv_mirta_led "***************kiv_mirta_led start!***************\n"
        error kiv_mirta_led "get KIV_CFG_9X15_LED_ID error!!!\n"
        error kiv_mirta_led "get KIV_CFG_PRODUCT_TYPE_ID error!!!\n"
        error kiv_mirta_led "open file /sys/class/leds/led:rolling_leds/brightness failed\n"
        error kiv_mirta_led "no rolling leds, neednit wait for bsp\n"
        error kiv_led_night_mode "Delete night mode check timer AND EXIT night mode\n")");
}

DEVICE_TEST(start_up, ModuleShowsItsChargerAndAsksForTheRest)
{
    fake_platform().charger = {0, 0};
    nv("network_type", "LTE");
    fake_platform().rolling_leds = {"2"};
    start("MODULE");
    expect_effects(HELLO + R"(
        ipc 31 0
        register MAIN for LED 0xd62 0x40000010 0x0 0x0
        register MDM for LED 0x1 0x0 0x0 0x0
        register NWINFO for LED 0x43 0x0 0x0 0x0
        register PPP for LED 0x5 0x0 0x0 0x0
        register SMS for LED 0x2000 0x0 0x0 0x0
        register VOICE for LED 0x2 0x0 0x0 0x0
        indications of battery_online
        indications of battery_offline
        indications of charger_connect
        indications of charger_disconnect
        power_blue off
        thread receive
        thread ipc)" +
                   STARTED);
    expect_log("kiv_mirta_led", LOG_OF_HELLO + R"(
        info "get modem type cfg success: MODULE\n"
        info "kiv_led_bsp_ready\n"
        error "LED enable,  reg and init!\n"
        info "kiv_led_regNotifyMsg"
        error "reg SMS notify msg begin!"
        error "reg SMS notify msg end!"
        error "reg voice phone notify msg begin!"
        error "reg voice phone notify msg end!"
        info "kiv_led_init!"
        error "recv nettype LTE\n"
        info "recv_nwSigStatus :0"
        info "kiv_qt330x_set_led_signal_state: sig = 0")");
    expect_log("kiv_mirta_led_cpe", R"(
        info "kiv_led_cpe_init!"
        info "[info] enter getChargerConnect"
        info "[info] isUsbCharged ret 0,data 0!!"
        info "getChargerConnect: 0"
        info "kiv_cpe_led_handle_charger_state: 0!"
        error "kiv_cpe_led_handle_nwinfoStatus, not power on!"
        error "kiv_cpe_led_handle_signal_state, not power on!")");
}

DEVICE_TEST(start_up, PaperKiteIsOnWithoutService)
{
    nv("wifi_onoff_state", "1");
    fake_platform().rolling_leds = {"2"};
    start("PAPER_KITE");
    expect_effects(HELLO + R"(
        ipc 31 0
        register MDM for LED 0x1 0x0 0x0 0x0
        register NWINFO for LED 0x43 0x0 0x0 0x0
        register PPP for LED 0x5 0x0 0x0 0x0
        register WLAN for LED 0x190 0x0 0x0 0x0
        only net_red on 2
        only net_red on 2
        wifi_blue on 2
        thread receive
        thread ipc)" +
                   STARTED);
    expect_log("kiv_mirta_led", LOG_OF_HELLO + R"(
        info "get modem type cfg success: PAPER_KITE\n"
        info "kiv_led_bsp_ready\n"
        error "LED enable,  reg and init!\n"
        info "kiv_led_regNotifyMsg"
        info "kiv_led_init!"
        info "paperkite init"
        info "enter kiv_set_net_led_state type=1 , ppp=0\n"
        error "recv nettype \n"
        info "enter kiv_led_handle_nwinfoStatus : 1\n "
        info "kiv_set_net_led_state :state changed!\n"
        info "enter kiv_set_net_led_state type=1 , ppp=0\n"
        info "enter kiv_led_set_led_wifi_init\n"
        info "WIFI status: 1\n"
        info "enter kiv_led_set_led_wifi_status wifi_status=1, cur_led_sleep_status=0\n"
        info "wifi blue on\n"
        info "kiv_qt330x_set_led_signal_state: sig = 0")");
}

DEVICE_TEST(start_up, HandheldWaitsForItsPowerOn)
{
    nv("battery_exist", "1");
    nv("sim_states", "ready");
    fake_platform().rolling_leds = {"2"};
    start("NO_DRIVER_UFI");
    expect_effects(HELLO + R"(
        ipc 31 0
        register MAIN for LED 0xfe2 0x40004610 0x0 0x0
        register MDM for LED 0x1 0x0 0x0 0x0
        register NWINFO for LED 0x43 0x0 0x0 0x0
        register PPP for LED 0x5 0x0 0x0 0x0
        register DST for LED 0x1 0x0 0x0 0x0
        register WLAN for LED 0x14 0x0 0x0 0x0
        register SMS for LED 0x1006 0x0 0x0 0x0
        thread receive
        thread ipc)" +
                   STARTED);
    expect_log("kiv_mirta_led", LOG_OF_HELLO + R"(
        info "get modem type cfg success: NO_DRIVER_UFI\n"
        info "kiv_led_bsp_ready\n"
        error "LED enable,  reg and init!\n"
        info "kiv_led_regNotifyMsg"
        info "reg mc resetting msg!"
        info "reg mc quick power on/off msg!"
        info "kiv_led_init!"
        info "[NVinfo]sim_states: ready\n"
        error "recv nettype \n"
        info "enter kiv_led_handle_nwinfoStatus : 1\n "
        info "enter kiv_led_handle_nwinfoStatus, not power on \n "
        info "enter kiv_led_set_led_wifi_init\n"
        info "enter kiv_led_set_led_wifi_init, not power on \n "
        info "kiv_qt330x_set_led_signal_state: sig = 0")");
}

DEVICE_TEST(start_up, SingleChipWaitsForItsPowerOn)
{
    fake_platform().rolling_leds = {"2"};
    start("UNI_CORE_CPE");
    expect_effects(HELLO + R"(
        ipc 31 0
        register MAIN for LED 0xde2 0x40000010 0x0 0x0
        register MDM for LED 0x1 0x0 0x0 0x0
        register NWINFO for LED 0x43 0x0 0x0 0x0
        register PPP for LED 0x5 0x0 0x0 0x0
        register WLAN for LED 0x190 0x0 0x0 0x0
        register VOICE for LED 0x2 0x0 0x0 0x0
        thread receive
        thread ipc)" +
                   STARTED);
    expect_log("kiv_mirta_led", LOG_OF_HELLO + R"(
        info "get modem type cfg success: UNI_CORE_CPE\n"
        info "kiv_led_bsp_ready\n"
        error "LED enable,  reg and init!\n"
        info "kiv_led_regNotifyMsg"
        info "reg mc resetting msg!"
        error "reg voice phone notify msg!"
        info "kiv_led_init!"
        error "recv nettype \n"
        info "enter kiv_led_handle_nwinfoStatus : 1\n "
        info "enter kiv_led_handle_nwinfoStatus, not power on \n "
        info "recv_nwSigStatus :0"
        error "kiv_singlechip_led_handle_signal_state, not power on!"
        info "enter kiv_led_set_led_wifi_init\n"
        info "enter kiv_led_set_led_wifi_init, not power on \n "
        info "kiv_qt330x_set_led_signal_state: sig = 0")");
}
