// Plays one scenario against a fresh device and the real daemon.
#pragma once

#include "rig.h"

enum play_result { PLAY_HELD = 0, PLAY_FAILED = 1, PLAY_IMPOSSIBLE = 2 };

struct play_options {
    daemon_options process;
    std::string trace_path; // empty: not kept
    bool keep_device = false;
    bool every_request = false;
    FILE *timeline = nullptr; // null: none
};

struct play_report {
    play_result result = PLAY_HELD;
    std::string failure; // what went wrong where, several lines
    int64_t held = 0;    // expectations
    int64_t virtual_ns = 0;
    std::array<led_look, LED_ID_COUNT> leds = {}; // at the end
};

// At most once in a process: the bus library of this side knows one device only.
play_report play(const scenario &story, const play_options &options);
