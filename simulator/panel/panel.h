// kiv_led_sim panel: the device's front in a browser, driven by the real daemon.
#pragma once

#include "world/daemon_process.h"

#include <string>

struct panel_options {
    daemon_options process;
    std::string what = "UFI";            // a product, or a scenario that is played at once
    std::string scenarios = "scenarios"; // the folder of those that the page offers
    int port = 0;                        // 0: a free one
    bool browser = true;                 // opens one
};

// Returns when the user ends it: 0, or what the program shall end with, after a message on standard error.
int run_panel(const panel_options &options);
