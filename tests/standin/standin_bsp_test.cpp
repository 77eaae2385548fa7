#include "standin_device.h"

#include "kiv/adabsp.h"
#include "kiv/ipc.h"
#include "ubox/uloop.h"

#include <cerrno>
#include <cstring>
#include <filesystem>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

struct bsp : standin_device {
    // "trigger brightness delay_on/delay_off" of an LED folder.
    std::string led(const std::string &folder) const
    {
        std::string shown;
        for (const char *attribute : {"trigger", "brightness", "delay_on", "delay_off"}) {
            shown += read(folder + "/" + attribute);
        }
        return shown;
    }
};

static int set_led(const led_request &request)
{
    int result = -999;
    kiv_bsp_set_leds_sync(request, &result);
    return result;
}

TEST_F(bsp, LedFolderShowsTheRequest)
{
    struct {
        led_request request;
        const char *folder;
        const char *shown;
    } const rows[] = {
        {{LED_BAT_GREEN, LED_OP_ON, 4, 0, 0},        "leds/led:bat_green", "none\n4\n0\n0\n"      },
        {{LED_SMS_BLUE, LED_OP_BLINK, 3, 800, 1200}, "leds/led:sms_blue",  "timer\n3\n800\n1200\n"},
        {{LED_SMS_BLUE, LED_OP_BLINK, 3, 50, 50},    "leds/led:sms_blue",  "timer\n3\n50\n50\n"   },
        {{LED_SMS_BLUE, LED_OP_OFF, 0, 0, 0},        "leds/led:sms_blue",  "none\n0\n50\n50\n"    },
        {{LED_SIGBAR_15, LED_OP_ON, 1, 0, 0},        "leds/led:sigbar_15", "none\n1\n0\n0\n"      },
    };
    for (const auto &row : rows) {
        EXPECT_EQ(set_led(row.request), 0) << row.folder;
        EXPECT_EQ(led(row.folder), row.shown) << row.folder;
    }
    EXPECT_EQ(read("leds/led:bat_green/max_brightness"), "4\n");
}

TEST_F(bsp, LedFilesThatAreReplacedAreNoticed)
{
    const led_request half = {LED_BAT_GREEN, LED_OP_ON, 2, 0, 0};
    const std::string folder = path("leds/led:bat_green");
    EXPECT_EQ(set_led(half), 0);
    std::filesystem::remove_all(folder);
    EXPECT_EQ(set_led(half), 0) << "the folder is made again";
    EXPECT_EQ(led("leds/led:bat_green"), "none\n2\n0\n0\n");

    std::filesystem::rename(folder, path("leds/old"));
    std::filesystem::create_directory(folder);
    write("leds/led:bat_green/max_brightness", "255\n");
    EXPECT_EQ(set_led(half), 0);
    EXPECT_EQ(read("leds/led:bat_green/brightness"), "128\n");

    std::filesystem::remove(folder + "/brightness");
    EXPECT_EQ(set_led(half), 0);
    EXPECT_EQ(read("leds/led:bat_green/brightness"), "128\n");
}

TEST_F(bsp, RefusesRequestsTheBoardDoesNotKnow)
{
    const led_request rows[] = {
        {-1,            LED_OP_ON,    4,  0,  0 },
        {5,             LED_OP_ON,    4,  0,  0 },
        {82,            LED_OP_ON,    4,  0,  0 },
        {INT32_MIN,     LED_OP_ON,    4,  0,  0 },
        {LED_BAT_GREEN, 3,            4,  0,  0 },
        {LED_BAT_GREEN, -1,           4,  0,  0 },
        {LED_BAT_GREEN, LED_OP_ON,    5,  0,  0 },
        {LED_BAT_GREEN, LED_OP_ON,    -1, 0,  0 },
        {LED_BAT_GREEN, LED_OP_BLINK, 4,  -1, 10},
    };
    for (const led_request &row : rows) {
        EXPECT_EQ(set_led(row), -EINVAL) << row.led_id << " " << row.led_operation << " " << row.brightness;
    }
    EXPECT_TRUE(std::filesystem::is_empty(path("leds")));
}

TEST_F(bsp, DrivesAFolderOfRealLedsThroughItsMap)
{
    struct {
        int level;
        const char *max;
        const char *brightness;
    } const rows[] = {
        {0, "255\n", "0\n"  },
        {1, "255\n", "64\n" },
        {4, "255\n", "255\n"},
        {2, "1\n",   "1\n"  },
        {1, "1\n",   "1\n"  },
    };
    for (const auto &row : rows) {
        std::filesystem::create_directories(path("class/green:status"));
        for (const char *attribute : {"brightness", "trigger", "delay_on", "delay_off"}) {
            write(std::string("class/green:status/") + attribute, "old text\n");
        }
        write("class/green:status/max_brightness", row.max);
        write("map", "# the board's only LED\n\nbat_green green:status\n999 x\n2 ../leds\n3abc x\n");
        setenv("KIV_LED_MAP", path("map").c_str(), 1);
        testing::internal::CaptureStderr();
        set("KIV_LED_DIR", path("class"));
        EXPECT_EQ(set_led({LED_BAT_GREEN, LED_OP_ON, row.level, 0, 0}), 0);
        EXPECT_EQ(testing::internal::GetCapturedStderr(), "platform: " + path("map:4: not a line of LED FOLDER\n") +
                                                              "platform: " + path("map:5: not a line of LED FOLDER\n") +
                                                              "platform: " + path("map:6: not a line of LED FOLDER\n"));
        EXPECT_EQ(read("class/green:status/brightness"), row.brightness) << row.level << " of " << row.max;
        EXPECT_EQ(read("class/green:status/trigger"), "none\n");
        testing::internal::CaptureStderr();
        EXPECT_EQ(set_led({LED_BAT_RED, LED_OP_ON, 4, 0, 0}), -ENOENT) << "real LEDs are not made";
        EXPECT_EQ(testing::internal::GetCapturedStderr(),
                  "platform: the LED bat_red, KIV_LED_DIR/led:bat_red, cannot be set: No such file or directory\n");
    }
    EXPECT_FALSE(std::filesystem::exists(path("class/led:bat_red")));
}

