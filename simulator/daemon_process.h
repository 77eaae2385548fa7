// The daemon as a process of its own, and the clock inside it.
#pragma once

#include <cstdint>
#include <string>
#include <sys/types.h>

struct daemon_options {
    std::string daemon;   // the program
    std::string clock;    // the library that is preloaded into it
    std::string emulator; // a command in front of the program, split at blanks; empty for none
    bool real_time = false;
};

struct daemon_process {
    pid_t pid = -1;   // -1: does not run
    int control = -1; // the simulator's end towards the clock; -1 in real time
    std::string end;  // how it ended, when it did so by itself
};

// Finds the program and the clock beside the simulator or where an installation puts them, unless options name them.
bool find_daemon(daemon_options &options, std::string &error);

// Starts it on the device directory; the trace goes to trace_path, what it prints to stdout and stderr of the device.
bool launch(daemon_process &process, const daemon_options &options, const std::string &device,
            const std::string &trace_path, int64_t now_ns, int64_t wall_offset_ns, std::string &error);

enum class run_result { IDLE, ENDED, STUCK };

// After launch and after every run: waits until each of its threads is blocked. now_ns is then its time.
run_result wait_until_idle(daemon_process &process, int64_t &now_ns);
run_result run_until(daemon_process &process, int64_t until_ns, int64_t wall_offset_ns, int64_t &now_ns);

bool has_ended(daemon_process &process); // without waiting
void kill_daemon(daemon_process &process);
