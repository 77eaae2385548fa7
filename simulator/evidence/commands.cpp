#include "evidence/commands.h"

#include "evidence/replay.h"
#include "evidence/show.h"
#include "evidence/story.h"
#include "evidence/why.h"
#include "language/names.h"

#include <cstdio>
#include <filesystem>

namespace
{
constexpr int EXIT_UNREADABLE = 2;

int refuse(const std::string &what)
{
    fprintf(stderr, "%s\n", what.c_str());
    return EXIT_UNREADABLE;
}
} // namespace

int show_command(const evidence_options &options)
{
    recording trace;
    std::string error;
    if (!load_recording(options.file, trace, error)) {
        return refuse(error);
    }
    show_recording(trace, {.every_request = options.all_requests}, stdout);
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
    std::string error;
    const std::optional<int> led = find_led(options.led);
    if (!led) {
        return refuse("unknown LED '" + options.led + "'; LEDs are " + led_names());
    }
    if (!load_recording(options.file, trace, error)) {
        return refuse(error);
    }
    const history told = history_of(trace);
    const size_t until =
        options.at_s < 0 ? trace.entries.size() : entry_after(trace, static_cast<int64_t>(options.at_s * 1'000'000));
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
