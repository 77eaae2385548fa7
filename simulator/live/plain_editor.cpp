// A line as the terminal itself lets one edit it, where the library for more is missing.
#include "live/line_editor.h"

#include "world/interrupt.h"

#include <cstdio>
#include <poll.h>
#include <unistd.h>

namespace
{
constexpr int LOOK_AGAIN_MS = 50;

// False at the end of input.
bool take_character(std::string &line)
{
    char byte = 0;
    if (read(STDIN_FILENO, &byte, 1) != 1) {
        return false;
    }
    line += byte;
    return true;
}
} // namespace

void open_editor(line_editor &) {}

void close_editor(line_editor &) {}

std::optional<std::string> edit_line(line_editor &editor, const std::string &prompt)
{
    pollfd typed = {STDIN_FILENO, POLLIN, 0};
    std::string line;
    editor.abandoned = false;
    std::string due = prompt;
    while (!line.ends_with('\n')) {
        fputs(due.c_str(), stdout);
        fflush(stdout);
        const int ready = poll(&typed, 1, LOOK_AGAIN_MS);
        if (take_keyboard_interrupt()) {
            editor.abandoned = true;
            return "";
        }
        if (interrupt_signal != 0 || (ready > 0 && !take_character(line))) {
            return std::nullopt;
        }
        due = editor.news();
        due = due.empty() ? "" : "\n" + due + prompt;
    }
    line.pop_back();
    return line;
}
