// What may be typed next.
#pragma once

#include <string>
#include <string_view>
#include <vector>

// The words that may stand in place of the last one of the text: statements, modules, events, LEDs, NV keys that the
// device directory holds and the like. They need not begin as that word does.
std::vector<std::string> candidates(std::string_view before, const std::string &device);
