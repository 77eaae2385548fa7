// The timeline of a trace.
#pragma once

#include "evidence/recording.h"

#include <cstdio>

struct show_options {
    bool every_request = false;
};

void show_recording(const recording &trace, const show_options &options, FILE *out);
