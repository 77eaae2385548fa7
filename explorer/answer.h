// What the process that searches tells the one that reports.
#pragma once

#include "explore.h"

#include <cstdio>

void write_result(FILE *out, const search_result &result);
bool read_result(FILE *in, search_result &result); // all but the plan. False when the other has not come to its end
