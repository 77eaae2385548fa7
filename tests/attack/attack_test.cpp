// The real daemon in real time, on the simulator's device and with its other ends of the bus.
#include "kiv/reg.h"
#include "kiv/socket.h"
#include "language/messages.h"
#include "rig.h"
#include "standin.h"
#include "world/device.h"

#include <atomic>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <map>
#include <random>
#include <sys/mount.h>
#include <thread>

using namespace std::chrono_literals;

// Waits while the queue is full. False when it was not accepted.
static bool post(const std::string &bytes)
{
    return kiv_send_msg("MSG_ID_LED", bytes.data(), static_cast<int>(bytes.size())) == 0;
}

// The daemon answers it with a message to the main control.
static const std::string question = notification(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK, "");

struct attack : testing::Test {
    rig r;
    std::string disk; // a small one that holds the device, its trace beside it
    std::string error;

    void SetUp() override { open("DRIVER_UFI"); }
    void TearDown() override
    {
        close();
        umount2(disk.c_str(), MNT_DETACH);
        for (const char *file : {"", ".trace"}) {
            remove_device(disk.empty() ? disk : disk + file);
        }
    }

    void open(const char *product)
    {
        standin_reload(); // of this process, which may have had another device before
        ASSERT_TRUE(set_up_rig(r, {KIV_DAEMON, "", "", true}, disk.empty() ? disk : disk + ".trace", error)) << error;
        write("cfg/6000", product);
    }
    void close()
    {
        take_down_rig(r, false);
        r = {};
    }
    void write(const std::string &file, const std::string &text) const
    {
        std::string failure;
        EXPECT_TRUE(write_device_file(r.device, {file, text}, failure)) << failure;
    }
    size_t trace_size() const { return std::filesystem::file_size(r.trace_path); }
    // What has been added since; a thousand restarts leave too much to read it all each time.
    std::string trace(size_t from = 0) const
    {
        std::ifstream file(r.trace_path);
        file.seekg(static_cast<std::streamoff>(from));
        return {std::istreambuf_iterator<char>(file), {}};
    }
    // Waits ten seconds at least: a sanitizer makes it slow, but not that slow.
    bool shows(const std::string &text, size_t from = 0) const
    {
        bool shown = false;
        for (int tries = 0; !shown && tries < 5000; tries++, std::this_thread::sleep_for(2ms)) {
            shown = trace(from).find(text) != std::string::npos;
        }
        return shown;
    }
    void launch() { ASSERT_TRUE(::launch(r.process, r.options, r.device, r.trace_path, 0, 0, error)) << error; }
    bool start()
    {
        const size_t before = trace_size();
        drain(r.wires);
        launch();
        return shows("kiv_send_msg(\"MSG_ID_DAEMON\", 104) = 0", before) && post(start_record());
    }
    bool answers()
    {
        const size_t before = trace_size();
        drain(r.wires);
        return post(question) && shows("\"4104\", 8) = 0", before);
    }
};

