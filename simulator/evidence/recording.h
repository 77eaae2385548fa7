// A trace as a file that somebody sent: read whole, and looked over before anything is said about it.
#pragma once

#include "seen/trace.h"

constexpr size_t RECORDING_MAX = 64 * 1024 * 1024;

struct recording {
    std::string name; // of the file
    std::vector<trace_entry> entries;
    bool cut = false; // the last line has no end: the process was killed, or the power went
};

// False with "FILE:LINE: what is wrong": a line that no trace has, lines out of order, nothing at all.
bool parse_recording(std::string_view text, const std::string &name, recording &out, std::string &error);
bool read_evidence(const std::string &path, std::string &text, std::string &error);
bool load_recording(const std::string &path, recording &out, std::string &error);

// The line with which a process begins, when its trace has one.
bool is_head(const trace_entry &entry);

std::string moment(int64_t time_us); // "12.345", seconds
