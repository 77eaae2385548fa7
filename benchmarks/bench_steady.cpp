// Ten MILLION messages through the receive path, over a platform that does nothing: what one costs, and the memory, by
// the MILLION.
#include "cases.h"
#include "null_platform.h"

#include <benchmark/benchmark.h>
#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <vector>

constexpr int MILLIONS = 10;
constexpr int MILLION = 1'000'000;

struct feed {
    std::vector<svc_msg> messages;
    std::vector<int> lengths;
};

// Every case of the handheld, in order: power comes and goes with it.
static feed handheld_feed()
{
    feed all;
    for (const bench_case &which : bench_cases()) {
        if (which.product != LED_PRODUCT_UFI) {
            continue;
        }
        case_messages messages;
        settle(which, messages);
        for (const received_message &received : messages) {
            const int length = static_cast<int>(offsetof(svc_msg, ul_event_mask)) + received.message.us_data_len;
            all.messages.push_back(received.message);
            all.lengths.push_back(length);
        }
    }
    return all;
}

static double rss_kib()
{
    char line[128];
    double kib = 0;
    std::FILE *status = std::fopen("/proc/self/status", "r");
    while (status != nullptr && std::fgets(line, sizeof line, status) != nullptr) {
        if (std::sscanf(line, "VmRSS: %lf", &kib) == 1) {
            break;
        }
    }
    if (status != nullptr) {
        std::fclose(status);
    }
    return kib;
}

// Of this thread alone: other programs do not count.
static double cpu_ns()
{
    timespec now = {};
    clock_gettime(CLOCK_THREAD_CPUTIME_ID, &now);
    return static_cast<double>(now.tv_sec) * 1e9 + static_cast<double>(now.tv_nsec);
}

static double million_ns()
{
    received_message received;
    const double from = cpu_ns();
    for (int i = 0; i < MILLION; ++i) {
        kiv_led_receive_message(received);
    }
    return (cpu_ns() - from) / MILLION;
}

static void ten_million_messages(benchmark::State &state)
{
    const feed fed = handheld_feed();
    std::vector<double> ns;
    std::vector<double> kib;

    null_platform_feed(fed.messages.data(), fed.lengths.data(), fed.messages.size());
    rss_kib();
    for ([[maybe_unused]] auto turn : state) {
        kib.push_back(rss_kib());
        for (int i = 0; i < MILLIONS; ++i) {
            ns.push_back(million_ns());
            kib.push_back(rss_kib());
        }
    }
    state.counters["1_last_to_first"] = ns[MILLIONS - 1] / ns[0];
    state.counters["2_ns_first"] = ns[0];
    state.counters["3_ns_fifth"] = ns[MILLIONS / 2 - 1];
    state.counters["4_ns_last"] = ns[MILLIONS - 1];
    state.counters["5_rss_before_KiB"] = kib.front();
    state.counters["6_rss_after_KiB"] = kib.back();
}
BENCHMARK(ten_million_messages)->Iterations(1)->Unit(benchmark::kMillisecond);

BENCHMARK_MAIN();
