// What the recorder costs a call: NV reads by a process of its own, alone, with the recorder loaded, and recorded into
// a file beside this program, in turns.
#include "kiv/nv.h"

#include <algorithm>
#include <benchmark/benchmark.h>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <string>
#include <unistd.h>
#include <vector>

constexpr int TURNS = 9;
constexpr int READS = 200'000;
constexpr const char *READER = "--read"; // the argument of the process that reads

static std::string own_path()
{
    char path[4096] = "";
    [[maybe_unused]] const ssize_t length = readlink("/proc/self/exe", path, sizeof path - 1);
    return path;
}

static void print_ns_of_a_read()
{
    char text[64];
    timespec from = {};
    timespec to = {};
    clock_gettime(CLOCK_MONOTONIC, &from);
    for (int i = 0; i < READS; ++i) {
        kiv_nvconfig_read("battery_value", text, sizeof text);
    }
    clock_gettime(CLOCK_MONOTONIC, &to);
    const double ns =
        1e9 * static_cast<double>(to.tv_sec - from.tv_sec) + static_cast<double>(to.tv_nsec - from.tv_nsec);
    std::printf("%f\n", ns / READS);
}

static double read_ns(const std::string &variables)
{
    const std::string command = variables + " '" + own_path() + "' " + READER;
    std::FILE *reader = popen(command.c_str(), "r");
    double ns = 0;
    if (reader == nullptr || std::fscanf(reader, "%lf", &ns) != 1 || pclose(reader) != 0) {
        std::fprintf(stderr, "%s\n", command.c_str());
        std::exit(EXIT_FAILURE);
    }
    return ns;
}

static double median(std::vector<double> &values)
{
    std::sort(values.begin(), values.end());
    return values[values.size() / 2];
}

static void recorded_nv_read(benchmark::State &state)
{
    const std::string file = own_path() + ".trace";
    const std::string loaded = std::string("LD_PRELOAD='") + RECORDER + "'";
    std::vector<double> ratio;
    std::vector<double> loaded_ratio;
    std::vector<double> alone_ns;
    std::vector<double> recorded_ns;

    for ([[maybe_unused]] auto turn : state) {
        alone_ns.push_back(read_ns(""));
        recorded_ns.push_back(read_ns(loaded + " KIV_RECORD='" + file + "'"));
        ratio.push_back(recorded_ns.back() / alone_ns.back());
        loaded_ratio.push_back(read_ns(loaded) / alone_ns.back());
    }
    unlink(file.c_str());
    unlink((file + ".1").c_str());
    state.counters["1_ratio"] = median(ratio);
    state.counters["2_ratio_loaded"] = median(loaded_ratio);
    state.counters["3_alone_ns"] = median(alone_ns);
    state.counters["4_recorded_ns"] = median(recorded_ns);
}
BENCHMARK(recorded_nv_read)->Iterations(TURNS)->Unit(benchmark::kMillisecond);

int main(int argc, char **argv)
{
    if (argc == 2 && std::strcmp(argv[1], READER) == 0) {
        print_ns_of_a_read();
        return 0;
    }
    benchmark::Initialize(&argc, argv);
    benchmark::RunSpecifiedBenchmarks();
    return 0;
}
