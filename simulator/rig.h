// One device with its daemon: everything a run holds, and the passing of time in it.
#pragma once

#include "seen/observed.h"
#include "seen/timeline.h"
#include "world/bus.h"
#include "world/daemon_process.h"

#include <functional>

struct rig {
    daemon_options options;
    std::string device;
    std::string trace_path;
    bus wires;
    daemon_process process;
    trace_file trace;
    observed state;
    timeline line;
    bool launched = false;      // at least once
    int64_t now_ns = 0;         // since the run began
    int64_t wall_offset_ns = 0; // what the wall clock shows beyond that
    int64_t real_start_ns = 0;  // the real clock when the run began; 0 in virtual time, whose trace begins at 0
    size_t printed_before = 0;  // how much the daemon had printed when the step began
    std::function<void(const trace_entry &)> watcher; // is shown each entry of the trace
    bool keep_trace = false;  // otherwise what has been read may go, so that a long run does not fill the disk
    bool attached = false;    // to a daemon that others start and end
    bool reads_faults = true; // the daemon looks into faults/
};

int64_t real_now_ns();  // the monotonic clock
int64_t real_wall_ns(); // the wall clock

// trace_path: where the trace goes, empty for the device directory.
bool set_up_rig(rig &r, const daemon_options &options, const std::string &trace_path, std::string &error);
// The device becomes a fresh one: nothing runs on it, nothing is stored, and its time begins again.
bool renew_rig(rig &r, std::string &error);
void take_down_rig(rig &r, bool keep_device);

// Makes this process the other end of the bus, on a device directory that is there.
bool enter_world(rig &r, std::string &error);

bool launch_daemon(rig &r, std::string &error);

// Lets the daemon do all that is due until then, and looks at what it did. False when it cannot go on, with the cause;
// that the daemon has ended is no cause.
bool pass_time(rig &r, int64_t until_ns, std::string &error);

void glance(rig &r);    // at what it has done meanwhile, on the wall clock
void look_back(rig &r); // at what it did before the run began: seen, but not on the timeline

void new_step(rig &r);
std::string printed_in_step(const rig &r);
