#include "program/run.h"

#include "junit.h"
#include "language/words.h"
#include "panel/sketch.h"
#include "player.h"
#include "stories.h"
#include "world/device.h"

#include <algorithm>
#include <cerrno>
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

volatile sig_atomic_t ended_by; // the signal that ends us

// One scenario, and the process that plays it. Its folder holds its device and what the process leaves for us.
struct run_job {
    std::string path;
    std::string folder;
    pid_t pid = -1;
    bool done = false;
    run_outcome outcome;
};

std::string numbered(long long count, const char *what)
{
    return std::to_string(count) + " " + what + (count == 1 ? "" : "s");
}

bool is_captured(const run_options &options, size_t count)
{
    return options.jobs > 1 || !options.artifacts.empty() || (count > 1 && options.quiet);
}

std::string first_line(const std::string &path)
{
    std::string line;
    std::ifstream in(path);
    std::getline(in, line);
    return line;
}

// What the user wants kept must not be written over: a scenario, a folder, or any file that is no trace.
bool may_become_trace(const std::string &path)
{
    std::error_code failure;
    const fs::file_status there = fs::status(path, failure);
    if (!fs::exists(there)) {
        return true;
    }
    const std::string line = fs::is_regular_file(there) ? first_line(path) : "";
    if (fs::is_regular_file(there) && (line.empty() || line.starts_with("#") || parse_trace_line(line))) {
        return fs::path(path).extension() != ".scn";
    }
    return false;
}

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

void print_outcome(const run_options &options, const run_job &job, bool captured, size_t count)
{
    const run_outcome &outcome = job.outcome;
    std::string timeline;
    if (captured && !options.quiet && read_file(job.folder + "/timeline", timeline)) {
        printf("== %s\n%s", job.path.c_str(), timeline.c_str());
    }
    fflush(stdout);
    fputs(outcome.failure.c_str(), stderr);
    fputs(outcome.warnings.c_str(), stderr);
    if (options.quiet || count > 1) {
        printf("%s: %s", job.path.c_str(), outcome.result == PLAY_HELD ? "" : "failed, ");
    } else if (outcome.result != PLAY_HELD) {
        return;
    }
    printf("%s held, %.3f s of device time\n", numbered(outcome.held, "expectation").c_str(), outcome.device_s);
    fflush(stdout);
    if (!options.quiet && count == 1) {
        fprintf(stderr, "played in %.3f s\n", outcome.real_s);
    }
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

// What a CI system keeps of a scenario that failed: the timeline, the failure, and the device with the daemon's trace.
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

// The folder goes, unless the device in it stays.
void clear(const run_job &job)
{
    std::error_code failure;
    for (const char *file : {"failure", "warnings", "numbers", "seconds", "device", "timeline", "trace"}) {
        fs::remove(fs::path(job.folder) / file, failure);
    }
    fs::remove(job.folder, failure);
}

void end_orphans(const std::vector<run_job> &jobs)
{
    std::ifstream children("/proc/self/task/" + std::to_string(getpid()) + "/children");
    for (pid_t child = 0; children >> child;) {
        if (std::none_of(jobs.begin(), jobs.end(), [child](const run_job &job) { return job.pid == child; })) {
            kill(child, SIGKILL);
            waitpid(child, nullptr, 0);
        }
    }
}

[[noreturn]] void end_with_signal(const std::vector<run_job> &jobs)
{
    std::error_code failure;
    for (const run_job &job : jobs) {
        if (job.pid > 0) {
            kill(job.pid, SIGKILL);
            waitpid(job.pid, nullptr, 0);
        }
    }
    end_orphans({}); // daemons, and what a wrapper has started
    end_orphans({});
    for (const run_job &job : jobs) {
        if (job.pid > 0) {
            fs::remove_all(job.folder, failure);
        }
    }
    signal(ended_by, SIG_DFL);
    raise(ended_by);
    _exit(PLAY_FAILED);
}

void take_signals()
{
    struct sigaction action = {};
    action.sa_handler = [](int number) { ended_by = number; };
    for (const int number : {SIGINT, SIGTERM, SIGHUP}) {
        sigaction(number, &action, nullptr);
    }
    prctl(PR_SET_CHILD_SUBREAPER, 1);
}

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

// Waits for one of the players, or for what one has left behind; true for a player. Signals come in between.
bool finish_one(std::vector<run_job> &jobs)
{
    int status = 0;
    pid_t ended = -1;
    do {
        if (ended_by) {
            end_with_signal(jobs);
        }
        ended = waitpid(-1, &status, WNOHANG);
        if (ended == 0) {
            usleep(2000);
        }
    } while (ended <= 0);
    for (run_job &job : jobs) {
        if (job.pid == ended) {
            job.pid = -1;
            job.done = true;
            read_outcome(job, status);
            end_orphans(jobs);
            return true;
        }
    }
    return false;
}

// False when a byte of it did not arrive.
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

// As many at a time as there are jobs; told in their order.
int play_all(const run_options &options, std::vector<run_job> &jobs)
{
    const bool captured = is_captured(options, jobs.size());
    size_t started = 0;
    size_t told = 0;
    int running = 0;
    int worst = 0;
    while (told < jobs.size()) {
        while (started < jobs.size() && running < options.jobs) {
            if (jobs.size() > 1 && !captured) {
                printf("== %s\n", jobs[started].path.c_str());
            }
            running += start_job(options, jobs[started++], captured);
        }
        if (running > 0 && !jobs[told].done) {
            running -= finish_one(jobs);
        }
        for (; told < started && jobs[told].done; told++) {
            run_job &job = jobs[told];
            keep_artifacts(options, job);
            print_outcome(options, job, captured, jobs.size());
            if (!options.trace_path.empty() && !append_trace(job, options.trace_path + ".new")) {
                fprintf(stderr, "%s cannot be written\n", options.trace_path.c_str());
                worst = PLAY_IMPOSSIBLE;
            }
            worst = std::max(worst, job.outcome.result);
            clear(job);
        }
    }
    return worst;
}

void print_total(const std::vector<run_outcome> &outcomes)
{
    long long held = 0;
    long long bad = 0;
    for (const run_outcome &outcome : outcomes) {
        held += outcome.held;
        bad += outcome.result != PLAY_HELD;
    }
    printf("%s, %lld failed, %s held\n", numbered(static_cast<long long>(outcomes.size()), "scenario").c_str(), bad,
           numbered(held, "expectation").c_str());
}

bool is_possible(run_options &options, const std::vector<std::string> &files)
{
    std::string error;
    if (!find_daemon(options.daemon, error)) {
    } else if (files.empty()) {
        error = "no scenario";
    } else if (files.size() > 1 && !options.picture_path.empty()) {
        error = "--picture takes one scenario";
    } else if (!options.trace_path.empty() && !may_become_trace(options.trace_path)) {
        error = options.trace_path + " is there and is no trace; --trace writes over nothing else";
    }
    if (!error.empty()) {
        fprintf(stderr, "%s\n", error.c_str());
    }
    return error.empty();
}
} // namespace

