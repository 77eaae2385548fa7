// The commands of kiv_led_sim that talk to a daemon on the wall clock.
#pragma once

#include "player.h"

struct live_options {
    daemon_options process; // of a daemon that is started
    std::string device;     // of a daemon that waits or runs already; empty: one is started
    std::string product;    // empty: what the statements say
    std::string file;       // of statements; empty: standard input
};

// Each returns the exit code: 0, 1 when an expectation failed, 2 when a statement could not be read or played.
int live_command(const live_options &options);

// One statement, each word an argument or all of it one, to a daemon that others have started.
int send_command(const std::string &device, const std::vector<std::string> &words);
