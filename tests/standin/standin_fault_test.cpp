#include "standin_device.h"

#include "kiv/adabsp.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/log.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "kiv/socket.h"
#include "kiv/tr181.h"

struct faults : standin_device {
    void SetUp() override
    {
        standin_device::SetUp();
        set("KIV_FAULTS", "1");
    }
};

// Ten requests for two LEDs, as digits: 0 done, f failed as the file says.
TEST_F(faults, FirstMatchingLineDecides)
{
    struct {
        const char *file;
        const char *outcome; // of bat_red off, bat_green on, in turns
    } const rows[] = {
        {"* -5\n",                          "ffffff"},
        {"* -5 2\n",                        "ff0000"},
        {"* -5 0\n",                        "000000"},
        {"* -5 03",                         "fff000"},
        {"bat_green -5\n",                  "0f0f0f"},
        {"'bat_red off' -5 1\n",            "f00000"},
        {"'bat_red on' -5\n",               "000000"},
        {"bat_red -5 2\nbat_green -5 2\n",  "ffff00"},
        {"bat_green 0\n* -5\n",             "f0f0f0"}, // made to succeed without being carried out
        {"# comment\n\n  bat_red -5\n",     "f0f0f0"},
        {"nonsense\n* -5x\n* -5 -1\n* \n'", "000000"},
        {"",                                "000000"},
    };
    for (const auto &row : rows) {
        std::string outcome;
        write("faults/kiv_bsp_set_leds_sync", row.file);
        testing::internal::CaptureStderr();
        for (int turn = 0; turn < 6; turn++) {
            int result = -999;
            const bool is_red = turn % 2 == 0;
            kiv_bsp_set_leds_sync({is_red ? LED_BAT_RED : LED_BAT_GREEN, is_red ? LED_OP_OFF : LED_OP_ON, 0, 0, 0},
                                  &result);
            outcome += result == 0 ? '0' : result == -5 ? 'f' : '?';
        }
        testing::internal::GetCapturedStderr();
        EXPECT_EQ(outcome, row.outcome) << row.file;
    }
}

TEST_F(faults, FailedCallIsNotCarriedOut)
{
    char buffer[16] = "as was";
    int handle = -7;
    bsp_sensor_temp temp = {0, -99};
    svc_msg message{};
    message.us_dest_module_id = KIV_MODULE_LED;
    write("nv/battery_value", "45\n");
    write("bsp/sensor_0", "45\n");
    const int queue = open_queue("MSG_ID_LED");
    for (const char *call : {"kiv_nvconfig_read", "kiv_nvconfig_write", "kiv_bsp_get_sensor_temp_sync", "kiv_init_msg",
                             "kiv_msg_send", "kiv_send_msg", "kiv_lib_led_relight_msg", "kiv_recv_msg",
                             "libkiv_tr181_Init", "kiv_reg_table_init", "kiv_bsp_register_charger_connect_ind"}) {
        write(std::string("faults/") + call, "* -3\n");
    }
    write("faults/kiv_timer", "* 0\n");
    write("faults/kiv_syslog_append", "secret 0\n");
    set("KIV_LOG", path("log"));

    EXPECT_EQ(kiv_nvconfig_read("battery_value", buffer, sizeof buffer), -3);
    EXPECT_STREQ(buffer, "as was");
    EXPECT_EQ(kiv_nvconfig_write("battery_value", "46", 2), -3);
    EXPECT_EQ(read("nv/battery_value"), "45\n");
    EXPECT_EQ(kiv_bsp_get_sensor_temp_sync(0, &temp), -3);
    EXPECT_EQ(temp.temperature, -99);
    EXPECT_EQ(kiv_init_msg("MSG_ID_MAIN", &handle), -3);
    EXPECT_EQ(read("bus/MSG_ID_MAIN.lock"), "(missing)");
    EXPECT_EQ(kiv_msg_send(&message, 4), -3);
    EXPECT_EQ(kiv_send_msg("MSG_ID_LED", "x", 1), -3);
    EXPECT_EQ(kiv_lib_led_relight_msg(), -3);
    EXPECT_EQ(kiv_recv_msg(queue, buffer, sizeof buffer), -3) << "returns though the queue is empty";
    EXPECT_EQ(kiv_timer([](void *) { FAIL(); }, nullptr, 1, 0), 0);
    EXPECT_EQ(libkiv_tr181_Init(), -3);
    EXPECT_EQ(kiv_reg_table_init(38), -3);
    EXPECT_EQ(kiv_bsp_register_charger_connect_ind(nullptr), -3);
    kiv_syslog_append(KIV_LOG_INFO, "f", 1, 31, "a %s line", "secret");
    EXPECT_EQ(read("log"), "");

    set("KIV_FAULTS", "0");
    EXPECT_EQ(kiv_nvconfig_read("battery_value", buffer, sizeof buffer), 0)
        << "the folder counts only with KIV_FAULTS=1";
}

// The thousandth line counts as the first does.
TEST_F(faults, LongFilesAreReadWhole)
{
    std::string lines;
    for (int line = 0; line < 1000; line++) {
        lines += "no_such_key -7\n";
    }
    char buffer[8] = "";
    write("faults/kiv_nvconfig_read", lines + "last -9 1\n");
    set("KIV_FAULTS", "1");
    EXPECT_EQ(kiv_nvconfig_read("last", buffer, sizeof buffer), -9);
    EXPECT_EQ(kiv_nvconfig_read("last", buffer, sizeof buffer), -1) << "counted down";
}
