// The log lines with which the daemon says that it lets something go by.
#pragma once

#include <string>

// Why what the line tells did not light this LED. Empty when the line says nothing of the kind.
std::string dropped_for(int led, const std::string &log_text);
