// Why an LED shows what it shows.
#pragma once

#include "evidence/history.h"

// The answer for a moment, in a few lines. until: the first entry that counts no more.
std::string why(const history &told, int led, size_t until);

// Every change of the LED with its cause, a line each.
std::string why_always(const history &told, int led);

// The entry behind the last one of that time.
size_t entry_after(const recording &trace, int64_t time_us);
