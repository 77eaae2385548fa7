// The kernel's LED folder and the shell commands that write to it, moved into the device directory.
#include "baton.h"
#include "real.h"

#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <array>
#include <atomic>
#include <cctype>
#include <cerrno>
#include <climits>
#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

namespace
{
constexpr char KERNEL_LEDS[] = "/sys/class/leds/";
constexpr size_t KERNEL_LEDS_LENGTH = sizeof KERNEL_LEDS - 1;

std::atomic<int> led_file{-1}; // what the daemon has opened in the kernel's folder last

const char *device_dir()
{
    const char *dir = getenv("KIV_DEVICE_DIR");
    return dir && *dir ? dir : nullptr;
}

// A path as the daemon names it, and where it lies: there, or in the device directory.
struct moved_path {
    const char *path;
    std::array<char, PATH_MAX> room;

    explicit moved_path(const char *named) : path(named)
    {
        const char *dir = device_dir();
        if (!dir || !named || strncmp(named, KERNEL_LEDS, KERNEL_LEDS_LENGTH) != 0) {
            return;
        }
        const int length = snprintf(room.data(), room.size(), "%s/leds/%s", dir, named + KERNEL_LEDS_LENGTH);
        path = length > 0 && static_cast<size_t>(length) < room.size() ? room.data() : "";
    }
};

// A shell command in the making. What does not fit leaves it too long.
struct command_text {
    std::array<char, 2 * PATH_MAX> text;
    size_t length = 0;
};

void add(command_text &command, char byte)
{
    if (command.length < command.text.size()) {
        command.text[command.length++] = byte;
    }
}

void add(command_text &command, const char *bytes)
{
    while (*bytes) {
        add(command, *bytes++);
    }
}

// In single quotes, where a shell takes everything for itself; a single quote stands outside of them.
void add_quoted(command_text &command, const char *path)
{
    add(command, '\'');
    for (; *path; path++) {
        if (*path == '\'') {
            add(command, "'\\''");
        } else {
            add(command, *path);
        }
    }
    add(command, '\'');
}

// The device's folder of LEDs, where the shell reads text in quotes of this kind (0: in none).
void add_device_leds(command_text &command, char quotes, const char *dir)
{
    if (quotes) {
        add(command, quotes);
    }
    add_quoted(command, dir);
    add(command, "/leds/");
    if (quotes) {
        add(command, quotes);
    }
}

bool begins_path(const char *command, const char *at)
{
    return strncmp(at, KERNEL_LEDS, KERNEL_LEDS_LENGTH) == 0 && (at == command || !strchr("/.-_", at[-1])) &&
           (at == command || !isalnum(static_cast<unsigned char>(at[-1])));
}

char quotes_after(char quotes, char byte)
{
    if (byte != '\'' && byte != '"') {
        return quotes;
    }
    return quotes == byte ? '\0' : quotes ? quotes : byte;
}

// Copies the command with the kernel's folder replaced wherever a path begins with it. False when it is too long.
bool move_command(const char *from, command_text &moved)
{
    const char *dir = device_dir();
    char quotes = '\0';
    for (const char *at = from; *at; at++) {
        if (dir && begins_path(from, at)) {
            add_device_leds(moved, quotes, dir);
            at += KERNEL_LEDS_LENGTH - 1;
            continue;
        }
        add(moved, *at);
        if (*at == '\\' && quotes != '\'' && at[1]) {
            add(moved, *++at);
            continue;
        }
        quotes = quotes_after(quotes, *at);
    }
    add(moved, '\0');
    return moved.text[moved.length - 1] == '\0';
}

bool is_ours(const char *variable)
{
    return strncmp(variable, "LD_PRELOAD=", 11) == 0 || strncmp(variable, "KIV_CLOCK_", 10) == 0;
}

// As system(), but the shell lives in real time.
int run_shell(const char *command)
{
    std::array<char *, 1024> environment = {};
    size_t count = 0;
    for (char **variable = environ; *variable && count < environment.size() - 1; variable++) {
        if (!is_ours(*variable)) {
            environment[count++] = *variable;
        }
    }
    char shell[] = "sh";
    char option[] = "-c";
    char *arguments[] = {shell, option, const_cast<char *>(command), nullptr};
    pid_t child = -1;
    int status = -1;
    if (posix_spawn(&child, "/bin/sh", nullptr, nullptr, arguments, environment.data()) != 0) {
        return -1;
    }
    while (waitpid(child, &status, 0) < 0) {
        if (errno != EINTR) {
            return -1;
        }
    }
    return status;
}

bool is_kernel_led(const char *path)
{
    return strncmp(path, KERNEL_LEDS, KERNEL_LEDS_LENGTH) == 0;
}

// The call of a path or a command, as it was asked for.
void trace_text_call(const char *call, const char *text, int result)
{
    trace_line line;
    trace_begin(line, call);
    trace_text(line, text);
    trace_result(line, result);
    trace_end(line);
}

// The file that the daemon has opened is one of the kernel's folder: what it reads there, it reads from the device.
int trace_open(const char *path, int fd, const void *caller)
{
    if (is_kernel_led(path) && is_traced(caller)) {
        trace_text_call("open", path, fd);
        led_file = fd;
    }
    return fd;
}

mode_t mode_argument(int flags, va_list arguments)
{
    return flags & (O_CREAT | O_TMPFILE) ? static_cast<mode_t>(va_arg(arguments, unsigned)) : 0;
}
} // namespace

