#include "world/daemon_process.h"

#include "trace/line.h"
#include "world/running_daemon.h"
#include "world/standstill.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <poll.h>
#include <sstream>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>
#include <vector>

namespace fs = std::filesystem;

namespace
{
// Real time without any sign of life; a sanitizer or an emulator makes the daemon slow, but not that slow.
constexpr int LOOK_EVERY_MS = 250;
constexpr int ASLEEP_MS = 5'000;
constexpr int SILENT_MS = 60'000;

// The clock's end of the pair in the daemon. Everything else of ours is closed there, so that its own descriptors have
// the same numbers in every run.
constexpr int CLOCK_FD = 100;

// A tool has so long to end behind its program.
constexpr int TOOL_ENDS_MS = 10'000;
constexpr int TELL_PERSON_MS = 1'000;
constexpr int LOOK_FOR_END_MS = 50;

constexpr const char *DAEMON_FILE = "kiv_mirta_led";
constexpr const char *CLOCK_FILE = "libkiv_led_clock.so";

std::string first_existing(const std::vector<fs::path> &candidates)
{
    for (const fs::path &candidate : candidates) {
        std::error_code failure;
        if (fs::is_regular_file(candidate, failure)) {
            return fs::absolute(candidate).string();
        }
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
    bool under;
    bool lends_terminal;
};

// An option that the user has not set in a sanitizer's variable.
std::string with_option(const char *variable, const char *option, const char *value)
{
    const char *set = getenv(variable);
    std::string options = set ? set : "";
    if (options.find(std::string(option) + "=") == std::string::npos) {
        options += (options.empty() ? "" : ":") + std::string(option) + "=" + value;
    }
    return std::string(variable) + "=" + options;
}

bool is_replaced(const char *variable)
{
    constexpr std::array names = {"KIV_", "LD_PRELOAD=", "ASAN_OPTIONS=", "TSAN_OPTIONS=", "TZ="};
    for (const char *name : names) {
        if (strncmp(variable, name, strlen(name)) == 0) {
            return true;
        }
    }
    return false;
}

bool is_script(const std::string &path)
{
    std::array<char, 2> mark = {};
    std::ifstream(path).read(mark.data(), mark.size());
    return mark[0] == '#' && mark[1] == '!';
}

// The clock stands in front of a sanitizer's runtime, which then sees the calls that the clock makes in the daemon's
// name; AddressSanitizer would rather be first, and is told not to mind.
launch_plan plan_launch(const daemon_options &options, const std::string &device, const std::string &trace_path,
                        const std::string &clock_start)
{
    launch_plan plan = {{}, {}, device, !options.under.empty(), options.lends_terminal};
    std::istringstream emulator(options.emulator);
    for (std::string part; emulator >> part;) {
        plan.arguments.push_back(part);
    }
    // The emulated program is given the library, not the emulator itself. Any other command hands on its environment.
    const bool emulated =
        !plan.arguments.empty() && fs::path(plan.arguments[0]).filename().string().starts_with("qemu-");
    if (emulated) {
        plan.arguments.insert(plan.arguments.end(), {"-E", "LD_PRELOAD=" + options.clock});
    }
    if (plan.under) {
        const std::string command = "exec " + options.under + " \"$@\"";
        plan.arguments.insert(plan.arguments.begin(), {"sh", "-c", command, "sh"});
    }
    plan.arguments.push_back(options.daemon);
    for (char **variable = environ; *variable; variable++) {
        if (!is_replaced(*variable)) {
            plan.environment.emplace_back(*variable);
        }
    }
    if (!emulated) {
        plan.environment.push_back("LD_PRELOAD=" + options.clock);
    }
    plan.environment.insert(plan.environment.end(),
                            {"KIV_DEVICE_DIR=" + device, "KIV_TRACE=" + trace_path, "KIV_LOG=none", "KIV_FAULTS=1",
                             "TZ=UTC", with_option("ASAN_OPTIONS", "verify_asan_link_order", "0"),
                             with_option("TSAN_OPTIONS", "halt_on_error", "1"), "KIV_LED_DIR=" + options.led_dir,
                             "KIV_LED_MAP=" + options.led_map});
    if (!options.real_time) {
        plan.environment.push_back(std::string(CLOCK_FD_VARIABLE) + "=" + std::to_string(CLOCK_FD));
        if (!emulated && (plan.under || !options.emulator.empty() || is_script(options.daemon))) {
            plan.environment.push_back(std::string(CLOCK_WRAPPED_VARIABLE) + "=1");
        }
        plan.environment.push_back(std::string(CLOCK_START_VARIABLE) + "=" + clock_start);
    }
    return plan;
}

std::vector<char *> pointers(std::vector<std::string> &texts)
{
    std::vector<char *> list;
    list.reserve(texts.size() + 1);
    for (std::string &text : texts) {
        list.push_back(text.data());
    }
    list.push_back(nullptr);
    return list;
}

void redirect(const std::string &path, int to)
{
    const int fd = open(path.c_str(), O_RDWR | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
    if (fd >= 0) {
        dup2(fd, to);
    }
}

[[noreturn]] void become_daemon(launch_plan &plan, int clock_fd)
{
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (plan.lends_terminal) {
        signal(SIGINT, SIG_DFL);
    } else {
        setpgid(0, 0); // with whatever a wrapper starts
        redirect(plan.device + "/stdout", STDOUT_FILENO);
    }
    if (plan.under && !plan.lends_terminal) {
        redirect("/dev/null", STDIN_FILENO);
    } else if (!plan.under) {
        redirect(plan.device + "/stderr", STDERR_FILENO);
    }
    if (clock_fd >= 0) {
        dup2(clock_fd, CLOCK_FD);
    }
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
    if (WIFSIGNALED(status)) {
        return "was ended by signal " + std::to_string(WTERMSIG(status)) + " (" + strsignal(WTERMSIG(status)) + ")";
    }
    return "ended with status " + std::to_string(WEXITSTATUS(status));
}

void note_end(daemon_process &process, int status)
{
    process.end = describe_end(status);
    process.lost_trace = WIFEXITED(status) && WEXITSTATUS(status) == TRACE_LOST_STATUS;
}

struct patience {
    int asleep_ms = 0; // all threads wait for something that the clock does not know
    int silent_ms = 0; // the trace has not grown
    uintmax_t trace_size = 0;
};

// One more look at a process that has not come to rest. False when there is no more to wait for; its end then says so.
bool is_patient(patience &left, daemon_process &process)
{
    if (process.under) {
        return true; // a person may be at work
    }
    std::error_code failure;
    const uintmax_t size = fs::file_size(process.trace_path, failure);
    const process_activity doing = what_it_does(process.pid);
    const bool grown = size != std::exchange(left.trace_size, size);
    left.silent_ms = grown || doing == process_activity::HELD ? 0 : left.silent_ms + LOOK_EVERY_MS;
    left.asleep_ms = grown || doing != process_activity::ASLEEP ? 0 : left.asleep_ms + LOOK_EVERY_MS;
    if (left.asleep_ms < ASLEEP_MS && left.silent_ms < SILENT_MS) {
        return true;
    }
    process.end = "has not come to rest: " + where_it_waits(process.pid);
    return false;
}

void let_go(daemon_process &process)
{
    if (process.control >= 0) {
        close(process.control);
    }
    process.control = -1;
    process.pid = -1;
}

// It is about to be gone: its end of the pair is closed.
run_result collect_end(daemon_process &process)
{
    int status = 0;
    while (waitpid(process.pid, &status, 0) < 0 && errno == EINTR) {
        continue;
    }
    note_end(process, status);
    let_go(process);
    return run_result::ENDED;
}
} // namespace

bool find_daemon(daemon_options &options, std::string &error)
{
    const fs::path own = own_folder();
    if (options.daemon.empty()) {
        options.daemon = first_existing({own / DAEMON_FILE, own / "../sbin" / DAEMON_FILE});
    } else {
        options.daemon = first_existing({options.daemon});
    }
    if (options.daemon.empty()) {
        error = "the daemon is not beside the simulator; name it with --daemon PATH";
        return false;
    }
    const fs::path beside = fs::path(options.daemon).parent_path();
    if (options.clock.empty()) {
        options.clock =
            first_existing({beside / "lib" / CLOCK_FILE, beside / CLOCK_FILE, beside / "../lib/kiv_led" / CLOCK_FILE,
                            own / "lib" / CLOCK_FILE, own / "../lib/kiv_led" / CLOCK_FILE});
    }
    if (!options.clock.empty()) {
        return true;
    }
    error = std::string(CLOCK_FILE) + " is neither in lib/ beside the daemon nor in ../lib/kiv_led";
    return false;
}

bool launch(daemon_process &process, const daemon_options &options, const std::string &device,
            const std::string &trace_path, int64_t now_ns, int64_t wall_offset_ns, std::string &error)
{
    process.lost_trace = false;
    std::array<int, 2> pair = {-1, -1};
    process.end.clear();
    process.trace_path = trace_path;
    process.device = device;
    process.under = !options.under.empty();
    process.lends_terminal = options.lends_terminal;
    process.next_deadline_ns = CLOCK_NEVER;
    if (!options.real_time && socketpair(AF_UNIX, SOCK_SEQPACKET | SOCK_CLOEXEC, 0, pair.data()) != 0) {
        error = std::string("no socket pair: ") + strerror(errno);
        return false;
    }
    launch_plan plan =
        plan_launch(options, device, trace_path, std::to_string(now_ns) + " " + std::to_string(wall_offset_ns));
    process.pid = fork();
    if (process.pid == 0) {
        become_daemon(plan, pair[1]);
    }
    process.control = pair[0];
    if (pair[1] >= 0) {
        close(pair[1]);
    }
    if (process.pid > 0) {
        return true;
    }
    let_go(process);
    error = std::string("no process: ") + strerror(errno);
    return false;
}

run_result wait_until_idle(daemon_process &process, int64_t &now_ns)
{
    pollfd control = {process.control, POLLIN, 0};
    clock_report report = {};
    patience left;
    int ready = 0;
    while (ready == 0) {
        ready = poll(&control, 1, LOOK_EVERY_MS);
        if (ready == 0 && !is_patient(left, process)) {
            return run_result::STUCK;
        }
        ready = ready < 0 && errno == EINTR ? 0 : ready;
    }
    if (read(process.control, &report, sizeof report) != sizeof report) {
        return collect_end(process);
    }
    now_ns = report.now_ns;
    process.next_deadline_ns = report.next_deadline_ns;
    return run_result::IDLE;
}

run_result run_until(daemon_process &process, int64_t until_ns, int64_t wall_offset_ns, int64_t &now_ns)
{
    const clock_command command = {until_ns, wall_offset_ns};
    if (send(process.control, &command, sizeof command, MSG_NOSIGNAL) != sizeof command) {
        return collect_end(process);
    }
    return wait_until_idle(process, now_ns);
}

bool has_ended(daemon_process &process)
{
    int status = 0;
    if (process.pid < 0) {
        return true;
    }
    if (!process.ours) {
        process.end = "is gone";
        process.pid = is_running(process.device, process.pid) ? process.pid : -1;
        return process.pid < 0;
    }
    if (waitpid(process.pid, &status, WNOHANG) != process.pid) {
        return false;
    }
    note_end(process, status);
    let_go(process);
    return true;
}

pid_t daemon_pid(const daemon_process &process)
{
    return process.under && process.pid >= 0 ? queue_reader(process.device) : process.pid;
}

static void end_tool(daemon_process &process)
{
    const pid_t daemon = daemon_pid(process);
    if (daemon > 0) {
        kill(daemon, SIGHUP);
    }
    for (int waited = 0; waited < TOOL_ENDS_MS || process.lends_terminal; waited += LOOK_FOR_END_MS) {
        if (has_ended(process)) {
            return;
        }
        if (waited == TELL_PERSON_MS && process.lends_terminal) {
            fprintf(stderr, "\nthe run is over; it ends with the program that the daemon runs under\n");
        }
        usleep(LOOK_FOR_END_MS * 1000);
    }
}

void kill_daemon(daemon_process &process)
{
    if (process.pid >= 0 && process.under) {
        end_tool(process);
    }
    if (process.pid < 0) {
        return;
    }
    if (!process.ours) {
        process.pid = -1;
        return;
    }
    setpgid(process.pid, process.pid); // should it not have come to that yet
    kill(-process.pid, SIGKILL);
    while (waitpid(process.pid, nullptr, 0) < 0 && errno == EINTR) {
        continue;
    }
    let_go(process);
}
