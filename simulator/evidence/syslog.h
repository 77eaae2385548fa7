// A plain log of a device: the daemon's lines among those of others, in whatever framing the log was kept.
#pragma once

#include <string>
#include <string_view>
#include <vector>

struct log_line {
    size_t number;      // in the file, from 1
    std::string moment; // as the line says it; empty when it says none
    std::string text;   // what the daemon logged
};

// Stands in the place of lines that the logger says it has dropped.
constexpr const char *DROPPED_LINES = "(the logger has dropped lines)";

// The daemon's own lines. Where no line names it, but some sound like it, each one counts that names no other process.
std::vector<log_line> own_lines(std::string_view log);
