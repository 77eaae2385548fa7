#include "live/commands.h"

#include "language/words.h"
#include "live/completion.h"
#include "live/line_editor.h"
#include "live/session.h"
#include "stories.h"
#include "world/device.h"
#include "world/interrupt.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <poll.h>
#include <unistd.h>

namespace
{
constexpr int EXIT_UNREADABLE = 2;
constexpr int EXIT_BY_SIGNAL = 128;
constexpr int LOOK_AGAIN_MS = 50;
constexpr const char *INPUT = "standard input";

int refuse(const std::string &error)
{
    fprintf(stderr, "%s\n", error.c_str());
    return EXIT_UNREADABLE;
}

// Where a session's lines come from: a terminal, or a pipe.
struct line_source {
    live_session &s;
    line_editor editor;
    std::string read_ahead;
};

std::optional<std::string> read_pipe(line_source &in)
{
    std::array<char, 4096> block;
    pollfd input = {STDIN_FILENO, POLLIN, 0};
    while (in.read_ahead.find('\n') == std::string::npos) {
        const int ready = poll(&input, 1, LOOK_AGAIN_MS);
        look_up(in.s);
        if (interrupt_signal != 0) {
            return std::nullopt;
        }
        const ssize_t got = ready > 0 ? read(STDIN_FILENO, block.data(), block.size()) : 0;
        if (got > 0) {
            in.read_ahead.append(block.data(), static_cast<size_t>(got));
        } else if (ready > 0 && in.read_ahead.empty()) {
            return std::nullopt;
        } else if (ready > 0) {
            in.read_ahead += '\n'; // the last line has no end
        }
    }
    const size_t end = in.read_ahead.find('\n');
    const std::string line = in.read_ahead.substr(0, end);
    in.read_ahead.erase(0, end + 1);
    return line;
}

int repeats_opened(const std::string &line)
{
    std::vector<word> words;
    std::string error;
    if (!split_line(line, words, error) || words.empty()) {
        return 0;
    }
    return words[0].text == "repeat" ? 1 : words[0].text == "end" ? -1 : 0;
}

// A statement, or a repeat up to its end. None at the end of the input.
std::optional<std::string> read_statement(line_source &in)
{
    std::string text;
    int open = 0;
    do {
        const std::optional<std::string> line =
            in.s.typed ? edit_line(in.editor, open > 0 ? "...> " : "led> ") : read_pipe(in);
        if (in.editor.abandoned) {
            return "";
        }
        if (!line) {
            return text.empty() ? std::nullopt : std::optional(text);
        }
        in.s.line++;
        open += repeats_opened(*line);
        text += *line + "\n";
    } while (open > 0);
    return text;
}

// False when a statement of a pipe could not be read or played.
bool play_input(line_source &in)
{
    while (const std::optional<std::string> text = read_statement(in)) {
        if (in.s.typed && *text == "quit\n") {
            break;
        }
        if (!answer(in.s, text->substr(0, text->find('\n'))) && !play_text(in.s, *text, INPUT) && !in.s.typed) {
            return false;
        }
        if (in.s.typed) {
            take_keyboard_interrupt(); // it has cut a wait short
        }
    }
    return true;
}

bool play_standard_input(live_session &s)
{
    line_source in = {.s = s, .editor = {}, .read_ahead = {}};
    if (!s.typed) {
        return play_input(in);
    }
    in.editor.news = [&s] { return news(s); };
    in.editor.candidates = [&s](std::string_view before) { return candidates(before, s.p.device.device); };
    open_editor(in.editor);
    const bool played = play_input(in);
    close_editor(in.editor);
    printf("\n");
    return played;
}

bool play_file(live_session &s, const std::string &path)
{
    scenario story;
    std::string error;
    if (load_story(path, story, error)) {
        return play_story(s, story);
    }
    fputs(error.c_str(), stderr);
    return false;
}

void greet(const live_session &s)
{
    const rig &r = s.p.device;
    printf("the device is %s\n", r.device.c_str());
    if (r.process.pid >= 0) {
        printf("process %d %s%s\n", static_cast<int>(r.process.pid),
               r.state.started ? "runs" : "waits for its start record",
               r.trace_path.empty() ? "; without KIV_TRACE only its LEDs are seen" : "");
    }
    if (s.typed && r.process.under) {
        printf("the program around the daemon gets no input, as this session has the terminal; 'gdb -ex run --args'\n"
               "needs none, and 'live --device' takes a daemon that a debugger holds at another terminal\n");
    }
    if (s.typed) {
        printf("help lists the statements, control-D ends the session\n");
    }
}

// What is left to say, and the exit code.
int finish(live_session &s, bool played)
{
    look_up(s);
    if (interrupt_signal != 0) {
        return EXIT_BY_SIGNAL + interrupt_signal;
    }
    if (!played) {
        return EXIT_UNREADABLE;
    }
    if (!s.typed) {
        printf("%lld expectation%s held, %lld failed\n", static_cast<long long>(s.p.held), s.p.held == 1 ? "" : "s",
               static_cast<long long>(s.failed));
    }
    return s.failed > 0 || s.told_end ? PLAY_FAILED : PLAY_HELD;
}

// A word of a shell's as one of a statement: quoted where it holds blanks, behind the sign of KEY=VALUE.
std::string as_word(const std::string &argument)
{
    if (!argument.empty() && argument.find_first_of(" \t\"#\\") == std::string::npos) {
        return argument;
    }
    const size_t sign = argument.find('=');
    const size_t from = sign != std::string::npos && sign < argument.find_first_of(" \t\"") ? sign + 1 : 0;
    std::string text = argument.substr(0, from) + '"';
    for (const char c : argument.substr(from)) {
        text += c == '"' || c == '\\' ? std::string("\\") + c : std::string(1, c);
    }
    return text + '"';
}

// Of what came since a statement that this process has not played.
bool asks_for_step(const statement &s)
{
    switch (s.wanted.what) {
    case subject::REQUESTS:
    case subject::NO_CHANGE:
    case subject::LOG:
    case subject::NO_LOG:
    case subject::SENT:
    case subject::NV_WRITTEN:
    case subject::TIMER_DELETED:
    case subject::RAN:
    case subject::OUTPUT:
        return s.what == verb::EXPECT;
    case subject::LED:
    case subject::ONLY:
    case subject::NV:
    case subject::NV_MISSING:
    case subject::TIMER:
    case subject::TIMER_COUNT:
    case subject::TR181:
    case subject::ALIVE:
    case subject::ENDED:
        break;
    }
    return false;
}

std::string as_statement(const std::vector<std::string> &words)
{
    std::string text;
    if (words.size() == 1) {
        return words[0];
    }
    for (const std::string &word : words) {
        text += (text.empty() ? "" : " ") + as_word(word);
    }
    return text;
}
} // namespace

