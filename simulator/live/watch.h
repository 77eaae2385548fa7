// The LEDs of a running daemon in the terminal, and its log.
#pragma once

#include <string>

// Until q, a signal or the end of the device directory. Where standard output is no terminal: a line for every change
// and for every line of the log. Returns the exit code: 0, or 2 when there is no such directory.
int watch_command(const std::string &device);
