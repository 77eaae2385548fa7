// The commands of kiv_led_sim that read evidence.
#pragma once

#include "evidence/show.h"
#include "world/daemon_process.h"

#include <string>

struct evidence_options {
    std::string file;
    std::string led;
    double at_s = -1; // below 0: the end
    bool always = false;
    bool from_log = false;
    bool all_requests = false;
    std::string out;    // of replay: its own trace
    bool lines = false; // of replay: line numbers count
};

// Each returns the exit code: 0, or 2 when the file or the LED's name cannot be read.
int show_command(const evidence_options &options, std::vector<shown_step> &steps);
int story_command(const evidence_options &options);
int why_command(const evidence_options &options);
int replay_command(const evidence_options &options, daemon_options daemon); // 1: the daemon does something else
