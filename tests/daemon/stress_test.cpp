// Everything that runs beside the receive thread, at once: for the thread sanitizer, and for deadlocks.
#include "alarms/kiv_led_over_temp.h"
#include "boot.h"
#include "core/channel.h"
#include "fake_platform.h"
#include "ground/led_ctx.h"
#include "kiv/reg.h"
#include "nightmode/kiv_led_night_mode.h"
#include "nightmode/kiv_led_tr181.h"

#include <array>
#include <atomic>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <gtest/gtest.h>
#include <random>
#include <thread>
#include <unistd.h>
#include <vector>

struct events_of_module {
    uint16_t module;
    std::vector<uint32_t> events;
};
static const std::array notifications = {
    events_of_module{KIV_MODULE_MAIN,   {REG_MC_CHARGIN_STATUS, REG_MC_EVENT_SHUTTING_DOWN, REG_MC_EVENT_POWERON} },
    events_of_module{KIV_MODULE_MAIN,   {REG_MC_EVENT_POWERON, REG_MC_EVENT_RESETTING, REG_MC_EVENT_RESTARTING}   },
    events_of_module{KIV_MODULE_MAIN,   {REG_MC_EVENT_INITAL, REG_MC_EVENT_POWER_OFF_CHARGE, REG_MC_BATTERY_VALUE}},
    events_of_module{KIV_MODULE_MAIN,   {REG_MC_EVENT_POWER_OFF_QUICKEN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK}      },
    events_of_module{KIV_MODULE_MAIN,   {REG_MC_EVENT_POWER_OFF_UNREADL, REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN}   },
    events_of_module{KIV_MODULE_PPP,    {REG_PPP_STATUS, REG_Q6_PPP_STATUS}                                       },
    events_of_module{KIV_MODULE_SMS,    {REG_WMS_SMS_NV_UNREAD_SMS, REG_WMS_SMS_NEW_SMS, REG_WMS_SMS_MEMORY_FULL} },
    events_of_module{KIV_MODULE_SMS,    {REG_WMS_SMS_VOCEMAIL_SET_FLAG}                                           },
    events_of_module{KIV_MODULE_WLAN,   {REG_WLAN_CURRENT_STATUS, REG_WLAN_AP_WPS_STATE}                          },
    events_of_module{KIV_MODULE_MDM,    {REG_SIM_STATUS}                                                          },
    events_of_module{KIV_MODULE_NWINFO, {REG_NWINFO_SIG_BAR, REG_NWINFO_ROAMING_STATUS, REG_NWINFO_NETTYPE}       },
    events_of_module{KIV_MODULE_DST,    {REG_DST_FLOW_STATUS}                                                     },
    events_of_module{KIV_MODULE_SLEEP,  {REG_SLEEP_STATUS_EVENT}                                                  },
    events_of_module{KIV_MODULE_VOICE,  {REG_VOICE_PHONE_LED_STATE}                                               },
};
constexpr std::array commands = {KIV_MSG_CMD_LED_OVER_TEMP_MSG, KIV_MSG_CMD_LED_NIGHT_MODE_MSG,
                                 KIV_MSG_CMD_LED_RELIGHT_MSG};
constexpr std::array payloads = {"0", "1", "2", "5", "PHONE BLINK", "PHONE LED ON", ""};
constexpr std::array nv_keys = {
    "battery_value",
    "battery_charging",
    "battery_exist",
    "network_type",
    "signalbar",
    "wifi_onoff_state",
    "sms_nvunread_count",
    "night_mode_switch",
    "night_mode_start_time",
    "night_mode_end_time",
    "night_mode_close_all_led",
    "nitz_sync_flag",
    "monthly_tx_bytes",
    "data_volume_limit_switch",
    "data_volume_limit_size",
    "thermal_led_enable",
    "RadioOff",
};
constexpr std::array nv_values = {"0", "1", "2", "80", "LTE", "SA", "23:59", "0:01"};
constexpr std::array indications = {1350, 1351, 1355, 1356, 1357};

enum source : size_t { RECEIVE_THREAD, TIMER_THREAD, IPC_THREAD, TR181_THREAD, MAIN_THREAD, SOURCES };

static std::atomic<bool> running;
static std::array<std::atomic<unsigned long>, SOURCES> counts;

