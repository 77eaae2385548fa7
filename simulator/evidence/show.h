// The timeline of a trace.
#pragma once

#include "evidence/recording.h"
#include "seen/timeline.h"

#include <cstdio>

struct show_options {
    bool every_request = false;
};

// What set the daemon to work, and what its LEDs did then.
struct shown_step {
    int64_t time_us = 0;
    std::string stimulus;
    std::vector<led_event> changes;
};

std::vector<shown_step> show_recording(const recording &trace, const show_options &options, FILE *out);
