// From the send of a notification to the LED's file, beside a process that only receives it and writes the same file
// and beside a method call on a D-Bus daemon, turn and turn about. The D-Bus daemon is the one that
// DBUS_SESSION_BUS_ADDRESS names.
#include "device_run.h"
#include "kiv/reg.h"

#include <algorithm>
#include <benchmark/benchmark.h>
#include <chrono>
#include <cstdlib>
#include <dbus/dbus.h>
#include <fcntl.h>
#include <sys/inotify.h>
#include <sys/stat.h>
#include <thread>
#include <unistd.h>
#include <vector>

using steady = std::chrono::steady_clock;

constexpr int TURNS = 10000;
constexpr char WIFI_BRIGHTNESS[] = "/leds/led:wifi_blue/brightness";
constexpr char LIT = '2';
constexpr char DARK = '0';

struct led_watch {
    int changes; // inotify
    int file;
};

static double us_since(steady::time_point from)
{
    return std::chrono::duration<double, std::micro>(steady::now() - from).count();
}

static char shown(const led_watch &watch)
{
    char text = '\0';
    return pread(watch.file, &text, 1, 0) == 1 ? text : '\0';
}

static void wait_until_shows(const led_watch &watch, char expected)
{
    alignas(inotify_event) char events[4096];

    while (shown(watch) != expected) {
        if (read(watch.changes, events, sizeof events) <= 0) {
            give_up("inotify");
        }
    }
}

// The power-on scene has made the file once the LED is LIT.
static led_watch watch_led(const std::string &path)
{
    struct stat info;
    while (stat(path.c_str(), &info) != 0) {
        std::this_thread::sleep_for(std::chrono::milliseconds(10));
    }
    led_watch watch = {inotify_init1(IN_CLOEXEC), open(path.c_str(), O_RDONLY | O_CLOEXEC)};
    if (watch.file < 0 || inotify_add_watch(watch.changes, path.c_str(), IN_MODIFY) < 0) {
        give_up(path.c_str());
    }
    wait_until_shows(watch, LIT);
    return watch;
}

static double led_us(const char *queue_name, const led_watch &watch, bool on)
{
    const svc_msg message = notification(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, on ? "1" : "0");
    const auto from = steady::now();

    if (kiv_send_msg(queue_name, &message, message_length(message)) != 0) {
        give_up(queue_name);
    }
    wait_until_shows(watch, on ? LIT : DARK);
    return us_since(from);
}

static double dbus_us(DBusConnection *bus)
{
    const auto from = steady::now();
    DBusMessage *call = dbus_message_new_method_call(DBUS_SERVICE_DBUS, DBUS_PATH_DBUS, DBUS_INTERFACE_DBUS, "GetId");
    DBusMessage *reply = dbus_connection_send_with_reply_and_block(bus, call, DBUS_TIMEOUT_USE_DEFAULT, nullptr);
    const double us = us_since(from);

    if (reply == nullptr) {
        give_up("D-Bus");
    }
    dbus_message_unref(reply);
    dbus_message_unref(call);
    return us;
}

static double quantile(std::vector<double> &values, double share)
{
    const auto at = static_cast<long>(share * static_cast<double>(values.size() - 1));
    std::nth_element(values.begin(), values.begin() + at, values.end());
    return values[static_cast<size_t>(at)];
}

static void send_to_led_file(benchmark::State &state)
{
    device_run device = start_device();
    const led_watch watch = watch_led(device.dir + WIFI_BRIGHTNESS);
    start_bare_led(device);
    const led_watch bare_watch = watch_led(device.dir + BARE_BRIGHTNESS);
    DBusConnection *bus = dbus_bus_get(DBUS_BUS_SESSION, nullptr);
    std::vector<double> led;
    std::vector<double> bare;
    std::vector<double> dbus;

    if (bus == nullptr) {
        give_up("no D-Bus daemon");
    }
    for ([[maybe_unused]] auto turn : state) {
        const bool on = led.size() % 2 == 1; // they are LIT at first
        led.push_back(led_us(LED_QUEUE, watch, on));
        bare.push_back(led_us(BARE_LED_QUEUE, bare_watch, on));
        dbus.push_back(dbus_us(bus));
        state.SetIterationTime(led.back() * 1e-6);
    }
    end_device(device);
    const auto compare = [&](const char *name, std::vector<double> &other) {
        state.counters[std::string("1_ratio_median_") + name] = quantile(led, 0.5) / quantile(other, 0.5);
        state.counters[std::string("2_ratio_p99.9_") + name] = quantile(led, 0.999) / quantile(other, 0.999);
    };
    compare("bare", bare);
    compare("dbus", dbus);
    state.counters["3_led_us"] = quantile(led, 0.5);
    state.counters["4_led_p99.9_us"] = quantile(led, 0.999);
    state.counters["5_bare_us"] = quantile(bare, 0.5);
    state.counters["6_dbus_us"] = quantile(dbus, 0.5);
}
BENCHMARK(send_to_led_file)->UseManualTime()->Iterations(TURNS)->Unit(benchmark::kMicrosecond);

BENCHMARK_MAIN();
