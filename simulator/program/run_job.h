// One scenario of the command "run", in a process of its own.
#pragma once

#include "junit.h"
#include "program/run.h"

#include <sys/types.h>

// Its folder holds its device and what the process leaves for us.
struct run_job {
    std::string path;
    std::string folder;
    pid_t pid = -1;
    bool done = false;
    run_outcome outcome;
};

bool start_job(const run_options &options, run_job &job, bool captured); // false when it is done already: no process
void read_outcome(run_job &job, int status);                             // of the process that has ended
void keep_artifacts(const run_options &options, run_job &job);           // of one that failed, for a CI system
bool append_trace(const run_job &job, const std::string &to);            // false when a byte of it did not arrive
void clear_job(const run_job &job);                                      // removes all but a device that is to stay
