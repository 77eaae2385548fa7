#include "daemon_rig.h"

#include "kiv/reg.h"
#include "kiv/socket.h"

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <random>
#include <sstream>
#include <thread>
#include <unistd.h>

using attack = daemon_rig;

struct story_row {
    int module;
    uint32_t event;
    const char *text;
};

constexpr story_row story[] = {
    {KIV_MODULE_MAIN,   REG_MC_EVENT_POWERON,          "" },
    {KIV_MODULE_MAIN,   REG_MC_BATTERY_VALUE,          "" },
    {KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE,            "" },
    {KIV_MODULE_SMS,    REG_WMS_SMS_NEW_SMS,           "" },
    {KIV_MODULE_PPP,    REG_PPP_STATUS,                "1"},
    {KIV_MODULE_WLAN,   REG_WLAN_CURRENT_STATUS,       "1"},
    {KIV_MODULE_SLEEP,  REG_SLEEP_STATUS_EVENT,        "1"},
    {KIV_MODULE_SLEEP,  REG_SLEEP_STATUS_EVENT,        "0"},
    {KIV_MODULE_MAIN,   REG_MC_EVENT_RESETTING,        "" },
    {KIV_MODULE_MAIN,   REG_MC_EVENT_POWER_OFF_CHARGE, "" },
};

static int number_from(const char *variable, int otherwise)
{
    const char *text = std::getenv(variable);
    return text == nullptr ? otherwise : std::atoi(text);
}

// Anything but a message of the main control, which alone is answered.
static void flood(unsigned seed, const std::atomic<bool> &stop, std::atomic<long> &sent)
{
    std::minstd_rand random(seed);
    unsigned char bytes[KIV_SVC_MSG_SIZE];
    while (!stop) {
        for (unsigned char &byte : bytes)
            byte = static_cast<unsigned char>(random());
        svc_msg &message = *reinterpret_cast<svc_msg *>(bytes);
        message.us_dest_module_id = KIV_MODULE_LED;
        message.us_cmd = random() % 2 == 0 ? static_cast<uint16_t>(MSG_CMD_SERVICE_NOTIFY) : message.us_cmd;
        message.us_source_module_id = random() % 2 == 0 ? KIV_MODULE_SMS : KIV_MODULE_NWINFO;
        const int length = 1 + static_cast<int>(random() % sizeof bytes);
        sent += kiv_send_msg("MSG_ID_LED", bytes, length) == 0;
    }
}

TEST_F(attack, FloodLosesNoAcceptedNotification)
{
    constexpr int notifications = 200;
    std::atomic<bool> stop = false;
    std::atomic<long> junk = 0;
    std::atomic<int> accepted = 0;
    int answered = 0;
    ASSERT_TRUE(start());
    ASSERT_TRUE(log_shows("kiv_led_ipc_server_thread")); // every thread runs

    std::thread first([&] { flood(1, stop, junk); });
    std::thread second([&] { flood(2, stop, junk); });
    std::thread module([&] {
        for (int i = 0; i < notifications; i++)
            accepted += notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK);
        stop = true;
    });
    for (bool over = false; !over && answered <= notifications;) {
        const bool all_sent = stop;
        if (next_reverser(main_queue, all_sent ? 3000 : 100) == "4104")
            answered++;
        else
            over = all_sent;
    }
    module.join();
    first.join();
    second.join();
    EXPECT_EQ(answered, accepted);
    EXPECT_GT(accepted, notifications / 2);
    EXPECT_GT(junk, notifications) << "the flood was none";
}

TEST_F(attack, NvFileReplacedWhileRead)
{
    std::atomic<bool> stop = false;
    const std::string low = "10";
    const std::string full = "100" + std::string(56, ' ');
    write("nv/battery_exist", "1");
    write("nv/battery_value", low);
    ASSERT_TRUE(start());
    std::thread writer([&] {
        for (int i = 0; !stop; i++)
            write("nv/battery_value", i % 2 == 0 ? full : low);
    });
    ASSERT_TRUE(notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON));
    for (int i = 0; i < 1000; i++)
        ASSERT_TRUE(notify(KIV_MODULE_MAIN, REG_MC_BATTERY_VALUE));
    EXPECT_TRUE(answers());
    stop = true;
    writer.join();

    std::istringstream lines(trace());
    int low_reads = 0;
    int full_reads = 0;
    for (std::string line; std::getline(lines, line);) {
        if (line.find("kiv_nvconfig_read(\"battery_value\"") == std::string::npos)
            continue;
        const std::string text = line.substr(line.find("= "));
        EXPECT_TRUE(text == "= 0, \"" + low + "\"" || text == "= 0, \"" + full + "\"") << line;
        (text.size() > full.size() ? full_reads : low_reads)++;
    }
    EXPECT_GE(low_reads + full_reads, 1000);
    EXPECT_GT(low_reads, 0);
    EXPECT_GT(full_reads, 0);
}

