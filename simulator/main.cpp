// kiv_led_sim: plays scenarios against the daemon on a PC.
#include "names.h"
#include "player.h"
#include "table.h"
#include "words.h"

#include "device.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace fs = std::filesystem;

namespace
{
constexpr int EXIT_FAILED = 1;
constexpr int EXIT_UNREADABLE = 2;

struct run_options {
    daemon_options daemon;
    std::vector<std::string> files;
    std::string trace_path;
    bool keep = false;
    bool quiet = false;
    bool all_requests = false;
};

bool load_scenario_file(const std::string &path, std::string &text)
{
    std::error_code failure;
    return fs::is_regular_file(path, failure) && fs::file_size(path, failure) <= SCENARIO_FILE_MAX &&
           read_file(path, text);
}

bool load_story(const std::string &path, scenario &story)
{
    std::string text;
    std::string error = path + ": cannot be read, or is larger than 256 KiB";
    if (load_scenario_file(path, text) && parse_scenario(text, path, load_scenario_file, story, error))
        return true;
    fprintf(stderr, "%s\n", error.c_str());
    return false;
}

// A folder stands for every scenario in and below it, in the order of their names.
bool expand(const std::string &path, std::vector<std::string> &files)
{
    std::error_code failure;
    if (!fs::is_directory(path, failure)) {
        files.push_back(path);
        return true;
    }
    std::vector<std::string> found;
    for (const fs::directory_entry &entry : fs::recursive_directory_iterator(path, failure)) {
        if (entry.path().extension() == ".scn")
            found.push_back(entry.path().string());
    }
    if (found.empty()) {
        fprintf(stderr, "%s: holds no scenario (*.scn)\n", path.c_str());
        return false;
    }
    std::sort(found.begin(), found.end());
    files.insert(files.end(), found.begin(), found.end());
    return true;
}

// How many real seconds the run took goes to standard error: it is the one thing that differs from run to run.
void print_report(const run_options &options, const std::string &path, const play_report &report, double seconds)
{
    fflush(stdout);
    if (!report.failure.empty())
        fputs(report.failure.c_str(), stderr);
    if (report.result != PLAY_HELD)
        return;
    if (options.quiet)
        printf("%s: ", path.c_str());
    printf("%lld expectation%s held, %.3f s of device time\n", static_cast<long long>(report.held),
           report.held == 1 ? "" : "s", static_cast<double>(report.virtual_ns) / NS_PER_S);
    fflush(stdout);
    if (!options.quiet)
        fprintf(stderr, "played in %.3f s\n", seconds);
}

int run_here(const run_options &options, const std::string &path)
{
    scenario story;
    if (!load_story(path, story))
        return EXIT_UNREADABLE;
    const play_options how = {
        .process = options.daemon,
        .trace_path = options.trace_path,
        .keep_device = options.keep,
        .every_request = options.all_requests,
        .timeline = options.quiet ? nullptr : stdout,
    };
    const auto begin = std::chrono::steady_clock::now();
    const play_report report = play(story, how);
    const std::chrono::duration<double> took = std::chrono::steady_clock::now() - begin;
    print_report(options, path, report, took.count());
    return report.result;
}

// Each scenario has a process for itself, as it has a device for itself.
int run_apart(const run_options &options, const std::string &path)
{
    fflush(stdout);
    const pid_t child = fork();
    if (child == 0) {
        const int result = run_here(options, path);
        fflush(stdout);
        _exit(result);
    }
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) < 0 || !WIFEXITED(status)) {
        fprintf(stderr, "%s: the simulator itself failed\n", path.c_str());
        return EXIT_FAILED;
    }
    return WEXITSTATUS(status);
}

int run(run_options &options)
{
    std::vector<std::string> files;
    std::string error;
    int worst = 0;
    if (!find_daemon(options.daemon, error)) {
        fprintf(stderr, "%s\n", error.c_str());
        return EXIT_UNREADABLE;
    }
    if (!options.trace_path.empty()) {
        options.trace_path = fs::absolute(options.trace_path).string();
        std::error_code failure;
        fs::remove(options.trace_path, failure);
    }
    for (const std::string &path : options.files) {
        if (!expand(path, files))
            worst = EXIT_UNREADABLE;
    }
    for (const std::string &path : files) {
        if (files.size() > 1 && !options.quiet)
            printf("== %s\n", path.c_str());
        worst = std::max(worst, run_apart(options, path));
    }
    return worst;
}

int check(const std::vector<std::string> &paths)
{
    std::vector<std::string> files;
    int worst = 0;
    for (const std::string &path : paths) {
        if (!expand(path, files))
            worst = EXIT_UNREADABLE;
    }
    for (const std::string &path : files) {
        scenario story;
        if (!load_story(path, story))
            worst = EXIT_UNREADABLE;
    }
    return worst;
}
} // namespace

// NOLINTNEXTLINE(bugprone-exception-escape): without memory the simulator ends
int main(int argc, char **argv)
{
    CLI::App app("Plays the rest of the device around the LED daemon, and shows what its LEDs do.");
    run_options options;
    std::string product;
    app.require_subcommand(1);

    CLI::App *run_command = app.add_subcommand("run", "Play scenarios against the daemon");
    run_command->add_option("FILE", options.files, "Scenarios, or folders of them")->required();
    run_command->add_flag("--real-time", options.daemon.real_time, "Play on the wall clock");
    run_command->add_flag("--keep", options.keep, "Keep the device directory");
    run_command->add_flag("--quiet", options.quiet, "One line a scenario, no timeline");
    run_command->add_flag("--all-requests", options.all_requests, "Show every LED request, not only what it changes");
    run_command->add_option("--trace", options.trace_path, "Leave the daemon's trace in this file");

    CLI::App *check_command = app.add_subcommand("check", "Read scenarios without playing them");
    check_command->add_option("FILE", options.files, "Scenarios, or folders of them")->required();

    CLI::App *table_command = app.add_subcommand("table", "Show what the LEDs of a product show in each state");
    table_command->add_option("PRODUCT", product, "One of " + product_names())->required();

    for (CLI::App *command : {run_command, table_command}) {
        command->add_option("--daemon", options.daemon.daemon, "The daemon's program");
        command->add_option("--emulator", options.daemon.emulator, "A command that runs the daemon's program");
    }

    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError &error) {
        return app.exit(error) == 0 ? 0 : EXIT_UNREADABLE;
    }
    if (*check_command)
        return check(options.files);
    if (*table_command)
        return print_table(product, options.daemon);
    return run(options);
}
