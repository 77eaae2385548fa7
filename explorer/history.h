// A history as a scenario: played once more by the clock, with what is lit after every step.
#pragma once

#include "properties.h"

struct told_history {
    std::string text;   // of a scenario, without what introduces it
    bool shows = false; // what broke shows by the clock, too
};

// The stimuli in their order and the epilogue's lines after them, from a device at rest and the daemon's start.
told_history tell_history(unsigned product, const std::vector<stimulus> &alphabet, const std::vector<size_t> &history,
                          const std::string &epilogue, const breach &what);

// Lines of a comment that hold the text.
std::string as_comment(std::string_view text);
