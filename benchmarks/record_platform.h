// A platform that writes down the calls made to it, as C++ statements.
#pragma once

#include <string>

extern bool recording;
extern std::string recorded; // statements, one a line