int live_command(const live_options &options)
{
    live_session s;
    std::string error;
    player_options how;
    how.process = options.process;
    how.process.real_time = true;
    how.device = options.device;
    how.timeline = stdout;
    s.typed = options.file.empty() && isatty(STDIN_FILENO) && isatty(STDOUT_FILENO);
    s.p.device.line.stimuli = !s.typed;
    setvbuf(stdout, nullptr, _IOLBF, 0);
    catch_interrupts();
    if (how.process.lends_terminal) {
        signal(SIGINT, SIG_IGN); // it is for the debugger
    }
    const bool found = !options.device.empty() || find_daemon(how.process, error);
    bool played = found && set_up_player(s.p, how, error);
    if (!played) {
        refuse(error);
    } else {
        greet(s);
        played = options.product.empty() || play_text(s, "product " + options.product + "\nstart\n", "--product");
        played = (played || s.typed) && (options.file.empty() ? play_standard_input(s) : play_file(s, options.file));
    }
    const int code = finish(s, played);
    take_down_player(s.p, false);
    return code;
}

int send_command(const std::string &device, const std::vector<std::string> &words)
{
    live_session s;
    scenario story;
    std::string error;
    player_options how;
    how.device = device;
    how.timeline = stdout;
    s.p.device.line.stimuli = false;
    if (!std::filesystem::is_directory(device)) {
        return refuse(device + ": no such device directory");
    }
    if (!parse_scenario(as_statement(words), "send", load_scenario_file, story, error)) {
        return refuse(error);
    }
    if (std::any_of(story.statements.begin(), story.statements.end(), asks_for_step)) {
        return refuse("only a session knows what came since the last statement: kiv_led_sim live");
    }
    if (!set_up_player(s.p, how, error)) {
        return refuse(error);
    }
    const bool played = play_story(s, story);
    take_down_player(s.p, false);
    return !played ? EXIT_UNREADABLE : s.failed > 0 ? PLAY_FAILED : PLAY_HELD;
}
