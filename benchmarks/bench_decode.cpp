// From a decoded message to the LED request, over a platform that does nothing, against the same calls made straight.
//   bench_decode [Google Benchmark's options]   nanoseconds; with KIV_INSTRUCTIONS=FILE the counts beside them
//   bench_decode --count                        under callgrind: one dump a loop, named after it
#include "cases.h"
#include "straight_calls.h"

#include <algorithm>
#include <benchmark/benchmark.h>
#include <chrono>
#include <cstdlib>
#include <cstring>
#include <deque>
#include <fstream>
#include <map>
#include <string>
#include <valgrind/callgrind.h>
#include <vector>

constexpr int BATCH = 1000;   // messages between two looks at the clock
constexpr int COUNTED = 1000; // messages a callgrind dump counts
using steady = std::chrono::steady_clock;

struct instruction_counts {
    double daemon;
    double straight;
};

__attribute__((noinline)) static void run_daemon(const bench_case &which, const case_messages &messages, int count)
{
    for (int i = 0; i < count; i += 2) {
        hear(which, messages[0]);
        hear(which, messages[1]);
    }
}

__attribute__((noinline)) static void run_straight(const straight_case &straight, int count)
{
    for (int i = 0; i < count; i += 2) {
        straight.messages[0]();
        straight.messages[1]();
    }
}

static double ns_per_message(steady::time_point from)
{
    return std::chrono::duration<double, std::nano>(steady::now() - from).count() / BATCH;
}

static double median(std::vector<double> &values)
{
    std::nth_element(values.begin(), values.begin() + static_cast<long>(values.size() / 2), values.end());
    return values[values.size() / 2];
}

// Turn and turn about, so that whatever else the machine does meets both.
static void compare(benchmark::State &state, size_t index, instruction_counts counts)
{
    const bench_case &which = bench_cases()[index];
    const straight_case &straight = straight_cases()[index];
    case_messages messages;
    std::vector<double> daemon_ns;
    std::vector<double> straight_ns;
    std::vector<double> ratio;

    settle(which, messages);
    for ([[maybe_unused]] auto turn : state) {
        const auto daemon_from = steady::now();
        run_daemon(which, messages, BATCH);
        daemon_ns.push_back(ns_per_message(daemon_from));
        const auto straight_from = steady::now();
        run_straight(straight, BATCH);
        straight_ns.push_back(ns_per_message(straight_from));
        ratio.push_back(daemon_ns.back() / straight_ns.back());
        state.SetIterationTime(daemon_ns.back() * BATCH * 1e-9);
    }
    state.counters["1_ratio"] = median(ratio);
    state.counters["2_daemon_ns"] = median(daemon_ns);
    state.counters["3_straight_ns"] = median(straight_ns);
    state.counters["8_calls"] = straight.calls / 2.0;
    if (counts.straight > 0) {
        state.counters["4_ratio_instr"] = counts.daemon / counts.straight;
        state.counters["5_daemon_instr"] = counts.daemon;
        state.counters["6_straight_instr"] = counts.straight;
    }
}

static int count_instructions()
{
    const auto cases = bench_cases();
    std::deque<std::string> names; // callgrind reads a dump's name after the call

    for (size_t i = 0; i < cases.size(); ++i) {
        const std::string name = cases[i].name;
        case_messages messages;
        settle(cases[i], messages);
        run_straight(straight_cases()[i], 2); // binds what is bound at the first call
        CALLGRIND_ZERO_STATS;
        run_daemon(cases[i], messages, COUNTED);
        CALLGRIND_DUMP_STATS_AT(names.emplace_back(name + " daemon").c_str());
        run_straight(straight_cases()[i], COUNTED);
        CALLGRIND_DUMP_STATS_AT(names.emplace_back(name + " straight").c_str());
    }
    return EXIT_SUCCESS;
}

// Lines of CASE daemon|straight COUNT, the count for all messages of a dump.
static std::map<std::string, instruction_counts> read_counts()
{
    std::map<std::string, instruction_counts> counts;
    const char *path = std::getenv("KIV_INSTRUCTIONS");
    std::ifstream file(path == nullptr ? "" : path);
    std::string name;
    std::string side;
    for (double count = 0; file >> name >> side >> count;) {
        (side == "daemon" ? counts[name].daemon : counts[name].straight) = count / COUNTED;
    }
    return counts;
}

int main(int argc, char **argv)
{
    if (argc == 2 && std::strcmp(argv[1], "--count") == 0) {
        return count_instructions();
    }
    auto counts = read_counts();
    for (size_t i = 0; i < bench_cases().size(); ++i) {
        const std::string name = bench_cases()[i].name;
        const instruction_counts of_case = counts[name];
        benchmark::RegisterBenchmark(name.c_str(),
                                     [i, of_case](benchmark::State &state) { compare(state, i, of_case); })
            ->UseManualTime()
            ->Iterations(200);
    }
    benchmark::Initialize(&argc, argv);
    if (benchmark::ReportUnrecognizedArguments(argc, argv)) {
        return EXIT_FAILURE;
    }
    benchmark::RunSpecifiedBenchmarks();
    return EXIT_SUCCESS;
}