// Anything but a message of the main control, which alone is answered.
static void flood(unsigned seed, const std::atomic<bool> &stop, std::atomic<long> &sent)
{
    std::minstd_rand random(seed);
    unsigned char bytes[KIV_SVC_MSG_SIZE];
    while (!stop) {
        for (unsigned char &byte : bytes) {
            byte = static_cast<unsigned char>(random());
        }
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
    ASSERT_TRUE(shows("kiv_led_ipc_server_thread")); // every thread runs, and all registrations are sent
    drain(r.wires);

    std::thread first([&] { flood(1, stop, junk); });
    std::thread second([&] { flood(2, stop, junk); });
    std::thread module([&] {
        for (int i = 0; i < notifications; i++) {
            accepted += post(question);
        }
        stop = true;
    });
    for (int quiet_ms = 0; quiet_ms < 3000 && answered <= notifications; std::this_thread::sleep_for(1ms)) {
        const int answers = drain(r.wires);
        answered += answers;
        quiet_ms = stop && answers == 0 ? quiet_ms + 1 : 0;
    }
    module.join();
    first.join();
    second.join();
    EXPECT_EQ(answered, accepted);
    EXPECT_GT(accepted, notifications / 2);
    EXPECT_GT(junk, notifications / 10) << "the flood was none";
}

TEST_F(attack, NvFileReplacedWhileRead)
{
    std::atomic<bool> stop = false;
    const std::string texts[] = {"10", "100" + std::string(56, ' ')};
    std::map<std::string, int> reads;
    write("nv/battery_exist", "1");
    write("nv/battery_value", texts[0]);
    ASSERT_TRUE(start());
    std::thread writer([&] {
        for (int i = 1; !stop; i++) {
            write("nv/battery_value", texts[i % 2]);
        }
    });
    EXPECT_TRUE(post(notification(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON, "")));
    for (int i = 0; i < 1000; i++) {
        EXPECT_TRUE(post(notification(KIV_MODULE_MAIN, REG_MC_BATTERY_VALUE, "")));
    }
    EXPECT_TRUE(answers());
    stop = true;
    writer.join();

    for (const trace_entry &entry : read_trace(r.trace)) {
        if (entry.call == "kiv_nvconfig_read" && entry.arguments.starts_with("\"battery_value\"")) {
            reads[entry.result]++;
        }
    }
    const int low = reads["0, \"" + texts[0] + "\""];
    const int full = reads["0, \"" + texts[1] + "\""];
    EXPECT_EQ(reads.size(), 2U) << "another text than the two was read";
    EXPECT_GE(low + full, 1000);
    EXPECT_GT(low, 0);
    EXPECT_GT(full, 0);
}

TEST_F(attack, FullDiskOfTheDeviceDirectory)
{
    close();
    disk = make_device(error);
    if (mount("tmpfs", disk.c_str(), "tmpfs", 0, "size=256k,mode=0700") != 0) {
        GTEST_SKIP() << "only root can mount a small disk";
    }
    setenv("TMPDIR", disk.c_str(), 1);
    open("DRIVER_UFI");
    unsetenv("TMPDIR"); // a sanitizer in the daemon has files of its own there
    write("nv/battery_exist", "1");
    write("nv/battery_value", "80");
    ASSERT_TRUE(start());
    ASSERT_TRUE(shows("Delete night mode check timer")); // all is up, no LED has been set yet
    std::ofstream filler(disk + "/filler", std::ios::binary);
    while (filler.put('x').flush())
        ;
    ASSERT_TRUE(post(command(KIV_MSG_CMD_LED_NIGHT_MODE_MSG)));
    ASSERT_TRUE(post(notification(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS, "")));
    ASSERT_TRUE(post(notification(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON, "")));
    EXPECT_TRUE(answers());
    EXPECT_NE(trace().find("kiv_nvconfig_write(\"is_night_mode\", \"0\", 1) = -1"), std::string::npos);
    EXPECT_NE(trace().find(" fail:"), std::string::npos) << "a LED that could not be set is not told";

    filler.close();
    std::filesystem::remove(disk + "/filler");
    const size_t before = trace_size();
    ASSERT_TRUE(post(notification(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON, "")));
    EXPECT_TRUE(answers());
    EXPECT_NE(trace().find("kiv_bsp_set_leds_sync(bat_green on 4) = 0", before), std::string::npos);
}

// KIV_KILLS in the environment makes it longer.
TEST_F(attack, KilledAnywhereAnswersAfterRestart)
{
    const std::string story[] = {
        command(KIV_MSG_CMD_LED_NIGHT_MODE_MSG),
        notification(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON, ""),
        notification(KIV_MODULE_MAIN, REG_MC_BATTERY_VALUE, ""),
        notification(KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE, ""),
        notification(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS, ""),
        notification(KIV_MODULE_PPP, REG_PPP_STATUS, "1"),
        notification(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, "1"),
        notification(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "1"),
        notification(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "0"),
        notification(KIV_MODULE_MAIN, REG_MC_EVENT_RESETTING, ""),
        notification(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_CHARGE, ""),
    };
    std::minstd_rand random(20240501);
    const char *longer = std::getenv("KIV_KILLS");
    const int kills = longer == nullptr ? 25 : std::atoi(longer);
    write("nv/night_mode_switch", "1");
    for (int i = 0; i < kills; i++) {
        const unsigned long sent = random() % (4 * std::size(story));
        const auto pause = std::chrono::microseconds(random() % 3000);
        if (random() % 4 == 0) {
            launch(); // dies before it is asked to start
        } else {
            ASSERT_TRUE(start()) << "kill " << i;
        }
        for (unsigned long at = 0; at < sent; at++) {
            post(story[at % std::size(story)]);
        }
        std::this_thread::sleep_for(pause);
        kill_daemon(r.process);
        ASSERT_TRUE(start()) << "after kill " << i;
        ASSERT_TRUE(answers()) << "after kill " << i;
        kill_daemon(r.process);
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
        open(row.product);
        write(std::string("faults/") + row.call, row.fault);
        launch();
        ASSERT_TRUE(shows("led init msg success!"));
        ASSERT_TRUE(post(command(MSG_CMD_SERVICE_REG)));
        ASSERT_TRUE(post(start_record()));
        ASSERT_TRUE(shows("recive daemon message to start!!!!"));
        ASSERT_TRUE(post(command(KIV_MSG_CMD_LED_RELIGHT_MSG)));
        EXPECT_TRUE(shows(strstr(row.fault, "531") == nullptr ? "Enter kiv_led_handle_relight_msg"
                                                              : "LED function disable and not receive message!"));
        EXPECT_TRUE(row.log == nullptr || shows(row.log));
        EXPECT_TRUE(shows(std::string(" ") + row.call + "(")) << "the call is not made";
    }
}
