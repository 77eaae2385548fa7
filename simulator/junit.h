// A run's outcome for a CI system.
#pragma once

#include <string>
#include <vector>

struct run_outcome {
    std::string path;
    int result = 0; // a play_result
    long long held = 0;
    double device_s = 0;
    double real_s = 0;
    std::string failure; // several lines, empty when all held
    std::string warnings;
};

// JUnit's XML: a test case for each scenario.
std::string junit_report(const std::vector<run_outcome> &outcomes);
