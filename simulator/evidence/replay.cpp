#include "evidence/replay.h"

#include "evidence/replay_protocol.h"
#include "world/device.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <poll.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace
{
constexpr const char *REPLAY_FILE = "libkivreplay.so";
constexpr int STUCK_AFTER_MS = 60'000;
constexpr int LOOK_AGAIN_MS = 100;
constexpr size_t LINES_BEFORE = 10;

// What the daemon links, and the device's loader finds in its library folder.
constexpr std::array<const char *, 12> DEVICE_LIBRARIES = {
    "libkivlog.so.1", "libkivsocket.so.1", "libkivreg.so.1",   "libkivmem.so.1", "libkivnv.so.1", "libkivled.so.1",
    "libkivipc.so.1", "libkivadabsp.so.1", "libkivtr181.so.1", "libkivcfg.so.1", "libubox.so.1",  "libubox.so"};

struct stage {
    const recording &trace;
    const replay_options &options;
    std::string preload;
    std::string folder; // of links: every library of the device is the replay
    replay_page *page = nullptr;
};

bool refuse(const recording &trace, size_t at, const std::string &why, std::string &report)
{
    report += trace.name + ": " + why + "\n  " + trace.entries[at].line.substr(0, 200) + "\n";
    return false;
}

// A process is replayed from its first line on or not at all.
bool has_beginning(const recording &trace, std::string &report)
{
    const trace_entry &first = trace.entries[0];
    if (first.call == "kiv_trace_goes_on") {
        return refuse(trace, 0,
                      "its beginning is missing: the recording was longer than KIV_RECORD_MAX, and the file "
                      "before this one is gone",
                      report);
    }
    if (!is_head(first)) {
        return refuse(trace, 0,
                      "its beginning is missing: a trace begins with kiv_trace(1, ...), this one at " +
                          moment(first.time_us) + " with",
                      report);
    }
    return first.arguments.starts_with("1, ") || refuse(trace, 0, "a trace of another format; this reads 1", report);
}

std::vector<size_t> process_begins(const recording &trace)
{
    std::vector<size_t> begins;
    for (size_t at = 0; at < trace.entries.size(); at++) {
        if (is_head(trace.entries[at])) {
            begins.push_back(at);
        }
    }
    begins.push_back(trace.entries.size());
    return begins;
}

std::string find_library(const std::string &daemon)
{
    std::error_code failure;
    const fs::path own = fs::read_symlink("/proc/self/exe", failure).parent_path();
    for (const fs::path &place : {own / "lib", own / "../lib/kiv_led", fs::path(daemon).parent_path() / "lib"}) {
        if (fs::is_regular_file(place / REPLAY_FILE, failure)) {
            return fs::absolute(place / REPLAY_FILE).string();
        }
    }
    return {};
}

bool set_up_stage(stage &s, std::string &report)
{
    std::error_code failure;
    s.preload = find_library(s.options.process.daemon);
    std::string error = std::string(REPLAY_FILE) + " is neither in lib/ nor in ../lib/kiv_led";
    s.folder = s.preload.empty() ? "" : make_device(error);
    if (s.folder.empty()) {
        report += error + "\n";
        return false;
    }
    for (const char *name : DEVICE_LIBRARIES) {
        fs::create_symlink(s.preload, fs::path(s.folder) / name, failure);
    }
    const int fd = open((s.folder + "/page").c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    const bool sized = fd >= 0 && ftruncate(fd, sizeof(replay_page)) == 0;
    void *page = sized ? mmap(nullptr, sizeof(replay_page), PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0) : MAP_FAILED;
    s.page = page == MAP_FAILED ? nullptr : static_cast<replay_page *>(page);
    if (fd >= 0) {
        close(fd);
    }
    report += s.page ? "" : s.folder + "/page cannot be made\n";
    return s.page != nullptr;
}

void take_down_stage(stage &s)
{
    if (s.page) {
        munmap(s.page, sizeof *s.page);
    }
    remove_device(s.folder);
}

void give_orders(const stage &s, size_t from, size_t to)
{
    const std::string out = s.options.out_path.empty() ? "" : fs::absolute(s.options.out_path).string();
    *s.page = {};
    snprintf(s.page->trace, sizeof s.page->trace, "%s", fs::absolute(s.trace.name).c_str());
    snprintf(s.page->out, sizeof s.page->out, "%s", out.c_str());
    s.page->lines = s.options.lines;
    s.page->line = from;
    s.page->end = to;
}

[[noreturn]] void become_daemon(const stage &s)
{
    const int nowhere = open("/dev/null", O_RDWR | O_CLOEXEC);
    dup2(nowhere, STDIN_FILENO);
    dup2(nowhere, STDOUT_FILENO);
    setenv("LD_PRELOAD", s.preload.c_str(), 1);
    setenv("LD_LIBRARY_PATH", s.folder.c_str(), 1);
    setenv("ASAN_OPTIONS", "verify_asan_link_order=0", 0);
    setenv("TZ", "UTC", 1);
    setenv(REPLAY_VARIABLE, (s.folder + "/page").c_str(), 1);
    execl(s.options.process.daemon.c_str(), s.options.process.daemon.c_str(), nullptr);
    dprintf(STDERR_FILENO, "%s: %s\n", s.options.process.daemon.c_str(), strerror(errno));
    _exit(127);
}

// Until the daemon has ended. False when it makes no call for a minute; it is killed then.
bool wait_for_end(const stage &s, pid_t pid, int &wait_status)
{
    const int watched = static_cast<int>(syscall(SYS_pidfd_open, pid, 0));
    size_t line = s.page->line;
    int quiet_ms = 0;
    pollfd end = {watched, POLLIN, 0};
    while (poll(&end, 1, LOOK_AGAIN_MS) == 0 && quiet_ms < STUCK_AFTER_MS) {
        quiet_ms = s.page->line == line ? quiet_ms + LOOK_AGAIN_MS : 0;
        line = s.page->line;
    }
    kill(pid, SIGKILL);
    waitpid(pid, &wait_status, 0);
    close(watched);
    return quiet_ms < STUCK_AFTER_MS;
}

std::string describe_end(int wait_status)
{
    return WIFSIGNALED(wait_status) ? std::string("the daemon was ended by ") + strsignal(WTERMSIG(wait_status))
                                    : "the daemon ended with status " + std::to_string(WEXITSTATUS(wait_status));
}

void report_difference(const stage &s, const std::string &done, std::string &report)
{
    const size_t at = std::min<size_t>(s.page->line, s.trace.entries.size() - 1);
    report += s.trace.name + ":" + std::to_string(at + 1) + ": differs\n";
    for (size_t line = at - std::min(at, LINES_BEFORE); line < at; line++) {
        report += "    " + s.trace.entries[line].line + "\n";
    }
    const trace_entry &recorded = s.trace.entries[at];
    report += "  recorded: " + recorded.line.substr(recorded.line.find(' ') + 1) + "\n  done:     " + done + "\n";
}

replay_result replay_process(stage &s, size_t from, size_t to, std::string &report)
{
    give_orders(s, from, to);
    const pid_t pid = fork();
    int wait_status = 0;
    if (pid == 0) {
        become_daemon(s);
    }
    const bool ended = pid > 0 && wait_for_end(s, pid, wait_status);
    s.page->done[sizeof s.page->done - 1] = '\0';
    switch (s.page->verdict) {
    case REPLAY_SAME:
        if (s.page->done[0]) {
            report +=
                "the recording ends in the middle of it; the daemon goes on with " + std::string(s.page->done) + "\n";
        }
        return REPLAYED_SAME;
    case REPLAY_UNREADABLE:
        report += std::string(s.page->done) + "\n";
        return REPLAY_IMPOSSIBLE;
    case REPLAY_DIFFERS:
        report_difference(s, s.page->done, report);
        return REPLAYED_DIFFERENT;
    default:
        report_difference(s, ended ? describe_end(wait_status) : "nothing for a minute: the daemon makes no call",
                          report);
        return REPLAYED_DIFFERENT;
    }
}
} // namespace

replay_result replay(const recording &trace, const replay_options &options, std::string &report)
{
    stage s = {.trace = trace, .options = options, .preload = {}, .folder = {}};
    if (!has_beginning(trace, report)) {
        return REPLAY_IMPOSSIBLE;
    }
    replay_result result = set_up_stage(s, report) ? REPLAYED_SAME : REPLAY_IMPOSSIBLE;
    const std::vector<size_t> begins = process_begins(trace);
    for (size_t process = 0; process + 1 < begins.size() && result == REPLAYED_SAME; process++) {
        result = replay_process(s, begins[process], begins[process + 1], report);
    }
    if (result == REPLAYED_SAME) {
        report += "the same to the end, " + std::to_string(trace.entries.size()) + " lines\n";
    }
    take_down_stage(s);
    return result;
}
