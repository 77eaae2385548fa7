// The run on paper: each stimulus with its time, and beneath it the LEDs that changed.
#pragma once

#include "seen/observed.h"

#include <cstdio>

constexpr size_t SEEN_MAX = 10'000; // a run of days makes millions

struct led_event {
    int64_t time_us = 0; // since the run began
    int led = 0;
    led_look look;
    std::string result; // of a request, "0" when it was carried out
};

struct timeline {
    FILE *out = nullptr; // null: nothing is printed
    bool every_request = false;
    bool show_log = false;        // the daemon's log lines, as a person reads them
    bool stimuli = true;          // false: nobody needs to be told them
    int64_t wall_offset_us = -1;  // what the wall clock shows beyond device time; -1: the scenario has not set it
    int64_t stimulus_us = 0;      // LED changes of that moment carry no time of their own
    int64_t moment_us = -1;       // of the changes that are being gathered
    int64_t moment_length_us = 0; // how far apart they may be; not at all in virtual time
    std::array<led_look, LED_ID_COUNT> before = {};
    std::vector<led_event> changes;  // of the step, up to SEEN_MAX
    std::vector<led_event> requests; // of the step, every one up to SEEN_MAX
};

void timeline_stimulus(timeline &line, int64_t now_us, const std::string &text);

// Called with each entry before it is observed, and once more when a step is over.
void timeline_entry(timeline &line, const observed &state, const trace_entry &entry);
void timeline_flush(timeline &line, const observed &state);
