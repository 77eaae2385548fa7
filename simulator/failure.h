// What a person needs to understand why a statement failed.
#pragma once

#include "player.h"

// Several lines: the place with the chain of its includes and the rounds of its repeats, what was expected and shown,
// the time, the front, and for each LED that differs its last requests with what set them off.
std::string explain_failure(const player &p, const statement &s, const std::string &expected, const std::string &shown);

// Of a statement that cannot be played: the place, and why.
std::string explain_impossible(const player &p, const statement &s, const std::string &why);

// The end of what the daemon wrote to standard error: a sanitizer's report, why it could not start, an LED that is
// missing. Empty when it wrote nothing.
std::string error_output(const std::string &device);
