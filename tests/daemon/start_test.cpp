#include "core/start.h"

#include "core/bsp_ind.h"
#include "core/channel.h"
#include "harness.h"
#include "nightmode/kiv_led_tr181.h"

#include <gtest/gtest.h>

static const std::string start_record("\2\0\0\0", 4);

static void start(const char *enable, const std::string &product)
{
    fake_platform().inbox.emplace_back(start_record);
    fake_platform().cfg = {
        {531, std::string(enable, 1)},
        {6000,   product + '\0'                 }
    };
    fake_platform().threads = {
        {kiv_led_socket_server_thread, "receive"},
        {kiv_led_ipc_server_thread,    "ipc"    },
        {kiv_tr181_led_init,           "tr181"  }
    };
    fake_note("returned " + std::to_string(kiv_led_start()));
}

static void start_without(const char *thread, const char *product)
{
    fake_platform().failing_thread = thread;
    start("\1", product);
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(start, WholeOrderOnADataCard)
{
    expect_calls("enabled", R"(
        0 "***************kiv_mirta_led start!***************\n" | reg_table 38
        6 "kiv_led_wait_for_daemon start...\n" | queue MSG_ID_LED | 6 "led init msg success!\n"
        send MSG_ID_DAEMON 104 4:"kiv_mirta_led" 68:"MSG_ID_LED" | recv 7 1036 | mem_set 0 104 | mem_cpy 104
        6 "recive daemon message to start!!!!\n" | cfg 531 1 | 6 "get led cfg success,led_enable: 1\n" | cfg 6000 128
        6 "get modem type cfg success: ONLY_DATA_CARD\n" | open rolling_leds
        0 "open file /sys/class/leds/led:rolling_leds/brightness failed\n"
        0 "no rolling leds, neednit wait for bsp\n" | 0 "LED enable,  reg and init!\n" | ipc 31 0
        6 "kiv_led_regNotifyMsg" | reg 16 38 1 0 0 0 | reg 23 38 43 0 0 0 | reg 3 38 5 0 0 0 | 6 "kiv_led_init!"
        6 "enter kiv_set_net_led_state type=1 , ppp=0\n"
        6_operation "enter kiv_led_set_net_led_operation led_id=13,led_operation=0\n"
        6_operation "enter kiv_led_set_net_led_off\n" | net off | led 13 on 2 | nv network_type 64
        0 "recv nettype LTE\n" | 6 "enter kiv_led_handle_nwinfoStatus : 4\n "
        6 "kiv_set_net_led_state :state changed!\n" | 6 "enter kiv_set_net_led_state type=4 , ppp=0\n"
        6_operation "enter kiv_led_set_net_led_operation led_id=15,led_operation=0\n"
        6_operation "enter kiv_led_set_net_led_off\n" | net off | led 15 on 2 | nv signalbar 64
        6 "recv_nwSigStatus :0" | 6 "kiv_led_handle_signal_state :0" | thread receive | thread ipc
        send MSG_ID_DAEMON 104 0:"\x06" 4:"kiv_mirta_led" 68:"MSG_ID_LED" | thread tr181 | nv thermal_led_enable 8
        6:kiv_led_over_temp "Cur Temp LED switch:0" | delete 0 | 6_operation "enter kiv_led_set_sig_led_off\n"
        led 8 off | 6 "kiv_qt330x_set_led_signal_state: sig = 0"
        6_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=0\n" | led 8 on 0
        6:kiv_led_over_temp "Delete over temp timer AND EXIT over temp mode\n" | nv write is_night_mode "0" 1
        nv night_mode_start_time 8 | 6:kiv_led_night_mode "Night mode: start_time:\n" | nv night_mode_end_time 8
        6:kiv_led_night_mode "Night mode: end_time:\n" | nv night_mode_switch 8
        6:kiv_led_night_mode "Cur night mode switch:0\n" | nv night_mode_close_all_led 8
        6:kiv_led_night_mode "Need close all led:0\n" | delete 0 | nv write is_night_mode "0" 1 | relight
        0:kiv_led_night_mode "Delete night mode check timer AND EXIT night mode\n" | returned 0)",
        [] { nv("network_type", "LTE"); start("\1", "ONLY_DATA_CARD"); });
}

