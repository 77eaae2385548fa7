#include "world/running_daemon.h"

#include "language/words.h"
#include "world/bus.h"
#include "world/device.h"

#include <csignal>
#include <filesystem>

namespace fs = std::filesystem;

namespace
{
constexpr const char *LED_QUEUE = "bus/MSG_ID_LED";

std::string variable_of(const std::string &process_dir, const std::string &name)
{
    std::string environment;
    read_file(process_dir + "/environ", environment);
    environment.insert(0, 1, '\0');
    const std::string before = '\0' + name + "=";
    const size_t at = environment.find(before);
    return at == std::string::npos ? "" : environment.c_str() + at + before.size();
}

std::string trace_of(const std::string &process_dir)
{
    const std::string set = variable_of(process_dir, "KIV_TRACE");
    std::error_code failure;
    fs::path path = set;
    if (set == "-") {
        path = fs::read_symlink(process_dir + "/fd/2", failure);
    } else if (path.is_relative()) {
        path = fs::read_symlink(process_dir + "/cwd", failure) / path;
    }
    return !set.empty() && fs::is_regular_file(path, failure) ? path.string() : "";
}
} // namespace

// The process writes its id into the lock of the queue that it reads.
pid_t queue_reader(const std::string &device)
{
    std::string holder;
    read_device_text(device, std::string(LED_QUEUE) + ".lock", holder);
    const std::optional<int64_t> pid = parse_number(holder, 1, INT32_MAX);
    return pid && has_reader(device + "/" + LED_QUEUE) ? static_cast<pid_t>(*pid) : -1;
}

running_daemon find_running_daemon(const std::string &device)
{
    running_daemon found;
    found.pid = queue_reader(device);
    if (found.pid < 0) {
        return found;
    }
    const std::string process_dir = "/proc/" + std::to_string(found.pid);
    std::error_code failure;
    found.trace = trace_of(process_dir);
    found.reads_faults = variable_of(process_dir, "KIV_FAULTS") == "1";
    found.has_threads = std::distance(fs::directory_iterator(process_dir + "/task", failure), {}) > 1;
    return found;
}

bool is_running(const std::string &device, pid_t pid)
{
    return kill(pid, 0) == 0 && queue_reader(device) == pid;
}