int run(run_options options)
{
    std::vector<std::string> files;
    std::vector<run_outcome> outcomes;
    std::string error;
    std::error_code failure;
    int worst = find_stories(options.files, files) ? 0 : PLAY_IMPOSSIBLE;
    std::erase_if(files, [&](const std::string &path) { return path.find(options.filter) == std::string::npos; });
    if (!is_possible(options, files)) {
        return PLAY_IMPOSSIBLE;
    }
    std::vector<run_job> jobs(files.size());
    for (size_t at = 0; at < files.size(); at++) {
        jobs[at].path = files[at];
    }
    options.daemon.real_time |= !options.daemon.led_dir.empty();
    fs::remove(options.trace_path + ".new", failure);
    take_signals();
    if (options.daemon.lends_terminal) {
        signal(SIGINT, SIG_IGN);
    }
    worst = std::max(worst, play_all(options, jobs));
    outcomes.reserve(jobs.size());
    for (const run_job &job : jobs) {
        outcomes.push_back(job.outcome);
    }
    if (jobs.size() > 1) {
        print_total(outcomes);
    }
    if (!options.trace_path.empty() && worst != PLAY_IMPOSSIBLE) {
        fs::rename(options.trace_path + ".new", options.trace_path, failure);
    }
    fs::remove(options.trace_path + ".new", failure);
    if (!options.junit_path.empty() && !write_file(options.junit_path, junit_report(outcomes), error)) {
        fprintf(stderr, "%s\n", error.c_str());
        worst = PLAY_IMPOSSIBLE;
    }
    return worst;
}
