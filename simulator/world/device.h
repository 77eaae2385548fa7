// The device directory of one run.
#pragma once

#include "language/scenario.h"

#include <string>

// Makes a fresh one, for the owner alone. Empty with an error text when that fails.
std::string make_device(std::string &error);
void remove_device(const std::string &device);

// A file is replaced whole, so that a reader sees the old text or the new one.
bool write_device_file(const std::string &device, const file_write &file, std::string &error);

// Adds a line to faults/CALL; takes away one call's faults, or all when call is empty.
bool add_fault(const std::string &device, const std::string &call, const std::string &line, std::string &error);
void remove_faults(const std::string &device, const std::string &call);

// Both write the file whole or leave it as it was; false with the cause.
bool write_file(const std::string &path, const std::string &text, std::string &error);
bool copy_file(const std::string &from, const std::string &to, std::string &error);

bool read_file(const std::string &path, std::string &text);
bool load_scenario_file(const std::string &path, std::string &text); // up to SCENARIO_FILE_MAX
// As NV and TR-181 texts are read: without the newline at their end.
bool read_device_text(const std::string &device, const std::string &file, std::string &text);
