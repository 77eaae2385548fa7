#include "live/line_editor.h"

#include "world/interrupt.h"

#include <algorithm>
#include <array>
#include <clocale>
#include <cstdio>
#include <cstdlib>
#include <cwchar>
#include <histedit.h>
#include <poll.h>
#include <unistd.h>

namespace
{
constexpr int LOOK_AGAIN_MS = 50;
constexpr int HISTORY_LINES = 1000;
constexpr size_t COLUMNS = 80;

line_editor &editor_of(EditLine *edit)
{
    void *editor = nullptr;
    el_get(edit, EL_CLIENTDATA, &editor);
    return *static_cast<line_editor *>(editor);
}

char *prompt_of(EditLine *edit)
{
    return editor_of(edit).prompt.data();
}

void show_news(EditLine *edit)
{
    const std::string news = editor_of(edit).news();
    if (!news.empty()) {
        printf("\r\033[K%s", news.c_str());
        fflush(stdout);
        el_set(edit, EL_REFRESH);
    }
}

// One character of the terminal's, of several bytes perhaps. 0 at the end of input.
int read_character(wchar_t *character)
{
    std::mbstate_t state = {};
    for (;;) {
        char byte = 0;
        if (read(STDIN_FILENO, &byte, 1) != 1) {
            return 0;
        }
        const size_t used = mbrtowc(character, &byte, 1, &state);
        if (used <= 1) {
            return 1;
        }
        if (used == static_cast<size_t>(-1)) {
            state = {};
        }
    }
}

int next_character(EditLine *edit, wchar_t *character)
{
    pollfd typed = {STDIN_FILENO, POLLIN, 0};
    for (;;) {
        const int ready = poll(&typed, 1, LOOK_AGAIN_MS);
        if (take_keyboard_interrupt()) {
            editor_of(edit).abandoned = true;
            *character = L'\n';
            return 1;
        }
        if (interrupt_signal != 0) {
            return 0;
        }
        show_news(edit);
        if (ready > 0) {
            return read_character(character);
        }
    }
}

std::string common_beginning(const std::vector<std::string> &words)
{
    std::string common = words.front();
    for (const std::string &word : words) {
        const auto [end, other] = std::mismatch(common.begin(), common.end(), word.begin(), word.end());
        common.erase(end, common.end());
    }
    return common;
}

void print_columns(const std::vector<std::string> &words)
{
    size_t width = 0;
    for (const std::string &word : words) {
        width = std::max(width, word.size() + 2);
    }
    const size_t a_row = std::max<size_t>(1, COLUMNS / width);
    for (size_t at = 0; at < words.size(); at++) {
        printf("%s%-*s", at % a_row == 0 ? "\n" : "", static_cast<int>(width), words[at].c_str());
    }
    printf("\n");
    fflush(stdout);
}

unsigned char complete(EditLine *edit, int)
{
    const LineInfo *line = el_line(edit);
    const std::string before(line->buffer, line->cursor);
    const std::string begun = before.substr(before.find_last_of(' ') + 1);
    std::vector<std::string> fitting;
    for (const std::string &word : editor_of(edit).candidates(before)) {
        if (word.starts_with(begun)) {
            fitting.push_back(word);
        }
    }
    if (fitting.empty()) {
        return CC_REFRESH_BEEP;
    }
    std::string rest = common_beginning(fitting).substr(begun.size());
    if (fitting.size() == 1 && !fitting[0].ends_with('=')) {
        rest += ' ';
    }
    if (!rest.empty()) {
        el_insertstr(edit, rest.c_str());
        return CC_REFRESH;
    }
    print_columns(fitting);
    return CC_REDISPLAY;
}

// Where programs of a person keep what is not worth a backup.
std::string history_place()
{
    const char *home = getenv("HOME");
    const char *state = getenv("XDG_STATE_HOME");
    if (state && *state) {
        return std::string(state) + "/kiv_led_sim_history";
    }
    return home && *home ? std::string(home) + "/.kiv_led_sim_history" : "";
}
} // namespace

void open_editor(line_editor &editor)
{
    HistEvent event;
    setlocale(LC_CTYPE, "");
    editor.history_file = history_place();
    editor.past = history_init();
    editor.edit = el_init("kiv_led_sim", stdin, stdout, stderr);
    history(editor.past, &event, H_SETSIZE, HISTORY_LINES);
    history(editor.past, &event, H_SETUNIQUE, 1);
    history(editor.past, &event, H_LOAD, editor.history_file.c_str());
    el_set(editor.edit, EL_CLIENTDATA, &editor);
    el_set(editor.edit, EL_EDITOR, "emacs");
    el_set(editor.edit, EL_PROMPT, prompt_of);
    el_set(editor.edit, EL_HIST, history, editor.past);
    el_set(editor.edit, EL_GETCFN, next_character);
    el_set(editor.edit, EL_ADDFN, "complete-name", "Completes a name", complete);
    el_set(editor.edit, EL_BIND, "^I", "complete-name", nullptr);
    el_set(editor.edit, EL_BIND, "^R", "em-inc-search-prev", nullptr);
    // Typed while a statement still runs, the key stays a key; the terminal would keep it to itself.
    el_set(editor.edit, EL_SETTY, "-x", "eof=", nullptr);
}

void close_editor(line_editor &editor)
{
    HistEvent event;
    if (!editor.history_file.empty()) {
        history(editor.past, &event, H_SAVE, editor.history_file.c_str());
    }
    el_end(editor.edit);
    history_end(editor.past);
}

std::optional<std::string> edit_line(line_editor &editor, const std::string &prompt)
{
    HistEvent event;
    int length = 0;
    editor.prompt = prompt;
    editor.abandoned = false;
    const char *line = el_gets(editor.edit, &length);
    if (!line || length <= 0) {
        return std::nullopt;
    }
    if (editor.abandoned) {
        return "";
    }
    std::string text(line, static_cast<size_t>(length));
    if (text.ends_with('\n')) {
        text.pop_back();
    }
    if (text.find_first_not_of(" \t") != std::string::npos) {
        history(editor.past, &event, H_ENTER, line);
    }
    return text;
}