TEST(start, Variants)
{
    const std::string hello = R"(reg_table 38 | queue MSG_ID_LED
        send MSG_ID_DAEMON 104 4:"kiv_mirta_led" 68:"MSG_ID_LED" | mem_set 0 104 | mem_cpy 104
        cfg 531 1 | cfg 6000 128 |)";
    const std::string registered = "ipc 31 0 | reg 16 38 1 0 0 0 | reg 23 38 43 0 0 0 | reg 3 38 5 0 0 0 |";
    const std::string report = R"(send MSG_ID_DAEMON 104 0:"\x06" 4:"kiv_mirta_led" 68:"MSG_ID_LED" | thread tr181
        delete 0 | led 8 off | led 8 on 0 | nv write is_night_mode "0" 1 | delete 0 | nv write is_night_mode "0" 1
        relight | returned 0)";
    expect_effects("switched off", hello + "thread receive |" + report, [] { start("\0", "ONLY_DATA_CARD"); });
    expect_effects("neither on nor off", hello + "thread receive |" + report, [] { start("\2", "MODULE"); });
    expect_effects("animation still runs", hello + registered + "thread receive | thread ipc |" + report,
        [] { fake_platform().rolling_leds = {"1"}; start("\1", "ONLY_DATA_CARD"); });
    expect_effects("paper-kite shows no service and Wi-Fi",
        hello + registered +
        "reg 10 38 190 0 0 0 | net off | led 13 on 2 | net off | led 13 on 2 | led 43 on 2 |"
        "thread receive | thread ipc |" + report,
        [] { nv("wifi_onoff_state", "1"); start("\1", "PAPER_KITE"); });
    expect_effects("module CPE shows its charger",
        hello + "ipc 31 0 | reg 1 38 d62 40000010 0 0 |" + registered.substr(11) +
        "reg 5 38 2000 0 0 0 | reg 43 38 2 0 0 0 | ind battery_online | ind battery_offline |"
        "ind charger_connect | ind charger_disconnect | charger 0 0 | led 52 off |" "thread receive | thread ipc |" +
        report,
        [] { start("\1", "MODULE"); });
    expect_effects("without the receive thread", hello + registered + "thread receive | returned -1",
        [] { fake_platform().rolling_leds = {"0"}; start_without("receive", "ONLY_DATA_CARD"); });
    expect_effects("without the IPC thread", hello + registered + "thread receive | thread ipc | returned -1",
        [] { fake_platform().rolling_leds = {"0"}; start_without("ipc", "ONLY_DATA_CARD"); });
    expect_effects("without the TR-181 thread", hello + "thread receive |" + report,
        [] { fake_platform().failing_thread = "tr181"; start("\0", "ONLY_DATA_CARD"); });
    expect_logs("what fails is said", R"(
        0 "***************kiv_mirta_led start!***************\n" | 6 "kiv_led_wait_for_daemon start...\n"
        6 "led init msg success!\n" | 0 "error: kiv_send_msg failed!\n" | 6 "recive daemon message to start!!!!\n"
        6 "get led cfg success,led_enable: 0\n" | 6 "led function disable, return!!!\n"
        6 "get modem type cfg success: \n" | 6 "kiv_led_bsp_ready\n"
        0 "error: Create kiv_led_socket_server_thread failed\n")",
        [] { fake_platform().rolling_leds = {"2"}; fake_platform().send_result = -1;
             fake_platform().failing_thread = "receive"; start("\0", ""); });
}

TEST(start, Handshake)
{
    expect_calls("retry, a failing receive, a registration, strangers, start", R"(
        6 "kiv_led_wait_for_daemon start...\n" | queue MSG_ID_LED | 0 "socket error: kiv_init_msg failed!" | sleep 1
        queue MSG_ID_LED | 0 "socket error: kiv_init_msg failed!" | sleep 1 | queue MSG_ID_LED
        6 "led init msg success!\n" | send MSG_ID_DAEMON 104 4:"kiv_mirta_led" 68:"MSG_ID_LED" | recv 7 1036
        recv 7 1036
        6 "[kiv_mirta_led,main]reg, soure=[23],mask1=[3],mask2=[1073741840],mask3=[0],mask4=[4294967295]\n"
        reg_proc 23 3 40000010 0 ffffffff | 0 "kiv_mirta_led,main:kiv_reg_proc failed\n" | recv 7 1036 | mem_set 0 104
        mem_cpy 104 | recv 7 1036 | mem_set 0 104 | mem_cpy 104 | 6 "recive daemon message to start!!!!\n")",
        [] { fake_platform().failing_queue_opens = 2; fake_platform().reg_proc_result = 0;
             const std::string masks("\x10\0\0\x40\0\0\0\0\xff\xff\xff\xff", 12);
             fake_platform().inbox = {std::nullopt, message_bytes(12033, 0, 23, 3, masks), "\3stranger",
                                      start_record + "whatever else it holds"};
             kiv_led_wait_for_daemon(); });
}
// clang-format on
