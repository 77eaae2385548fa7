#include "evidence/commands.h"

#include "evidence/from_log.h"
#include "evidence/replay.h"
#include "evidence/story.h"
#include "evidence/why.h"
#include "language/names.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>

namespace
{
constexpr int EXIT_UNREADABLE = 2;
constexpr double LONGEST_S = 1e12;

int refuse(const std::string &what)
{
    fprintf(stderr, "%s\n", what.c_str());
    return EXIT_UNREADABLE;
}
} // namespace

int show_command(const evidence_options &options, std::vector<shown_step> &steps)
{
    recording trace;
    std::string error;
    if (!load_recording(options.file, trace, error)) {
        return refuse(error);
    }
    steps = show_recording(trace, {.every_request = options.all_requests}, stdout);
    return 0;
}

int story_command(const evidence_options &options)
{
    recording trace;
    std::string error;
    if (!load_recording(options.file, trace, error)) {
        return refuse(error);
    }
    fputs(story_of(trace).c_str(), stdout);
    return 0;
}

int why_command(const evidence_options &options)
{
    recording trace;
    log_history log;
    std::string error;
    const std::optional<int> led = find_led(options.led);
    if (!led) {
        return refuse("unknown LED '" + options.led + "'; LEDs are " + led_names());
    }
    if (!(options.from_log ? load_log(options.file, log, error) : load_recording(options.file, trace, error))) {
        return refuse(error);
    }
    const history told = options.from_log ? std::move(log.told) : history_of(trace);
    const auto at_us = static_cast<int64_t>(std::min(options.at_s, LONGEST_S) * 1'000'000);
    const size_t until = options.at_s < 0 ? told.trace->entries.size() : entry_after(*told.trace, at_us);
    fputs((options.always ? why_always(told, *led) : why(told, *led, until)).c_str(), stdout);
    return 0;
}

int replay_command(const evidence_options &options, daemon_options daemon)
{
    recording trace;
    std::string text;
    std::error_code failure;
    if (!find_daemon(daemon, text) || !load_recording(options.file, trace, text)) {
        return refuse(text);
    }
    if (!options.out.empty()) {
        std::filesystem::remove(options.out, failure);
    }
    const replay_options how = {.process = daemon, .out_path = options.out, .lines = options.lines};
    const replay_result result = replay(trace, how, text);
    fputs(text.c_str(), result == REPLAYED_SAME ? stdout : stderr);
    return result;
}
