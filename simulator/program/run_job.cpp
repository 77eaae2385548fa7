#include "program/run_job.h"

#include "language/words.h"
#include "panel/sketch.h"
#include "player.h"
#include "stories.h"
#include "world/device.h"

#include <chrono>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sstream>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace
{
constexpr std::streamsize PIECE_BYTES = 1 << 16;

// The child's part: plays, and leaves the outcome in its folder.
void leave(const run_job &job, const char *name, const std::string &text)
{
    std::string error;
    if (!text.empty() && !write_file(job.folder + "/" + name, text, error)) {
        fprintf(stderr, "%s\n%s", error.c_str(), strcmp(name, "failure") == 0 ? text.c_str() : "");
    }
}

std::string failures_of(const play_report &report)
{
    std::string text;
    for (const played &failed : report.failed) {
        text += failed.failure;
    }
    if (!report.device.empty()) {
        text += "  the device directory is kept: " + report.device + "\n";
    }
    return text;
}

std::string joined(const std::vector<std::string> &lines)
{
    std::string text;
    for (const std::string &line : lines) {
        text += line + "\n";
    }
    return text;
}

int play_story(const run_options &options, const run_job &job, FILE *timeline)
{
    scenario story;
    std::string error;
    if (!load_story(job.path, story, error)) {
        leave(job, "failure", error);
        return PLAY_IMPOSSIBLE;
    }
    player_options how;
    how.process = options.daemon;
    how.trace_path = options.trace_path.empty() ? "" : job.folder + "/trace";
    how.every_request = options.all_requests;
    how.show_log = options.show_log;
    how.keep_going = options.keep_going;
    how.timeline = timeline;
    sketch drawn;
    drawn.picture.title = job.path;
    play_watcher watcher;
    if (!options.picture_path.empty()) {
        watcher = [&](const statement &s, const played &did) { add_to_sketch(drawn, s, did); };
    }
    const play_report report = play(story, how, options.keep, watcher);
    leave(job, "failure", failures_of(report));
    // On real LEDs: one that is missing, a map that cannot be read.
    leave(job, "warnings", joined(report.warnings) + (options.daemon.led_dir.empty() ? "" : report.complaints));
    leave(job, "numbers", std::to_string(report.held) + " " + std::to_string(report.end_ns));
    leave(job, "device", report.device);
    if (watcher && !write_file(options.picture_path, draw_run(drawn.picture), error)) {
        leave(job, "failure", error + "\n");
        return PLAY_IMPOSSIBLE;
    }
    return report.last.result;
}

[[noreturn]] void be_player(const run_options &options, const run_job &job, bool captured)
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    for (const int number : {SIGINT, SIGTERM, SIGHUP}) {
        signal(number, SIG_DFL);
    }
    if (options.daemon.lends_terminal) {
        signal(SIGINT, SIG_IGN); // an interrupt at the terminal is the debugger's
    } else {
        setpgid(0, 0); // or our parent's
    }
    setenv("TMPDIR", job.folder.c_str(), 1);
    FILE *timeline = options.quiet && options.artifacts.empty() ? nullptr : stdout;
    if (captured && timeline) {
        timeline = fopen((job.folder + "/timeline").c_str(), "w");
    }
    const auto begin = std::chrono::steady_clock::now();
    const int result = play_story(options, job, timeline);
    const std::chrono::duration<double> took = std::chrono::steady_clock::now() - begin;
    leave(job, "seconds", std::to_string(took.count()));
    if (timeline) {
        fflush(timeline);
    }
    _exit(result);
}
} // namespace

bool start_job(const run_options &options, run_job &job, bool captured)
{
    std::string error;
    fflush(stdout);
    job.folder = make_device(error);
    job.pid = job.folder.empty() ? -1 : fork();
    if (job.pid == 0) {
        be_player(options, job, captured);
    }
    if (job.pid < 0) {
        fprintf(stderr, "%s: %s\n", job.path.c_str(), error.empty() ? "no process" : error.c_str());
        job.done = true;
        job.outcome.path = job.path;
        job.outcome.result = PLAY_IMPOSSIBLE;
    }
    return job.pid > 0;
}

void read_outcome(run_job &job, int status)
{
    std::string text;
    long long end_ns = 0;
    run_outcome &outcome = job.outcome;
    outcome.path = job.path;
    outcome.result = WIFEXITED(status) ? WEXITSTATUS(status) : PLAY_FAILED;
    read_file(job.folder + "/failure", outcome.failure);
    read_file(job.folder + "/warnings", outcome.warnings);
    std::istringstream numbers(read_file(job.folder + "/numbers", text) ? text : "");
    numbers >> outcome.held >> end_ns;
    outcome.device_s = static_cast<double>(end_ns) / NS_PER_S;
    outcome.real_s = read_file(job.folder + "/seconds", text) ? strtod(text.c_str(), nullptr) : 0;
    if (outcome.result != PLAY_HELD && outcome.failure.empty()) {
        outcome.failure = job.path + ": the simulator itself failed\n";
    }
}

// The timeline, the failure, and the device with the daemon's trace.
void keep_artifacts(const run_options &options, run_job &job)
{
    std::string name = job.path;
    std::string device;
    std::error_code failure;
    if (options.artifacts.empty() || job.outcome.result == PLAY_HELD) {
        return;
    }
    std::replace(name.begin(), name.end(), '/', '_');
    const fs::path place = fs::path(options.artifacts) / name;
    fs::create_directories(place, failure);
    for (const char *file : {"timeline", "failure"}) {
        fs::copy_file(fs::path(job.folder) / file, place / file, fs::copy_options::overwrite_existing, failure);
    }
    if (read_file(job.folder + "/device", device) && fs::is_directory(device, failure)) {
        for (const char *part : {"bus", "bsp/ind", "bsp/ind.lock"}) {
            fs::remove_all(fs::path(device) / part, failure); // sockets cannot be copied
        }
        fs::copy(device, place / "device", fs::copy_options::recursive | fs::copy_options::overwrite_existing, failure);
        if (failure) {
            fprintf(stderr, "%s: %s\n", place.c_str(), failure.message().c_str());
        } else if (!options.keep) {
            fs::remove_all(device, failure);
        }
    }
}

void clear_job(const run_job &job)
{
    std::error_code failure;
    for (const char *file : {"failure", "warnings", "numbers", "seconds", "device", "timeline", "trace"}) {
        fs::remove(fs::path(job.folder) / file, failure);
    }
    fs::remove(job.folder, failure);
}

bool append_trace(const run_job &job, const std::string &to)
{
    std::ifstream in(job.folder + "/trace", std::ios::binary);
    std::ofstream out(to, std::ios::binary | std::ios::app);
    std::vector<char> piece(PIECE_BYTES);
    while (in.read(piece.data(), PIECE_BYTES), in.gcount() > 0) {
        out.write(piece.data(), in.gcount());
    }
    out.close();
    return !out.fail();
}
