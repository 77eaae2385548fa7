// What kiv_led_sim and the replay in the daemon's process share: variables, and a page of memory in a file.
#pragma once

constexpr const char *REPLAY_TRACE_VARIABLE = "KIV_REPLAY";         // the recording
constexpr const char *REPLAY_FROM_VARIABLE = "KIV_REPLAY_FROM";     // the first line of this process, from 0
constexpr const char *REPLAY_TO_VARIABLE = "KIV_REPLAY_TO";         // the line behind its last
constexpr const char *REPLAY_STATUS_VARIABLE = "KIV_REPLAY_STATUS"; // the file with a replay_status
constexpr const char *REPLAY_OUT_VARIABLE = "KIV_REPLAY_OUT";       // where the replay's own trace goes, if anywhere
constexpr const char *REPLAY_LINES_VARIABLE = "KIV_REPLAY_LINES";   // set: line numbers of the log count

enum replay_verdict { REPLAY_GOES_ON = 0, REPLAY_SAME, REPLAY_DIFFERS, REPLAY_UNREADABLE };

struct replay_status {
    int verdict;
    unsigned long line; // the next line of the recording
    char done[9000];    // what the daemon does there; after REPLAY_SAME what it would go on with, if anything
};
