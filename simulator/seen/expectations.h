// Whether what a scenario expects is so.
#pragma once

#include "seen/timeline.h"

struct surroundings {
    const observed &state;
    const std::vector<led_event> &changes; // of the step
    const std::vector<led_event> &requests;
    std::string device;
    std::string printed; // by the daemon in this step
    bool alive = false;
};

// True when it holds. Otherwise shown says what is so instead.
bool holds(const expectation &wanted, const surroundings &around, std::string &shown);

// The LEDs that an expectation which does not hold is about; none when it is about something else.
std::vector<int> leds_that_differ(const expectation &wanted, const surroundings &around);
