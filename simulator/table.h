// What each LED of a product shows in each state, as the real daemon shows it when it is brought there.
#pragma once

#include "daemon_process.h"

#include <string_view>

// Prints a Markdown table. Returns 0, or what the program shall end with, after a message on standard error.
int print_table(std::string_view product, const daemon_options &options);
