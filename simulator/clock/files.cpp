// The kernel's LED folder and the shell commands that write to it, moved into the device directory.
#include "baton.h"
#include "real.h"

#include <spawn.h>
#include <sys/stat.h>
#include <sys/wait.h>

#include <array>
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

const char *device_dir()
{
    const char *dir = getenv("KIV_DEVICE_DIR");
    return dir && *dir ? dir : nullptr;
}

// The path to open: the one given, or its place in the device directory, written into moved.
const char *move_path(const char *path, std::array<char, PATH_MAX> &moved)
{
    const char *dir = device_dir();
    if (!dir || !path || strncmp(path, KERNEL_LEDS, KERNEL_LEDS_LENGTH) != 0)
        return path;
    const int length = snprintf(moved.data(), moved.size(), "%s/leds/%s", dir, path + KERNEL_LEDS_LENGTH);
    return length > 0 && static_cast<size_t>(length) < moved.size() ? moved.data() : path;
}

// Copies text with every mention of the kernel's folder replaced. False when the result does not fit.
bool move_command(const char *text, std::array<char, 4096> &moved)
{
    const char *dir = device_dir();
    size_t used = 0;
    while (*text) {
        const bool here = dir && strncmp(text, KERNEL_LEDS, KERNEL_LEDS_LENGTH) == 0;
        const int length = here ? snprintf(moved.data() + used, moved.size() - used, "%s/leds/", dir)
                                : snprintf(moved.data() + used, moved.size() - used, "%c", *text);
        used += static_cast<size_t>(length);
        if (used >= moved.size())
            return false;
        text += here ? KERNEL_LEDS_LENGTH : 1;
    }
    moved[used] = '\0';
    return true;
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
        if (!is_ours(*variable))
            environment[count++] = *variable;
    }
    char shell[] = "sh";
    char option[] = "-c";
    char *arguments[] = {shell, option, const_cast<char *>(command), nullptr};
    pid_t child = -1;
    int status = -1;
    if (posix_spawn(&child, "/bin/sh", nullptr, nullptr, arguments, environment.data()) != 0)
        return -1;
    while (waitpid(child, &status, 0) < 0) {
        if (errno != EINTR)
            return -1;
    }
    return status;
}

mode_t mode_argument(int flags, va_list arguments)
{
    return flags & (O_CREAT | O_TMPFILE) ? static_cast<mode_t>(va_arg(arguments, unsigned)) : 0;
}
} // namespace

extern "C" {

int open(const char *path, int flags, ...)
{
    std::array<char, PATH_MAX> moved = {};
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = mode_argument(flags, arguments);
    va_end(arguments);
    return real().open(move_path(path, moved), flags, mode);
}

int openat(int dir, const char *path, int flags, ...)
{
    std::array<char, PATH_MAX> moved = {};
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = mode_argument(flags, arguments);
    va_end(arguments);
    return real().openat(dir, move_path(path, moved), flags, mode);
}

int system(const char *command)
{
    std::array<char, 4096> moved = {};
    if (!command)
        return 1;
    const int status = move_command(command, moved) ? run_shell(moved.data()) : -1;
    trace_call("system", command, status);
    return status;
}
}
