// kiv_led_sim: plays scenarios against the daemon on a PC.
#include "evidence/commands.h"
#include "language/doubts.h"
#include "language/names.h"
#include "language/words.h"
#include "live/commands.h"
#include "live/watch.h"
#include "panel/panel.h"
#include "panel/sketch.h"
#include "panel/table_picture.h"
#include "program/run.h"
#include "reference.h"
#include "stories.h"
#include "table.h"

#include "world/device.h"

#include <CLI/CLI.hpp>

#include <algorithm>
#include <chrono>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <string>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace fs = std::filesystem;

namespace
{
constexpr int EXIT_UNREADABLE = 2;

int table(const std::string &name, daemon_options options, bool as_svg)
{
    const product_name *product = find_product(name);
    std::vector<table_row> rows;
    std::string svg;
    std::string error;
    if (!product) {
        error = "unknown product '" + name + "'; products are " + product_names();
    } else if (find_daemon(options, error)) {
        if (const int result = play_table(*product, options, rows)) {
            return result;
        }
        if (!as_svg) {
            print_table(*product, rows);
        } else if (draw_table(*product, rows, svg, error)) {
            fputs(svg.c_str(), stdout);
        }
    }
    if (!error.empty()) {
        fprintf(stderr, "%s\n", error.c_str());
        return EXIT_UNREADABLE;
    }
    return 0;
}

int show_trace(const evidence_options &options, const std::string &picture_path)
{
    std::vector<shown_step> steps;
    std::string error;
    if (const int result = show_command(options, steps)) {
        return result;
    }
    if (!picture_path.empty() && !write_file(picture_path, draw_run(picture_of(steps, options.file)), error)) {
        fprintf(stderr, "%s\n", error.c_str());
        return EXIT_UNREADABLE;
    }
    return 0;
}

int words_of(const std::string &name, daemon_options options)
{
    const product_name *product = find_product(name);
    std::string error;
    if (!product && !name.empty()) {
        error = "unknown product '" + name + "'; products are " + product_names();
    } else if (find_daemon(options, error)) {
        return print_reference(product, options);
    }
    fprintf(stderr, "%s\n", error.c_str());
    return EXIT_UNREADABLE;
}

int check(const std::vector<std::string> &paths)
{
    std::vector<std::string> files;
    int worst = find_stories(paths, files) ? 0 : EXIT_UNREADABLE;
    for (const std::string &path : files) {
        scenario story;
        std::string error;
        if (!load_story(path, story, error)) {
            fputs(error.c_str(), stderr);
            worst = EXIT_UNREADABLE;
            continue;
        }
        for (const std::string &doubt : find_doubts(story)) {
            fprintf(stderr, "%s\n", doubt.c_str());
        }
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
    evidence_options evidence;
    bool as_svg = false;
    panel_options panel;
    app.require_subcommand(1);

    CLI::App *run_command = app.add_subcommand("run", "Play scenarios against the daemon");
    run_command->add_option("FILE", options.files, "Scenarios, or folders of them")->required();
    run_command->add_flag("--real-time", options.daemon.real_time, "Play on the wall clock");
    run_command->add_flag("--keep", options.keep, "Keep the device directory");
    run_command->add_flag("--quiet", options.quiet, "One line a scenario, no timeline");
    run_command->add_flag("--all-requests", options.all_requests, "Show every LED request, not only what it changes");
    run_command->add_option("--trace", options.trace_path, "Leave the daemon's trace in this file");
    run_command->add_flag("--log", options.show_log, "Show the daemon's log beside the timeline");
    run_command->add_flag("--keep-going", options.keep_going, "Go on after an expectation that does not hold");
    run_command->add_option("-j,--jobs", options.jobs, "How many scenarios to play at a time")
        ->check(CLI::Range(1, 64));
    run_command->add_option("--filter", options.filter, "Only scenarios whose path holds this text");
    run_command->add_option("--junit", options.junit_path, "Write the outcome into this XML file");
    run_command->add_option("--artifacts", options.artifacts, "Leave what failed in this folder");
    run_command->add_option("--picture", options.picture_path, "Draw the run into this SVG file");

    CLI::App *check_command = app.add_subcommand("check", "Read scenarios without playing them");
    check_command->add_option("FILE", options.files, "Scenarios, or folders of them")->required();

    CLI::App *table_command = app.add_subcommand("table", "Show what the LEDs of a product show in each state");
    table_command->add_option("PRODUCT", product, "One of " + product_names())->required();
    table_command->add_flag("--svg", as_svg, "As a picture, for a user's manual");

    CLI::App *words_command =
        app.add_subcommand("words", "List the words of scenarios, and what the daemon makes of them");
    words_command->add_option("PRODUCT", product, "Only what this one hears and reads: " + product_names());

    live_options live;
    CLI::App *live_app = app.add_subcommand("live", "Talk to a daemon on the wall clock");
    live_app->add_option("--product", live.product, "Start it as one of " + product_names());
    CLI::Option *device =
        live_app->add_option("--device", live.device, "A device directory where it waits or runs already");
    live_app->add_option("FILE", live.file, "Statements; otherwise standard input");

    for (CLI::App *command : {run_command, live_app}) {
        CLI::Option *led_dir = command->add_option("--led-dir", options.daemon.led_dir,
                                                   "Show it on the real LEDs in this folder, on the wall clock");
        CLI::Option *led_map =
            command->add_option("--led-map", options.daemon.led_map, "Which of them each LED drives");
        CLI::Option *under = command->add_option("--under", options.daemon.under,
                                                 "Start the daemon behind this command, such as 'gdb --args'");
        led_dir->check(CLI::ExistingDirectory)->excludes(device);
        led_map->check(CLI::ExistingFile)->needs(led_dir);
        under->excludes(device);
    }

    CLI::App *show = app.add_subcommand("show", "Show a trace as a timeline");
    show->add_option("TRACE", evidence.file, "What run --trace or a recording left")->required();
    show->add_flag("--all-requests", evidence.all_requests, "Show every LED request, not only what it changes");
    show->add_option("--picture", options.picture_path, "Draw the trace into this SVG file");

    CLI::App *why = app.add_subcommand("why", "Say why an LED shows what it shows");
    why->add_option("TRACE", evidence.file, "What run --trace or a recording left, or a log")->required();
    why->add_option("LED", evidence.led, "Its name, such as bat_green")->required();
    why->add_option("--at", evidence.at_s, "At this second of the trace or line of the log; otherwise at its end");
    why->add_flag("--log", evidence.from_log, "The file is a plain log of a device");
    why->add_flag("--all", evidence.always, "Every change of the LED with its cause");

    CLI::App *story = app.add_subcommand("story", "Tell a trace as a scenario");
    story->add_option("TRACE", evidence.file, "What run --trace or a recording left")->required();

    CLI::App *replay = app.add_subcommand("replay", "Let the daemon do again what a trace tells, and compare");
    replay->add_option("TRACE", evidence.file, "What run --trace or a recording left")->required();
    replay->add_option("--trace", evidence.out, "Leave the replay's own trace in this file");
    replay->add_flag("--lines", evidence.lines, "The log's line numbers count too");
    replay->add_option("--daemon", options.daemon.daemon, "The daemon's program");

    CLI::App *panel_command = app.add_subcommand("panel", "Open the device's front in a browser");
    panel_command->add_option("WHAT", panel.what, "A product, or a scenario to play: " + product_names());
    panel_command->add_option("--port", panel.port, "The port on 127.0.0.1; otherwise a free one")
        ->check(CLI::Range(1, 65535));
    panel_command->add_option("--scenarios", panel.scenarios, "The folder of the scenarios that the page offers");
    panel_command->add_flag("!--no-browser", panel.browser, "Only print the address");

    std::vector<std::string> words;
    CLI::App *send = app.add_subcommand("send", "Play one statement to a daemon that runs");
    send->add_option("--device", live.device, "Its device directory")->required();
    send->add_option("STATEMENT", words, "A statement of the scenario language")->required();
    send->positionals_at_end();

    CLI::App *watch = app.add_subcommand("watch", "Show the LEDs and the log of a daemon that runs");
    watch->add_option("--device", live.device, "Its device directory")->required();

    for (CLI::App *command : {run_command, table_command, words_command, panel_command, live_app}) {
        command->add_option("--daemon", options.daemon.daemon, "The daemon's program");
        command->add_option("--emulator", options.daemon.emulator, "A command that runs the daemon's program");
    }

    try {
        app.parse(argc, argv);
    } catch (const CLI::ParseError &error) {
        return app.exit(error) == 0 ? 0 : EXIT_UNREADABLE;
    }
    if (*check_command) {
        return check(options.files);
    }
    if (*table_command) {
        return table(product, options.daemon, as_svg);
    }
    if (*words_command) {
        return words_of(product, options.daemon);
    }
    if (*panel_command) {
        panel.process = options.daemon;
        return run_panel(panel);
    }
    if (*show) {
        return show_trace(evidence, options.picture_path);
    }
    if (*story) {
        return story_command(evidence);
    }
    if (*replay) {
        return replay_command(evidence, options.daemon);
    }
    if (*why) {
        return why_command(evidence);
    }
    // Who stands around the daemon is talked to at the terminal, unless the statements come from there.
    const bool is_spoken_to = *live_app && live.file.empty();
    options.daemon.lends_terminal = !options.daemon.under.empty() && !is_spoken_to && isatty(STDIN_FILENO);
    if (*live_app) {
        live.process = options.daemon;
        return live_command(live);
    }
    if (*watch) {
        return watch_command(live.device);
    }
    if (*send) {
        return send_command(live.device, words);
    }
    return run(options);
}
