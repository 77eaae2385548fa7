// What the simulator and the clock in the daemon's process say to each other, over a SOCK_SEQPACKET pair. Fixed sizes:
// the daemon may be an ARM program under an emulator.
#pragma once

#include <cstdint>

constexpr const char *CLOCK_FD_VARIABLE = "KIV_CLOCK_FD"; // the clock's end of the pair; unset: real time
constexpr const char *CLOCK_WRAPPED_VARIABLE =
    "KIV_CLOCK_WRAPPED";                                        // set: only what links the device's bus is the daemon
constexpr const char *CLOCK_START_VARIABLE = "KIV_CLOCK_START"; // "MONOTONIC_NS WALL_OFFSET_NS" when the process starts

constexpr int64_t CLOCK_NEVER = -1;

// Run everything that is due up to a time. The wall clock shows monotonic time plus the offset.
struct clock_command {
    int64_t run_until_ns;
    int64_t wall_offset_ns;
};

// Every thread of the daemon is blocked, and stays so until a message arrives or the next deadline.
struct clock_report {
    int64_t now_ns;
    int64_t next_deadline_ns; // CLOCK_NEVER when no thread waits for a time
};
