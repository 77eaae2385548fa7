// The unmodified daemon, with a recording in place of its device.
#pragma once

#include "evidence/recording.h"
#include "world/daemon_process.h"

struct replay_options {
    daemon_options process;
    std::string out_path; // where the replay's own trace goes; empty: nowhere
    bool lines = false;   // line numbers of the log count
};

enum replay_result { REPLAYED_SAME = 0, REPLAYED_DIFFERENT = 1, REPLAY_IMPOSSIBLE = 2 };

// Replays one process of the trace after the other up to the first difference. report says how it went, in lines.
replay_result replay(const recording &trace, const replay_options &options, std::string &report);
