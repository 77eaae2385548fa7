// What kiv_led_sim and the replay in the daemon's process share: a page of memory in a file.
#pragma once

#include <climits>
#include <cstddef>

constexpr const char *REPLAY_VARIABLE = "KIV_REPLAY"; // names the file

enum replay_verdict { REPLAY_GOES_ON = 0, REPLAY_SAME, REPLAY_DIFFERS, REPLAY_UNREADABLE };

struct replay_page {
    // What is to be done.
    char trace[PATH_MAX]; // the recording
    char out[PATH_MAX];   // where the replay's own trace goes; empty: nowhere
    size_t end;           // the line behind the last one of this process
    bool lines;           // line numbers of the log count
    // How it goes.
    size_t line; // the next line of the recording, from 0; at the beginning the first one of this process
    int verdict;
    char done[9000]; // what the daemon does there; after REPLAY_SAME what it would go on with, if anything
};
