// Starts the daemon in a test's own process, over the fake platform.
#pragma once

#include <string>

// Runs the whole start-up as configuration items 6000 and 531 say, without starting a thread: the fake names them
// "receive", "ipc" and "tr181". What it returns is kiv_led_start's.
int boot(const std::string &product_type, char led_function = 1);
