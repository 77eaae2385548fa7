// What the LED folders of a device show, for a daemon that writes no trace.
#pragma once

#include "seen/observed.h"

#include <string>

// An LED request, without a time, for every LED whose files show something else than the state.
std::vector<trace_entry> read_led_files(const std::string &device, const observed &state);
