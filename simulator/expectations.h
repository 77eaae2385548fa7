// Whether what a scenario expects is so.
#pragma once

#include "observed.h"

struct surroundings {
    const observed &state;
    std::string device;
    std::string printed; // by the daemon in this step
    bool alive = false;
};

// True when it holds. Otherwise shown says what is so instead.
bool holds(const expectation &wanted, const surroundings &around, std::string &shown);
