// One platform call after the other fails, at every place of a story of all indicators. What the daemon has missed
// must not outlast the next time that the device is switched off and on.
#include "fake_platform.h"

#include "boot.h"
#include "core/channel.h"
#include "ground/led_ctx.h"
#include "kiv/ipc.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "kiv/tr181.h"
#include "nightmode/kiv_led_tr181.h"

#include <cstring>
#include <gtest/gtest.h>
#include <span>
#include <sstream>

static std::string failing_call; // the countdown-th of these from now on fails
static int countdown;
static bool failed;
static std::map<std::string, int> made;                                // how often each call was
static std::array<std::map<int, std::string>, LED_PRODUCT_COUNT> leds; // as last requested on each product

static bool fails(const char *call)
{
    made[call]++;
    if (failing_call != call) {
        return false;
    }
    failed = failed || countdown == 0;
    return countdown-- == 0;
}

extern "C" {
#define SWEPT(result_on_failure, name, parameters, arguments)                                                          \
    int __real_##name parameters;                                                                                      \
    int __wrap_##name parameters                                                                                       \
    {                                                                                                                  \
        return fails(#name) ? (result_on_failure) : __real_##name arguments;                                           \
    }

SWEPT(-1, kiv_nvconfig_read, (const char *key, char *buffer, int size), (key, buffer, size))
SWEPT(-1, kiv_nvconfig_write, (const char *key, const char *value, int length), (key, value, length))
SWEPT(0, kiv_timer, (void (*callback)(void *), void *argument, int period, int repeat),
      (callback, argument, period, repeat))
SWEPT(-1, kiv_msg_send, (const svc_msg *message, int length), (message, length))
SWEPT(-1, kiv_recv_msg, (int handle, void *buffer, int size), (handle, buffer, size))
SWEPT(-1, kiv_lib_led_relight_msg, (), ())
SWEPT(-1, kiv_bsp_get_sensor_temp_sync, (int sensor, bsp_sensor_temp *temp), (sensor, temp))
SWEPT(-1, kiv_bsp_get_charger_connect_status_sync, (bsp_query_result * result), (result))
SWEPT(-1, kiv_bsp_get_battery_online_status_sync, (bsp_query_result * result), (result))
SWEPT(-1, libkiv_tr181_Init, (), ())
SWEPT(-5, libkiv_tr181_set_tbl, (int table, void *record, int arg3, int arg4), (table, record, arg3, arg4))

int __real_kiv_bsp_set_leds_sync(led_request request, int *result);
int __wrap_kiv_bsp_set_leds_sync(led_request request, int *result)
{
    if (fails("kiv_bsp_set_leds_sync")) {
        *result = -5;
        return 0;
    }
    leds[static_cast<size_t>(led_product_type.word)][request.led_id] =
        request.led_operation == LED_OP_OFF
            ? "off"
            : std::to_string(request.led_operation) + "/" + std::to_string(request.brightness);
    return __real_kiv_bsp_set_leds_sync(request, result);
}
}

struct story_row {
    uint16_t cmd;
    uint16_t module;
    uint32_t event;
    const char *text;
};

constexpr uint16_t NOTIFY = MSG_CMD_SERVICE_NOTIFY;

constexpr story_row story[] = {
    {NOTIFY,                         KIV_MODULE_MAIN,   REG_MC_EVENT_POWERON,          ""           },
    {NOTIFY,                         KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR,            ""           },
    {NOTIFY,                         KIV_MODULE_NWINFO, REG_NWINFO_ROAMING_STATUS,     ""           },
    {NOTIFY,                         KIV_MODULE_PPP,    REG_PPP_STATUS,                "1"          },
    {NOTIFY,                         KIV_MODULE_WLAN,   REG_WLAN_AP_WPS_STATE,         "1"          },
    {NOTIFY,                         KIV_MODULE_SMS,    REG_WMS_SMS_NEW_SMS,           ""           },
    {NOTIFY,                         KIV_MODULE_SMS,    REG_WMS_SMS_VOCEMAIL_SET_FLAG, "1"          },
    {NOTIFY,                         KIV_MODULE_VOICE,  REG_VOICE_PHONE_LED_STATE,     "PHONE BLINK"},
    {KIV_MSG_CMD_LED_OVER_TEMP_MSG,  KIV_MODULE_MAIN,   0,                             ""           },
    {KIV_MSG_CMD_LED_NIGHT_MODE_MSG, KIV_MODULE_MAIN,   0,                             ""           },
    {KIV_MSG_CMD_LED_RELIGHT_MSG,    KIV_MODULE_MAIN,   0,                             ""           },
    {NOTIFY,                         KIV_MODULE_SLEEP,  REG_SLEEP_STATUS_EVENT,        "5"          },
    {NOTIFY,                         KIV_MODULE_SLEEP,  REG_SLEEP_STATUS_EVENT,        "0"          },
    {NOTIFY,                         KIV_MODULE_MAIN,   REG_MC_EVENT_SHUTTING_DOWN,    ""           },
};

// Off, on, everything anew, and awake once more: only that shows the signal LED 6 of the single-chip terminal.
constexpr story_row recovery[] = {
    {NOTIFY,                         KIV_MODULE_VOICE,  REG_VOICE_PHONE_LED_STATE,     "" },
    {NOTIFY,                         KIV_MODULE_MAIN,   REG_MC_EVENT_SHUTTING_DOWN,    "" },
    {KIV_MSG_CMD_LED_NIGHT_MODE_MSG, KIV_MODULE_MAIN,   0,                             "" },
    {KIV_MSG_CMD_LED_OVER_TEMP_MSG,  KIV_MODULE_MAIN,   0,                             "" },
    {NOTIFY,                         KIV_MODULE_MAIN,   REG_MC_EVENT_POWERON,          "" },
    {NOTIFY,                         KIV_MODULE_SMS,    REG_WMS_SMS_NV_UNREAD_SMS,     "" },
    {NOTIFY,                         KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE,            "" },
    {NOTIFY,                         KIV_MODULE_NWINFO, REG_NWINFO_ROAMING_STATUS,     "" },
    {NOTIFY,                         KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR,            "" },
    {NOTIFY,                         KIV_MODULE_SMS,    REG_WMS_SMS_VOCEMAIL_SET_FLAG, "0"},
    {KIV_MSG_CMD_LED_RELIGHT_MSG,    KIV_MODULE_MAIN,   0,                             "" },
    {NOTIFY,                         KIV_MODULE_SLEEP,  REG_SLEEP_STATUS_EVENT,        "0"},
};

static void play(std::span<const story_row> rows)
{
    static received_message received;
    for (const story_row &row : rows) {
        svc_msg message = {};
        message.us_cmd = row.cmd;
        message.us_dest_module_id = KIV_MODULE_LED;
        message.us_source_module_id = row.module;
        message.ul_event_mask = row.event;
        strcpy(message.p_data, row.text);
        fake_platform().inbox.emplace_back(std::string(reinterpret_cast<char *>(&message), sizeof message));
        while (!fake_platform().inbox.empty()) {
            kiv_led_receive_message(received);
        }
        const std::map<int, fake_timer> timers = fake_platform().timers;
        for (const auto &[handle, timer] : timers) {
            fake_fire(handle);
        }
    }
}

static const std::array<std::string, LED_PRODUCT_COUNT> product_types = {"DRIVER_UFI", "ONLY_DATA_CARD", "PAPER_KITE",
                                                                         "MODULE", "UNI_CORE_CPE"};

static void prepare()
{
    fake_device &device = fake_platform();
    device = {};
    std::istringstream pairs("battery_exist=1 battery_value=80 network_type=LTE signalbar=3 simcard_roam=Home "
                             "wifi_onoff_state=1 thermal_led_enable=40 night_mode_switch=1 syn_done=1 "
                             "night_mode_start_time=22:00 night_mode_end_time=06:00 data_volume_limit_switch=1 "
                             "data_volume_limit_unit=data data_volume_limit_size=1 sms_nvunread_count=0");
    for (std::string key, value; std::getline(pairs >> std::ws, key, '=') && pairs >> value;) {
        device.nv[key] = value;
    }
    device.sensors.fill(45);
    device.charger = {0, 1};
    device.battery = {0, 1};
    device.clock = 12 * 60 * 60;
}

struct outcome {
    std::map<int, std::string> leds;
    std::string record;
    std::map<std::string, int> made;
    bool failed; // a reminder that goes on where the last one stopped makes the last calls come and go
};

static outcome run(int product, const std::string &call, int fail_at)
{
    prepare();
    failing_call = call;
    countdown = fail_at;
    made.clear();
    failed = false;
    fake_record(true);
    EXPECT_EQ(boot(product_types[static_cast<size_t>(product)]), 0);
    play(story);
    kiv_tr181_led_init(nullptr);
    const std::map<std::string, int> calls = made;
    const std::string record = fake_take_record();
    countdown = -1;
    play(recovery);
    fake_take_record();
    return {leds[static_cast<size_t>(product)], record, calls, failed};
}

TEST(fault_sweep, NoFailureOutlastsSwitchingOffAndOn)
{
    // What the daemon says of a failure; of the others it says nothing.
    std::map<std::string, std::string> logs = {
        {"kiv_bsp_set_leds_sync", "fail"                     },
        {"kiv_msg_send",          "send common reverser fail"},
        {"libkiv_tr181_set_tbl",  "ret:-5"                   }
    };
    std::map<std::string, int> swept;
    for (int product = 0; product < LED_PRODUCT_COUNT; product++) {
        run(product, "", -1);
        const outcome sound = run(product, "", -1);
        for (const auto &[call, count] : sound.made) {
            for (int at = 0; at < count; at++) {
                const outcome hit = run(product, call, at);
                const std::string name = call + " " + std::to_string(at) + " of product " + std::to_string(product);
                ASSERT_EQ(hit.leds, sound.leds) << name;
                ASSERT_TRUE(!hit.failed || hit.record.find(logs[call]) != std::string::npos) << name;
                swept[call] += hit.failed ? 1 : 0;
            }
        }
    }
    EXPECT_EQ(swept.size(), 12U) << "one of them is never called";
    for (const auto &[call, failures] : swept) {
        EXPECT_GT(failures, 0) << call;
    }
}
