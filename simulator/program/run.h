// The command "run": scenarios, each in a process of its own.
#pragma once

#include "world/daemon_process.h"

#include <string>
#include <vector>

struct run_options {
    daemon_options daemon;
    std::vector<std::string> files; // or folders of them
    std::string filter;             // only paths that hold it
    std::string trace_path;
    std::string picture_path;
    std::string junit_path;
    std::string artifacts; // a folder for what failed
    int jobs = 1;
    bool keep = false;
    bool keep_going = false;
    bool quiet = false;
    bool all_requests = false;
    bool show_log = false;
};

// Returns what the program shall end with. A signal ends the scenarios that are being played, removes what they would
// leave, and then the program.
int run(run_options options);
