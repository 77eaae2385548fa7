// The words that a scenario can use, and what the daemon makes of each: a reference in Markdown.
#pragma once

#include "language/names.h"
#include "world/daemon_process.h"

#include <string>

// Of one product, or of all when there is none. What a product hears and what that makes it read is not listed
// anywhere: the real daemon is asked, by one play a product. Returns 0, or what the program shall end with, after a
// message on standard error.
int print_reference(const product_name *only, const daemon_options &options);
