// Everything that runs beside the receive thread, at once: for the thread sanitizer, and for deadlocks.
#include "alarms/kiv_led_over_temp.h"
#include "core/bsp_ind.h"
#include "core/channel.h"
#include "core/led_ctx.h"
#include "fake_platform.h"
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

// clang-format off
constexpr std::array modules = {1, 1, 1, 3, 5, 10, 16, 23, 24, 27, 43, 99};
constexpr std::array events = {0x1, 0x2, 0x4, 0x10, 0x20, 0x40, 0x40, 0x80, 0x100, 0x200, 0x400, 0x800, 0x1000, 0x2000,
                               0x43, 0x40000010, 0x40000200, 0x40000400, 0x40004000};
constexpr std::array payloads = {"0", "1", "2", "5", "PHONE BLINK", "PHONE LED ON", ""};
constexpr std::array keys = {"battery_value", "battery_charging", "battery_exist", "network_type", "signalbar",
                             "wifi_onoff_state", "sms_nvunread_count", "night_mode_switch", "night_mode_start_time",
                             "night_mode_end_time", "night_mode_close_all_led", "nitz_sync_flag", "monthly_tx_bytes",
                             "data_volume_limit_switch", "data_volume_limit_size", "thermal_led_enable", "RadioOff"};
constexpr std::array values = {"0", "1", "2", "80", "LTE", "SA", "23:59", "0:01"};
// clang-format on

static std::atomic<bool> running;
static std::array<std::atomic<unsigned long>, 5> counts; // by source

template <typename Table> static auto any_of(const Table &table, std::minstd_rand &random)
{
    return table[random() % table.size()];
}

// Commands make one message in eight; now and then the message is cut short.
static std::string any_message(std::minstd_rand &random)
{
    svc_msg message = {};
    message.us_cmd = MSG_CMD_SERVICE_NOTIFY;
    if (random() % 8 == 0) {
        message.us_cmd = static_cast<uint16_t>(KIV_MSG_CMD_LED_OVER_TEMP_MSG + random() % 3);
    }
    message.us_dest_module_id = KIV_MODULE_LED;
    message.us_source_module_id = static_cast<uint16_t>(any_of(modules, random));
    message.ul_event_mask = static_cast<uint32_t>(any_of(events, random));
    std::strcpy(message.p_data, any_of(payloads, random));
    return {reinterpret_cast<const char *>(&message), random() % 16 == 0 ? random() % sizeof message : sizeof message};
}

static void receive(std::minstd_rand &random)
{
    static received_message received;
    fake_set_nv(any_of(keys, random), any_of(values, random));
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
    kiv_led_bspIpcCallBack(1350 + static_cast<int>(random() % 8), 0, random() % 16 == 0 ? nullptr : record);
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
        std::this_thread::sleep_for(std::chrono::microseconds(index == 0 ? 0 : 100));
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
    fake_platform().sensors = {50, 90};
    fake_platform().nv = {
        {"data_volume_limit_unit", "data"  },
        {"monthly_rx_bytes",       "1"     },
        {"systime_mode",           "manual"}
    };
    fake_platform().charger = {0, 1};
    fake_platform().battery = {0, 1};
    const int printed = dup(STDOUT_FILENO); // the night-mode check prints
    ASSERT_NE(std::freopen("/dev/null", "w", stdout), nullptr);
    for (int product = 0; product < LED_PRODUCT_COUNT; ++product) {
        run_product(product, duration / LED_PRODUCT_COUNT);
    }
    std::fflush(stdout);
    dup2(printed, STDOUT_FILENO);
    std::printf(
        "%lu messages, %lu rounds of timers, %lu indications, %lu publications, %lu set-ups, %lu LED requests\n",
        counts[0].load(), counts[1].load(), counts[2].load(), counts[3].load(), counts[4].load(), fake_led_requests());
    for (const std::atomic<unsigned long> &count : counts) {
        EXPECT_GT(count, 10u);
    }
}