TEST_F(bsp, SensorsAndQueriesAnswerFromFiles)
{
    struct {
        const char *file; // null: missing
        int sensor, temperature;
        int query, ret, data;
    } const rows[] = {
        {"45\n",  0,  45,  0,  0,   45 },
        {"1",     0,  1,   0,  0,   1  },
        {"-7\n",  0,  -7,  0,  0,   -7 },
        {"5 0\n", -1, -99, 0,  5,   0  },
        {"1 2 3", -1, -99, -1, -99, -99},
        {"hot\n", -1, -99, -1, -99, -99},
        {"",      -1, -99, -1, -99, -99},
        {nullptr, -1, -99, -1, -99, -99},
    };
    for (const auto &row : rows) {
        bsp_sensor_temp temp = {0, -99};
        bsp_query_result charger = {-99, -99};
        bsp_query_result battery = {-99, -99};
        for (const char *file : {"bsp/sensor_6", "bsp/charger", "bsp/battery"}) {
            std::filesystem::remove(path(file));
            if (row.file != nullptr) {
                write(file, row.file);
            }
        }
        const std::string what = row.file ? row.file : "missing";
        EXPECT_EQ(kiv_bsp_get_sensor_temp_sync(6, &temp), row.sensor) << what;
        EXPECT_EQ(temp.temperature, row.temperature) << what;
        EXPECT_EQ(kiv_bsp_get_charger_connect_status_sync(&charger), row.query) << what;
        EXPECT_EQ(kiv_bsp_get_battery_online_status_sync(&battery), row.query) << what;
        for (const bsp_query_result &answer : {charger, battery}) {
            EXPECT_EQ(answer.ret, row.ret) << what;
            EXPECT_EQ(answer.data, row.data) << what;
        }
    }
    bsp_sensor_temp temp{};
    write("bsp/sensor_7", "45\n");
    for (const int sensor : {-1, 7}) {
        EXPECT_EQ(kiv_bsp_get_sensor_temp_sync(sensor, &temp), -1) << sensor;
    }
}

static std::string calls;

static void note_call(const char *who, int event_id, const void *record)
{
    calls += who + std::to_string(event_id) + (record == nullptr ? " null" : "") + " ";
}

static int on_battery(int event_id, int, void *record)
{
    note_call("battery:", event_id, record);
    return 0;
}

static int on_charger(int event_id, int, void *record)
{
    note_call("charger:", event_id, record);
    return 0;
}

TEST_F(bsp, IndicationsReachTheCallbackRegisteredForThem)
{
    struct {
        const char *datagram;
        const char *calls;
    } const rows[] = {
        {"1350",                                                                   "battery:1350 "                       },
        {"1351\n",                                                                 "battery:1351 "                       },
        {"1356",                                                                   "charger:1356 "                       },
        {"1357 null",                                                              "charger:1357 null "                  },
        {"1353 null\n",                                                            "battery:1353 null charger:1353 null "},
        {"-1",                                                                     "battery:-1 charger:-1 "              },
        {"1356 nul",                                                               ""                                    },
        {"1356 null x",                                                            ""                                    },
        {"null",                                                                   ""                                    },
        {"1356 1357",                                                              ""                                    },
        {"99999999999",                                                            ""                                    },
        {"",                                                                       ""                                    },
        {"1356                                                             1356 ", ""                                    },
    };
    sockaddr_un address{};
    address.sun_family = AF_UNIX;
    strncpy(address.sun_path, path("bsp/ind").c_str(), sizeof address.sun_path - 1);
    const int sender = socket(AF_UNIX, SOCK_DGRAM, 0);
    ASSERT_EQ(kiv_bsp_register_battery_online_ind(on_battery), 0);
    ASSERT_EQ(kiv_bsp_register_battery_offline_ind(on_battery), 0);
    ASSERT_EQ(kiv_bsp_register_charger_connect_ind(on_charger), 0);
    ASSERT_EQ(kiv_bsp_register_charger_disconnect_ind(on_charger), 0);
    EXPECT_EQ(kiv_bsp_register_charger_connect_ind(nullptr), -1);
    ASSERT_EQ(kiv_ipc_init(31, 0), 0);
    for (const auto &row : rows) {
        calls.clear();
        testing::internal::CaptureStderr();
        ASSERT_GE(sendto(sender, row.datagram, strlen(row.datagram), 0, reinterpret_cast<sockaddr *>(&address),
                         sizeof address),
                  0);
        EXPECT_EQ(uloop_run_timeout(0), 0);
        EXPECT_EQ(calls, row.calls) << row.datagram;
        const std::string complaint =
            "platform: bsp/ind: a datagram of " + std::to_string(strlen(row.datagram)) + " bytes is not ";
        const std::string errors = testing::internal::GetCapturedStderr();
        EXPECT_EQ(errors.compare(0, complaint.size(), complaint) == 0, *row.calls == '\0') << row.datagram << errors;
    }
    close(sender);
}
