#include "live/watch.h"

#include "evidence/history.h"
#include "live/front.h"
#include "seen/led_files.h"
#include "world/device.h"
#include "world/interrupt.h"
#include "world/running_daemon.h"

#include <clocale>
#include <ctime>
#include <filesystem>
#include <langinfo.h>
#include <poll.h>
#include <sys/ioctl.h>
#include <termios.h>
#include <unistd.h>

namespace
{
constexpr int EXIT_UNREADABLE = 2;
constexpr int LOOK_AGAIN_MS = 50;
constexpr size_t LOG_LINES = 200;

constexpr const char *ENTER_SCREEN = "\033[?1049h\033[?25l";
constexpr const char *LEAVE_SCREEN = "\033[?25h\033[?1049l";
constexpr const char *TO_TOP = "\033[H";
constexpr const char *CLEAR_LINE = "\033[K";
constexpr const char *CLEAR_BELOW = "\033[J";

struct watching {
    std::string device;
    running_daemon daemon;
    std::string trace_path;
    trace_file trace;
    observed state;
    std::array<int64_t, LED_ID_COUNT> shown_since_ms = {};
    std::deque<std::string> log;
    bool plain = false; // lines, for a program or a file
};

int64_t now_ms()
{
    timespec now = {};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return now.tv_sec * int64_t{1000} + now.tv_nsec / 1'000'000;
}

std::string time_of(const trace_entry &entry)
{
    std::array<char, 32> text;
    snprintf(text.data(), text.size(), "%9lld.%03lld", static_cast<long long>(entry.time_us / 1'000'000),
             static_cast<long long>(entry.time_us / 1000 % 1000));
    return text.data();
}

void say(watching &w, const std::string &line)
{
    if (w.plain) {
        printf("%s\n", line.c_str());
    }
    w.log.push_back(line);
    if (w.log.size() > LOG_LINES) {
        w.log.pop_front();
    }
}

void take_entry(watching &w, const trace_entry &entry)
{
    const std::array<led_look, LED_ID_COUNT> before = w.state.leds;
    observe(w.state, entry);
    begin_step(w.state);
    for (size_t led = 0; led < before.size(); led++) {
        if (before[led] == w.state.leds[led]) {
            continue;
        }
        w.shown_since_ms[led] = now_ms();
        if (w.plain) {
            printf("%s  %-14s %s\n", time_of(entry).c_str(), std::string(led_name(static_cast<int>(led))).c_str(),
                   describe(w.state.leds[led]).c_str());
        }
    }
    const std::string text = log_text(entry);
    if (!text.empty()) {
        say(w, time_of(entry) + "  " + (entry.arguments.starts_with("0,") ? "! " : "  ") + text);
    }
}

void find_daemon_again(watching &w)
{
    if (w.daemon.pid >= 0 && is_running(w.device, w.daemon.pid)) {
        return;
    }
    const pid_t before = w.daemon.pid;
    w.daemon = find_running_daemon(w.device);
    if (before >= 0 && w.daemon.pid < 0) {
        say(w, "the daemon is gone");
    }
    if (w.daemon.pid >= 0) {
        say(w, "process " + std::to_string(w.daemon.pid) +
                   (w.daemon.trace.empty() ? " writes no trace (KIV_TRACE): only its LEDs are seen" : ""));
    }
    if (w.daemon.pid >= 0 && w.daemon.trace != w.trace_path) {
        close_trace(w.trace);
        w.trace_path = w.daemon.trace;
        if (!w.trace_path.empty()) {
            open_trace(w.trace, w.trace_path);
        }
    }
}

void look(watching &w)
{
    find_daemon_again(w);
    const bool traced = w.trace.fd >= 0;
    std::vector<trace_entry> entries;
    do {
        entries = traced ? read_trace(w.trace) : read_led_files(w.device, w.state);
        for (trace_entry &entry : entries) {
            entry.time_us = traced ? entry.time_us : now_ms() * 1000;
            take_entry(w, entry);
        }
    } while (traced && !entries.empty());
}

std::string head_line(const watching &w)
{
    std::string product;
    read_device_text(w.device, "cfg/6000", product);
    const std::string daemon = w.daemon.pid < 0 ? "no daemon runs" : "process " + std::to_string(w.daemon.pid);
    return (product.empty() ? "" : product + ", ") + w.device + ", " + daemon + "; q ends";
}

// What the screen shows, line by line.
std::string draw(const watching &w, const winsize &size, bool utf8)
{
    std::string product;
    std::array<int64_t, LED_ID_COUNT> shown_for_ms;
    const front_look how = {.utf8 = utf8, .columns = std::max<size_t>(size.ws_col, 20)};
    for (size_t led = 0; led < shown_for_ms.size(); led++) {
        shown_for_ms[led] = now_ms() - w.shown_since_ms[led];
    }
    read_device_text(w.device, "cfg/6000", product);
    std::string text = head_line(w) + "\n\n" + draw_front(leds_of(product, w.state), w.state, shown_for_ms, how);
    const auto used = static_cast<size_t>(std::count(text.begin(), text.end(), '\n'));
    const size_t room = size.ws_row > used + 1 ? size.ws_row - used - 1 : 0;
    for (size_t at = w.log.size() - std::min(room, w.log.size()); at < w.log.size(); at++) {
        text += w.log[at].substr(0, how.columns - 1) + "\n";
    }
    return text;
}

void show(const std::string &text)
{
    std::string screen = TO_TOP;
    for (const char c : text) {
        screen += c == '\n' ? std::string(CLEAR_LINE) + "\r\n" : std::string(1, c);
    }
    fputs((screen + CLEAR_BELOW).c_str(), stdout);
    fflush(stdout);
}

bool wants_end(bool terminal)
{
    char key = 0;
    pollfd typed = {terminal ? STDIN_FILENO : -1, POLLIN, 0};
    return poll(&typed, 1, LOOK_AGAIN_MS) > 0 && (read(STDIN_FILENO, &key, 1) != 1 || key == 'q');
}

void watch_on_screen(watching &w)
{
    termios before = {};
    winsize size = {};
    std::string shown;
    const bool keys = tcgetattr(STDIN_FILENO, &before) == 0;
    termios raw = before;
    raw.c_lflag &= ~static_cast<tcflag_t>(ICANON | ECHO);
    setlocale(LC_CTYPE, "");
    const bool utf8 = std::string_view(nl_langinfo(CODESET)) == "UTF-8";
    if (keys) {
        tcsetattr(STDIN_FILENO, TCSADRAIN, &raw);
    }
    fputs(ENTER_SCREEN, stdout);
    do {
        look(w);
        ioctl(STDOUT_FILENO, TIOCGWINSZ, &size);
        const std::string text = draw(w, size, utf8);
        if (text != shown) {
            show(text);
        }
        shown = text;
    } while (!wants_end(keys) && interrupt_signal == 0 && std::filesystem::is_directory(w.device));
    fputs(LEAVE_SCREEN, stdout);
    fflush(stdout);
    if (keys) {
        tcsetattr(STDIN_FILENO, TCSADRAIN, &before);
    }
}
} // namespace

int watch_command(const std::string &device)
{
    watching w;
    std::error_code failure;
    w.device = std::filesystem::absolute(device, failure).lexically_normal().string();
    w.plain = !isatty(STDOUT_FILENO);
    if (!std::filesystem::is_directory(w.device, failure)) {
        fprintf(stderr, "%s: no such device directory\n", device.c_str());
        return EXIT_UNREADABLE;
    }
    catch_interrupts();
    setvbuf(stdout, nullptr, w.plain ? _IOLBF : _IOFBF, 0);
    if (!w.plain) {
        watch_on_screen(w);
    }
    while (w.plain && interrupt_signal == 0 && std::filesystem::is_directory(w.device, failure)) {
        look(w);
        wants_end(false);
    }
    close_trace(w.trace);
    return 0;
}
