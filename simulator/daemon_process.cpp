#include "daemon_process.h"

#include "clock/protocol.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <poll.h>
#include <sstream>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

namespace fs = std::filesystem;

namespace
{
// Real time without any sign of the daemon; a sanitizer or an emulator makes it slow, but not that slow.
constexpr int STUCK_AFTER_MS = 60'000;

// The clock's end of the pair in the daemon. Everything else of ours is closed there, so that its own descriptors have
// the same numbers in every run.
constexpr int CLOCK_FD = 100;

constexpr const char *DAEMON_FILE = "kiv_mirta_led";
constexpr const char *CLOCK_FILE = "libkiv_led_clock.so";

std::string first_existing(const std::vector<fs::path> &candidates)
{
    for (const fs::path &candidate : candidates) {
        std::error_code failure;
        if (fs::is_regular_file(candidate, failure))
            return fs::absolute(candidate).string();
    }
    return {};
}

fs::path own_folder()
{
    std::error_code failure;
    return fs::read_symlink("/proc/self/exe", failure).parent_path();
}

struct launch_plan {
    std::vector<std::string> arguments;
    std::vector<std::string> environment;
    std::string device;
};

// An option that the user has not set in a sanitizer's variable.
std::string with_option(const char *variable, const char *option, const char *value)
{
    const char *set = getenv(variable);
    std::string options = set ? set : "";
    if (options.find(std::string(option) + "=") == std::string::npos)
        options += (options.empty() ? "" : ":") + std::string(option) + "=" + value;
    return std::string(variable) + "=" + options;
}

bool is_replaced(const char *variable)
{
    constexpr std::array names = {"KIV_", "LD_PRELOAD=", "ASAN_OPTIONS=", "TSAN_OPTIONS=", "TZ="};
    for (const char *name : names) {
        if (strncmp(variable, name, strlen(name)) == 0)
            return true;
    }
    return false;
}

// The clock stands in front of a sanitizer's runtime, which then sees the calls that the clock makes in the daemon's
// name; AddressSanitizer would rather be first, and is told not to mind.
launch_plan plan_launch(const daemon_options &options, const std::string &device, const std::string &trace_path,
                        const std::string &clock_start)
{
    launch_plan plan;
    plan.device = device;
    std::istringstream emulator(options.emulator);
    for (std::string part; emulator >> part;)
        plan.arguments.push_back(part);
    // The emulated program is given the library, not the emulator itself.
    if (!plan.arguments.empty())
        plan.arguments.insert(plan.arguments.end(), {"-E", "LD_PRELOAD=" + options.clock});
    plan.arguments.push_back(options.daemon);
    for (char **variable = environ; *variable; variable++) {
        if (!is_replaced(*variable))
            plan.environment.emplace_back(*variable);
    }
    if (options.emulator.empty())
        plan.environment.push_back("LD_PRELOAD=" + options.clock);
    plan.environment.insert(plan.environment.end(),
                            {"KIV_DEVICE_DIR=" + device, "KIV_TRACE=" + trace_path, "KIV_LOG=none", "KIV_FAULTS=1",
                             "TZ=UTC", with_option("ASAN_OPTIONS", "verify_asan_link_order", "0"),
                             with_option("TSAN_OPTIONS", "halt_on_error", "1")});
    if (!options.real_time) {
        plan.environment.push_back(std::string(CLOCK_FD_VARIABLE) + "=" + std::to_string(CLOCK_FD));
        plan.environment.push_back(std::string(CLOCK_START_VARIABLE) + "=" + clock_start);
    }
    return plan;
}

std::vector<char *> pointers(std::vector<std::string> &texts)
{
    std::vector<char *> list;
    list.reserve(texts.size() + 1);
    for (std::string &text : texts)
        list.push_back(text.data());
    list.push_back(nullptr);
    return list;
}

void redirect(const std::string &path, int to)
{
    const int fd = open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
    if (fd >= 0)
        dup2(fd, to);
}

[[noreturn]] void become_daemon(launch_plan &plan, int clock_fd)
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    redirect(plan.device + "/stdout", STDOUT_FILENO);
    redirect(plan.device + "/stderr", STDERR_FILENO);
    if (clock_fd >= 0)
        dup2(clock_fd, CLOCK_FD);
    close_range(STDERR_FILENO + 1, CLOCK_FD - 1, 0);
    close_range(CLOCK_FD + (clock_fd >= 0 ? 1 : 0), ~0U, 0);
    const std::vector<char *> arguments = pointers(plan.arguments);
    const std::vector<char *> environment = pointers(plan.environment);
    execvpe(arguments[0], arguments.data(), environment.data());
    dprintf(STDERR_FILENO, "%s: %s\n", arguments[0], strerror(errno));
    _exit(127);
}

