// What a scenario says and probably does not mean.
#pragma once

#include "language/scenario.h"

// "FILE:LINE: warning: ..." for each, in the order of the file.
std::vector<std::string> find_doubts(const scenario &story);
