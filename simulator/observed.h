// What the daemon has done to the device, as its trace tells it.
#pragma once

#include "names.h"
#include "trace.h"

#include <array>
#include <deque>
#include <map>

struct running_timer {
    int64_t period_ms = 0;
    bool repeats = false;
};

struct observed {
    std::array<led_look, LED_ID_COUNT> leds = {};
    std::map<int64_t, running_timer> timers;
    std::vector<trace_entry> step; // since the last stimulus
    int64_t requests_in_step = 0;  // LED requests among them
    bool timer_deleted_in_step = false;
    std::deque<std::string> last_lines; // the last ten of all
};

void observe(observed &state, const trace_entry &entry);
void begin_step(observed &state);
void forget_process(observed &state); // it is gone, and its timers with it; the LEDs stay as they are

std::string describe(const led_look &look); // "on 4", "off", "blink 800/1200 4"
