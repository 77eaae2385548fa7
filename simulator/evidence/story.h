// A trace as a scenario: what was done to the device, and what its LEDs showed.
#pragma once

#include "evidence/recording.h"

std::string story_of(const recording &trace);
