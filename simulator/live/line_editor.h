// A line typed at a terminal: editing, history and completion, and what happens meanwhile shown above it.
#pragma once

#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

struct editline; // the library's
struct history;

struct line_editor {
    // What has happened since it was last asked, whole lines; asked some twenty times a second while nobody types.
    std::function<std::string()> news;
    // The words that may stand in place of the last one of a text.
    std::function<std::vector<std::string>(std::string_view before)> candidates;

    editline *edit = nullptr;
    history *past = nullptr;
    std::string history_file; // empty: not kept
    std::string prompt;
    bool abandoned = false; // SIGINT has ended the line
};

void open_editor(line_editor &editor);
void close_editor(line_editor &editor);

// None at the end of input, or when SIGTERM or SIGHUP has come. After SIGINT the line is empty and abandoned is true.
std::optional<std::string> edit_line(line_editor &editor, const std::string &prompt);