TEST_F(attack, FullDiskOfTheDeviceDirectory)
{
    close();
    if (!open("DRIVER_UFI", "size=256k,mode=0700"))
        GTEST_SKIP() << "only root can mount a small disk";
    write("nv/battery_exist", "1");
    write("nv/battery_value", "80");
    ASSERT_TRUE(start());
    ASSERT_TRUE(log_shows("Delete night mode check timer")); // all is up, no LED has been set yet
    std::ofstream filler(path("filler"), std::ios::binary);
    while (filler.put('x').flush())
        ;
    ASSERT_TRUE(send_command(KIV_MSG_CMD_LED_NIGHT_MODE_MSG));
    ASSERT_TRUE(notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS));
    ASSERT_TRUE(notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON));
    EXPECT_TRUE(answers());
    EXPECT_NE(trace().find("kiv_nvconfig_write(\"is_night_mode\", \"0\", 1) = -1"), std::string::npos);
    EXPECT_NE(log().find(" fail:"), std::string::npos) << "a LED that could not be set is not told";

    filler.close();
    std::filesystem::remove(path("filler"));
    const size_t before = trace().size();
    ASSERT_TRUE(notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON));
    EXPECT_TRUE(answers());
    EXPECT_NE(trace().find("kiv_bsp_set_leds_sync(bat_green on 4) = 0", before), std::string::npos);
}

// KIV_KILLS in the environment makes it longer.
TEST_F(attack, KilledAnywhereAnswersAfterRestart)
{
    std::minstd_rand random(20240501);
    const int kills = number_from("KIV_KILLS", 25);
    write("nv/night_mode_switch", "1");
    for (int i = 0; i < kills; i++) {
        const unsigned long sent = random() % (4 * std::size(story));
        const auto pause = std::chrono::microseconds(random() % 3000);
        if (random() % 4 == 0)
            launch(); // dies before it is asked to start
        else
            ASSERT_TRUE(start()) << "kill " << i;
        for (unsigned long at = 0; at < sent; at++) {
            const story_row &row = story[at % std::size(story)];
            notify(row.module, row.event, row.text);
            if (at % 7 == 0)
                send_command(KIV_MSG_CMD_LED_NIGHT_MODE_MSG);
        }
        std::this_thread::sleep_for(pause);
        kill_daemon();
        ASSERT_TRUE(start()) << "after kill " << i;
        ASSERT_TRUE(answers()) << "after kill " << i;
        kill_daemon();
    }
}

struct fault_row {
    const char *call;
    const char *fault;
    const char *log; // what the daemon says; nullptr: nothing, the trace alone shows the failure
    const char *product;
};

constexpr fault_row start_faults[] = {
    {"kiv_reg_table_init",                      "* -3",    nullptr,                                    "DRIVER_UFI"},
    {"kiv_init_msg",                            "* -3 1",  "socket error: kiv_init_msg failed!",       "DRIVER_UFI"},
    {"kiv_send_msg",                            "* -1",    "error: kiv send reg complete msg failed!", "DRIVER_UFI"},
    {"kiv_recv_msg",                            "* -1 2",  nullptr,                                    "DRIVER_UFI"},
    {"kiv_reg_proc",                            "* 0",     "kiv_mirta_led,main:kiv_reg_proc failed",   "DRIVER_UFI"},
    {"kiv_cfg_get_item",                        "531 -1",  "get KIV_CFG_9X15_LED_ID error!!!",         "DRIVER_UFI"},
    {"kiv_cfg_get_item",                        "6000 -1", "get KIV_CFG_PRODUCT_TYPE_ID error!!!",     "DRIVER_UFI"},
    {"kiv_ipc_init",                            "* -1",    nullptr,                                    "DRIVER_UFI"},
    {"kiv_reg_func",                            "* -1",    nullptr,                                    "DRIVER_UFI"},
    {"kiv_bsp_register_battery_online_ind",     "* -1",    nullptr,                                    "MODULE"    },
    {"kiv_bsp_register_battery_offline_ind",    "* -1",    nullptr,                                    "MODULE"    },
    {"kiv_bsp_register_charger_connect_ind",    "* -1",    nullptr,                                    "MODULE"    },
    {"kiv_bsp_register_charger_disconnect_ind", "* -1",    nullptr,                                    "MODULE"    },
    {"kiv_bsp_get_charger_connect_status_sync", "* -1",    nullptr,                                    "MODULE"    },
    {"kiv_nvconfig_read",                       "* -1",    nullptr,                                    "DRIVER_UFI"},
    {"kiv_nvconfig_write",                      "* -1",    nullptr,                                    "DRIVER_UFI"},
    {"kiv_lib_led_relight_msg",                 "* -1",    nullptr,                                    "DRIVER_UFI"},
    {"kiv_bsp_set_leds_sync",                   "* -5",    "set net red off fail:-5",                  "PAPER_KITE"},
};

// Whatever fails while it starts, it comes up and still takes messages: a relight request shows that it does.
TEST_F(attack, EveryCallOfTheStartFailing)
{
    for (const fault_row &row : start_faults) {
        SCOPED_TRACE(std::string(row.call) + " " + row.fault);
        close();
        ASSERT_TRUE(open(row.product));
        write(std::string("faults/") + row.call, row.fault);
        launch();
        ASSERT_TRUE(log_shows("led init msg success!"));
        ASSERT_TRUE(send_command(MSG_CMD_SERVICE_REG));
        ASSERT_TRUE(go());
        ASSERT_TRUE(log_shows("recive daemon message to start!!!!"));
        ASSERT_TRUE(send_command(KIV_MSG_CMD_LED_RELIGHT_MSG));
        EXPECT_TRUE(log_shows(strstr(row.fault, "531") == nullptr ? "Enter kiv_led_handle_relight_msg"
                                                                  : "LED function disable and not receive message!"));
        EXPECT_TRUE(row.log == nullptr || log_shows(row.log));
        EXPECT_TRUE(trace_shows(std::string(row.call) + "(")) << "the call is not made";
    }
}
