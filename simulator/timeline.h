// The run on paper: each stimulus with its time, and beneath it the LEDs that changed.
#pragma once

#include "observed.h"

#include <cstdio>

struct timeline {
    FILE *out = nullptr; // null: nothing is printed
    bool every_request = false;
    int64_t stimulus_us = 0;      // LED changes of that moment carry no time of their own
    int64_t moment_us = -1;       // of the changes that are being gathered
    int64_t moment_length_us = 0; // how far apart they may be; not at all in virtual time
    std::array<led_look, LED_ID_COUNT> before = {};
};

void timeline_stimulus(timeline &line, int64_t now_us, const std::string &text);

// Called with each entry before it is observed, and once more when a step is over.
void timeline_entry(timeline &line, const observed &state, const trace_entry &entry);
void timeline_flush(timeline &line, const observed &state);
