// The daemon's trace, read while it grows: one platform call a line.
#pragma once

#include "language/scenario.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

struct trace_entry {
    int64_t time_us = 0;
    std::string line;
    std::string thread;
    std::string call;
    std::string arguments; // as they stand between the parentheses
    std::string result;    // behind " = ", empty when the call has none
};

struct trace_file {
    int fd = -1;
    std::string rest; // the beginning of a line that is still being written
};

bool open_trace(trace_file &trace, const std::string &path);
void close_trace(trace_file &trace);
std::vector<trace_entry> read_trace(trace_file &trace); // what has been added, some megabytes at a time

std::optional<trace_entry> parse_trace_line(const std::string &line);

// What an LED request asked for. None when the entry is no LED request or names no LED that exists.
std::optional<led_wanted> led_request_of(const trace_entry &entry);

// The texts in quotes among the arguments, in order and without escapes.
std::vector<std::string> quoted_texts(const std::string &arguments);
