// What can be typed: the statements of the scenario language, by example, and the words of a session.
#pragma once

#include <span>
#include <string>
#include <string_view>

struct help_row {
    std::string_view example;
    std::string_view meaning;
};

std::span<const help_row> help_rows();

// The rows whose example begins with that; all when it is empty.
std::string help_text(std::string_view beginning);