std::string describe_end(int status)
{
    if (WIFSIGNALED(status))
        return "was ended by signal " + std::to_string(WTERMSIG(status)) + " (" + strsignal(WTERMSIG(status)) + ")";
    return "ended with status " + std::to_string(WEXITSTATUS(status));
}

void let_go(daemon_process &process)
{
    if (process.control >= 0)
        close(process.control);
    process.control = -1;
    process.pid = -1;
}

// It is about to be gone: its end of the pair is closed.
run_result collect_end(daemon_process &process)
{
    int status = 0;
    while (waitpid(process.pid, &status, 0) < 0 && errno == EINTR)
        continue;
    process.end = describe_end(status);
    let_go(process);
    return run_result::ENDED;
}
} // namespace

bool find_daemon(daemon_options &options, std::string &error)
{
    const fs::path own = own_folder();
    if (options.daemon.empty())
        options.daemon = first_existing({own / DAEMON_FILE, own / "../sbin" / DAEMON_FILE});
    else
        options.daemon = first_existing({options.daemon});
    if (options.daemon.empty()) {
        error = "the daemon is not beside the simulator; name it with --daemon PATH";
        return false;
    }
    const fs::path beside = fs::path(options.daemon).parent_path();
    if (options.clock.empty())
        options.clock =
            first_existing({beside / "lib" / CLOCK_FILE, beside / CLOCK_FILE, beside / "../lib/kiv_led" / CLOCK_FILE,
                            own / "lib" / CLOCK_FILE, own / "../lib/kiv_led" / CLOCK_FILE});
    if (!options.clock.empty())
        return true;
    error = std::string(CLOCK_FILE) + " is neither in lib/ beside the daemon nor in ../lib/kiv_led";
    return false;
}

bool launch(daemon_process &process, const daemon_options &options, const std::string &device,
            const std::string &trace_path, int64_t now_ns, int64_t wall_offset_ns, std::string &error)
{
    std::array<int, 2> pair = {-1, -1};
    process.end.clear();
    if (!options.real_time && socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, pair.data()) != 0) {
        error = std::string("no socket pair: ") + strerror(errno);
        return false;
    }
    launch_plan plan =
        plan_launch(options, device, trace_path, std::to_string(now_ns) + " " + std::to_string(wall_offset_ns));
    process.pid = fork();
    if (process.pid == 0)
        become_daemon(plan, pair[1]);
    process.control = pair[0];
    if (pair[1] >= 0)
        close(pair[1]);
    if (process.pid > 0)
        return true;
    let_go(process);
    error = std::string("no process: ") + strerror(errno);
    return false;
}

run_result wait_until_idle(daemon_process &process, int64_t &now_ns)
{
    pollfd control = {process.control, POLLIN, 0};
    clock_report report = {};
    int ready = 0;
    do
        ready = poll(&control, 1, STUCK_AFTER_MS);
    while (ready < 0 && errno == EINTR);
    if (ready == 0)
        return run_result::STUCK;
    if (read(process.control, &report, sizeof report) != sizeof report)
        return collect_end(process);
    now_ns = report.now_ns;
    return run_result::IDLE;
}

run_result run_until(daemon_process &process, int64_t until_ns, int64_t wall_offset_ns, int64_t &now_ns)
{
    const clock_command command = {until_ns, wall_offset_ns};
    if (send(process.control, &command, sizeof command, MSG_NOSIGNAL) != sizeof command)
        return collect_end(process);
    return wait_until_idle(process, now_ns);
}

bool has_ended(daemon_process &process)
{
    int status = 0;
    if (process.pid < 0)
        return true;
    if (waitpid(process.pid, &status, WNOHANG) != process.pid)
        return false;
    process.end = describe_end(status);
    let_go(process);
    return true;
}

void kill_daemon(daemon_process &process)
{
    if (process.pid < 0)
        return;
    kill(process.pid, SIGKILL);
    while (waitpid(process.pid, nullptr, 0) < 0 && errno == EINTR)
        continue;
    let_go(process);
}
