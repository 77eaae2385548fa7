// What a process that says nothing is doing, from its task entries.
#pragma once

#include <cstdint>
#include <string>
#include <sys/types.h>

enum class process_activity {
    ASLEEP, // every thread waits for something, and no shell command runs
    BUSY,
    HELD, // stopped, or by a debugger
};

process_activity what_it_does(pid_t pid);

// True while one of its threads waits in a receive; also when the kernel does not tell.
bool waits_for_message(pid_t pid);

// "thread 1 (kiv_mirta_led) waits in futex, thread 2 (kiv_mirta_led) waits in recvfrom"; empty when it is gone.
std::string where_it_waits(pid_t pid);
