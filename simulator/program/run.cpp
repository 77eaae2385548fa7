#include "program/run.h"

#include "player.h"
#include "program/run_job.h"
#include "stories.h"
#include "world/device.h"

#include <algorithm>
#include <csignal>
#include <cstdio>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace
{
volatile sig_atomic_t ended_by; // the signal that ends us

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
            clear_job(job);
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
