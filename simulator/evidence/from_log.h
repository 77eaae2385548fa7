// A plain log as a history: what the daemon's lines tell of messages, timers and LED requests, as a trace would.
#pragma once

#include "evidence/history.h"

#include <memory>

struct log_history {
    std::unique_ptr<recording> calls; // that the lines tell of; a line's number is its second
    history told;
};

// False with "FILE: what is wrong".
bool parse_log(std::string_view text, const std::string &name, log_history &out, std::string &error);
bool load_log(const std::string &path, log_history &out, std::string &error);

// What a log leaves open about a change, or, without one, about an LED that nobody has asked for.
std::vector<std::string> untold_by_log(const history &told, const led_change *change);
