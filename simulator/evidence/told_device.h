// The device as a scenario has left it, and what it must set so that the daemon finds what a trace tells.
#pragma once

#include "evidence/recording.h"

#include <map>

struct told_device {
    std::map<std::string, std::string> values; // by statement: "nv battery_value="
    int64_t wall_offset_us = INT64_MIN;        // the wall clock at time 0, once it is known
};

// The statements, a line each, that the entries from..to need at that time, and the device behind them. The first
// reading of a value counts.
std::string settings_for(told_device &device, const recording &trace, size_t from, size_t to, int64_t now_us);

// What the daemon itself does to the device.
void take_effect(told_device &device, const trace_entry &entry);