extern "C" {

int open(const char *path, int flags, ...)
{
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = mode_argument(flags, arguments);
    va_end(arguments);
    return trace_open(path, real().open(moved_path(path).path, flags, mode), __builtin_return_address(0));
}

int open64(const char *path, int flags, ...)
{
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = mode_argument(flags, arguments);
    va_end(arguments);
    return trace_open(path, real().open64(moved_path(path).path, flags, mode), __builtin_return_address(0));
}

int openat(int dir, const char *path, int flags, ...)
{
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = mode_argument(flags, arguments);
    va_end(arguments);
    return real().openat(dir, moved_path(path).path, flags, mode);
}

int openat64(int dir, const char *path, int flags, ...)
{
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = mode_argument(flags, arguments);
    va_end(arguments);
    return real().openat64(dir, moved_path(path).path, flags, mode);
}

FILE *fopen(const char *path, const char *mode)
{
    return real().fopen(moved_path(path).path, mode);
}

FILE *fopen64(const char *path, const char *mode)
{
    return real().fopen64(moved_path(path).path, mode);
}

int access(const char *path, int mode) noexcept
{
    return real().access(moved_path(path).path, mode);
}

int faccessat(int dir, const char *path, int mode, int flags) noexcept
{
    return real().faccessat(dir, moved_path(path).path, mode, flags);
}

int stat(const char *path, struct stat *info) noexcept
{
    return real().stat(moved_path(path).path, info);
}

int stat64(const char *path, struct stat64 *info) noexcept
{
    return real().stat64(moved_path(path).path, info);
}

int lstat(const char *path, struct stat *info) noexcept
{
    return real().lstat(moved_path(path).path, info);
}

int lstat64(const char *path, struct stat64 *info) noexcept
{
    return real().lstat64(moved_path(path).path, info);
}

int fstatat(int dir, const char *path, struct stat *info, int flags) noexcept
{
    return real().fstatat(dir, moved_path(path).path, info, flags);
}

int fstatat64(int dir, const char *path, struct stat64 *info, int flags) noexcept
{
    return real().fstatat64(dir, moved_path(path).path, info, flags);
}

int system(const char *command)
{
    command_text moved;
    if (!command) {
        return 1;
    }
    const int status = move_command(command, moved) ? run_shell(moved.text.data()) : -1;
    if (trace_begin) {
        trace_text_call("system", command, status);
    }
    return status;
}

ssize_t read(int fd, void *buffer, size_t size)
{
    if (!wait_before_read(fd)) {
        return -1;
    }
    const ssize_t got = real().read(fd, buffer, size);
    if (fd == led_file && fd >= 0 && is_traced(__builtin_return_address(0))) {
        trace_line line;
        trace_begin(line, "read");
        trace_add(line, "%d, %zu", fd, size);
        trace_bytes_result(line, static_cast<int>(got), buffer);
        trace_end(line);
    }
    return got;
}
}
