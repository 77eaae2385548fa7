// The daemon as a process of its own, and the clock inside it.
#pragma once

#include "world/clock/protocol.h"

#include <cstdint>
#include <string>
#include <sys/types.h>

struct daemon_options {
    std::string daemon;   // the program
    std::string clock;    // the library that is preloaded into it
    std::string emulator; // a command in front of the program, split at blanks; empty for none
    bool real_time = false;
    std::string led_dir = {};    // a folder of real LEDs, empty for the device's own
    std::string led_map = {};    // which of them each LED drives, empty for led: and its name
    std::string under = {};      // a debugger or the like, as a shell command that starts the program behind it
    bool lends_terminal = false; // to that; otherwise it is given no input, and what the daemon prints goes to a file
};

struct daemon_process {
    pid_t pid = -1;                         // -1: does not run
    int control = -1;                       // the simulator's end towards the clock; -1 in real time
    int64_t next_deadline_ns = CLOCK_NEVER; // of its threads, once it is idle in virtual time
    std::string trace_path;
    std::string end; // how it ended, when it did so by itself, or what its threads wait in when they stand still
    bool lost_trace = false;     // what it did is not all in the trace, and so nobody knows
    bool ours = true;            // false: others have started it, and end it
    bool under = false;          // pid is a tool's that has started the daemon, or will
    bool lends_terminal = false; // to that tool, which a person ends
    std::string device;          // where it runs
};

pid_t daemon_pid(const daemon_process &process); // the daemon's own, also under a tool; -1 when it does not run

// Finds the program and the clock beside the simulator or where an installation puts them, unless options name them.
bool find_daemon(daemon_options &options, std::string &error);

// Starts it on the device directory; the trace goes to trace_path, what it prints to stdout and stderr of the device.
bool launch(daemon_process &process, const daemon_options &options, const std::string &device,
            const std::string &trace_path, int64_t now_ns, int64_t wall_offset_ns, std::string &error);

enum class run_result { IDLE, ENDED, STUCK };

// After launch and after every run: waits until each of its threads is blocked. now_ns is then its time. STUCK when
// all its threads have waited for five seconds in what the clock does not know, or its trace has not grown for a
// minute; while it is stopped, or a debugger holds it, nothing counts.
run_result wait_until_idle(daemon_process &process, int64_t &now_ns);
run_result run_until(daemon_process &process, int64_t until_ns, int64_t wall_offset_ns, int64_t &now_ns);

bool has_ended(daemon_process &process); // without waiting

// One that is not ours is only let go. A tool around it may tell what it has seen, and a person at it have a look.
void kill_daemon(daemon_process &process);
