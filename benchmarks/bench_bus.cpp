// Notifications per second through the bus into the real daemon, against a process that receives and does nothing else.
#include "device_run.h"
#include "kiv/reg.h"

#include <algorithm>
#include <benchmark/benchmark.h>
#include <chrono>
#include <cstdlib>
#include <sys/socket.h>
#include <unistd.h>
#include <vector>

using steady = std::chrono::steady_clock;

struct bus_case {
    const char *name;
    uint16_t module;
    uint32_t event;
    const char *payload;
    int batch; // messages between two looks at the clock
};

// From no platform call but the log to several files read and written.
constexpr bus_case bus_cases[] = {
    {"ppp-unchanged", KIV_MODULE_PPP,    REG_PPP_STATUS,          "1", 20000},
    {"sim",           KIV_MODULE_MDM,    REG_SIM_STATUS,          "",  20000},
    {"net-type-same", KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE,      "",  20000},
    {"wlan",          KIV_MODULE_WLAN,   REG_WLAN_CURRENT_STATUS, "1", 10000},
    {"battery",       KIV_MODULE_MAIN,   REG_MC_BATTERY_VALUE,    "",  4000 },
};
constexpr int ROUNDS = 15;

static device_run device;

enum class sender { connected, contract };

static void send_all(sender by, int queue, const char *queue_name, const svc_msg &message, int count)
{
    const int length = message_length(message);

    for (int i = 0; i < count; ++i) {
        const bool sent = by == sender::contract ? kiv_send_msg(queue_name, &message, length) == 0
                                                 : send(queue, &message, static_cast<size_t>(length), 0) == length;
        if (!sent) {
            give_up("send");
        }
    }
}

// Seconds until the reader has taken every message.
static double batch_s(sender by, const char *queue_name, const bus_case &which)
{
    const svc_msg message = notification(which.module, which.event, which.payload);
    const int queue = connect_queue(device, queue_name);
    const auto from = steady::now();

    send_all(by, queue, queue_name, message, which.batch - 1);
    send_all(sender::connected, queue, queue_name, message, 1); // queues keep the order: once it is taken, all are
    wait_until_taken(queue);
    const double seconds = std::chrono::duration<double>(steady::now() - from).count();
    close(queue);
    return seconds;
}

static double median(std::vector<double> &values)
{
    std::nth_element(values.begin(), values.begin() + static_cast<long>(values.size() / 2), values.end());
    return values[values.size() / 2];
}

static void compare(benchmark::State &state, sender by, const bus_case &which)
{
    std::vector<double> daemon_s;
    std::vector<double> bare_s;
    std::vector<double> ratio;

    for ([[maybe_unused]] auto turn : state) {
        daemon_s.push_back(batch_s(by, LED_QUEUE, which));
        bare_s.push_back(batch_s(by, BARE_QUEUE, which));
        ratio.push_back(bare_s.back() / daemon_s.back());
        state.SetIterationTime(daemon_s.back());
    }
    const double daemon = median(daemon_s) / which.batch;
    const double bare = median(bare_s) / which.batch;
    state.counters["1_ratio"] = median(ratio);
    state.counters["2_daemon_per_s"] = 1 / daemon;
    state.counters["3_bare_per_s"] = 1 / bare;
}

int main(int argc, char **argv)
{
    for (const bus_case &which : bus_cases) {
        for (const sender by : {sender::contract, sender::connected}) {
            const std::string name = std::string(by == sender::contract ? "contract/" : "connected/") + which.name;
            benchmark::RegisterBenchmark(name.c_str(),
                                         [by, &which](benchmark::State &state) { compare(state, by, which); })
                ->UseManualTime()
                ->Iterations(ROUNDS)
                ->Unit(benchmark::kMillisecond);
        }
    }
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return EXIT_FAILURE;
    }
    device = start_device();
    benchmark::RunSpecifiedBenchmarks();
    end_device(device);
    return EXIT_SUCCESS;
}