template <typename Table> static const auto &any_of(const Table &table, std::minstd_rand &random)
{
    return table[random() % table.size()];
}

// Commands make one message in eight; one in sixteen is cut short.
static std::string any_message(std::minstd_rand &random)
{
    const events_of_module &any = any_of(notifications, random);
    svc_msg message = {};
    message.us_cmd = MSG_CMD_SERVICE_NOTIFY;
    if (random() % 8 == 0) {
        message.us_cmd = static_cast<uint16_t>(any_of(commands, random));
    }
    message.us_dest_module_id = KIV_MODULE_LED;
    message.us_source_module_id = any.module;
    message.ul_event_mask = any_of(any.events, random);
    std::strcpy(message.p_data, any_of(payloads, random));
    const size_t length = random() % 16 == 0 ? random() % sizeof message : sizeof message;
    return {reinterpret_cast<const char *>(&message), length};
}

static void receive(std::minstd_rand &random)
{
    static received_message received;
    fake_set_nv(any_of(nv_keys, random), any_of(nv_values, random));
    fake_deliver(any_message(random));
    kiv_led_receive_message(received);
}

static void fire_timers(std::minstd_rand &)
{
    for (const auto &[handle, timer] : fake_timers()) {
        fake_fire(handle);
    }
}

static void indicate(std::minstd_rand &random)
{
    char record[1] = {};
    fake_platform().indication(any_of(indications, random), 0, random() % 16 == 0 ? nullptr : record);
}

static void publish(std::minstd_rand &)
{
    kiv_tr181_led_init(nullptr);
}

// As the main thread does while the receive thread already runs.
static void set_up(std::minstd_rand &)
{
    kiv_led_over_temp_init();
    kiv_led_night_mode_init();
}

// The pause keeps a source from holding night mode's mutex for good: on a device these come by the second.
static void run(void (*source)(std::minstd_rand &), size_t index)
{
    std::minstd_rand random(static_cast<unsigned>(index + 1));
    while (running.load(std::memory_order_relaxed)) {
        source(random);
        counts[index].fetch_add(1, std::memory_order_relaxed);
        std::this_thread::sleep_for(std::chrono::microseconds(index == RECEIVE_THREAD ? 0 : 100));
    }
}

static void run_product(int product, std::chrono::milliseconds duration)
{
    led_product_type = product;
    led_enable = 1;
    led_power_state = POWER_ON;
    running = true;
    std::vector<std::thread> threads;
    for (const auto source : {receive, fire_timers, indicate, publish, set_up}) {
        threads.emplace_back(run, source, threads.size());
    }
    std::this_thread::sleep_for(duration);
    running = false;
    for (std::thread &thread : threads) {
        thread.join();
    }
}

TEST(stress, AllSourcesAtOnce)
{
    const char *text = std::getenv("KIV_STRESS_SECONDS");
    const std::chrono::milliseconds duration(text == nullptr ? 3000 : 1000 * std::atol(text));
    fake_device &device = fake_platform();
    device.sensors = {50, 90};
    device.nv["data_volume_limit_unit"] = "data";
    device.nv["monthly_rx_bytes"] = "1";
    device.nv["systime_mode"] = "manual";
    device.charger = {0, 1};
    device.battery = {0, 1};
    ASSERT_EQ(boot("MODULE"), 0);           // the one product on which the board has a callback to call
    const int printed = dup(STDOUT_FILENO); // the night-mode check prints
    ASSERT_NE(std::freopen("/dev/null", "w", stdout), nullptr);
    for (int product = 0; product < LED_PRODUCT_COUNT; ++product) {
        run_product(product, duration / LED_PRODUCT_COUNT);
    }
    std::fflush(stdout);
    dup2(printed, STDOUT_FILENO);
    std::printf("%lu messages, %lu rounds of timers, %lu indications, %lu publications, %lu set-ups, "
                "%lu LED requests\n",
                counts[RECEIVE_THREAD].load(), counts[TIMER_THREAD].load(), counts[IPC_THREAD].load(),
                counts[TR181_THREAD].load(), counts[MAIN_THREAD].load(), fake_led_requests());
    for (const std::atomic<unsigned long> &count : counts) {
        EXPECT_GT(count, 10u);
    }
}
