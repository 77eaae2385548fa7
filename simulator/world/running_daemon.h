// A daemon that others have started on a device directory: in a debugger, under valgrind, as a service.
#pragma once

#include <string>
#include <sys/types.h>

struct running_daemon {
    pid_t pid = -1;            // -1: none reads the directory's queue
    std::string trace;         // from its environment: the file it writes its trace to; empty: none that can be read
    bool reads_faults = false; // from its environment: KIV_FAULTS=1
    bool has_threads = false;  // it has gone past the start record
};

pid_t queue_reader(const std::string &device); // the process alone

running_daemon find_running_daemon(const std::string &device);
bool is_running(const std::string &device, pid_t pid); // still the one that reads the queue
