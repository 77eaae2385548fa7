// One device with its daemon: everything a run holds, and the passing of time in it.
#pragma once

#include "bus.h"
#include "daemon_process.h"
#include "observed.h"
#include "timeline.h"

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
};

// trace_path: where the trace goes, empty for the device directory.
bool set_up_rig(rig &r, const daemon_options &options, const std::string &trace_path, std::string &error);
void take_down_rig(rig &r, bool keep_device);

bool launch_daemon(rig &r, std::string &error);

// Lets the daemon do all that is due until then, and looks at what it did. False when it cannot go on, with the cause;
// that the daemon has ended is no cause.
bool pass_time(rig &r, int64_t until_ns, std::string &error);

void new_step(rig &r);
std::string printed_in_step(const rig &r);
