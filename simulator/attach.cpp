#include "attach.h"

#include "language/words.h"
#include "world/device.h"
#include "world/interrupt.h"
#include "world/running_daemon.h"

#include <filesystem>
#include <sys/stat.h>
#include <unistd.h>

namespace
{
constexpr int WAIT_FOR_DAEMON_MS = 10'000;
constexpr int LOOK_AGAIN_MS = 20;

bool open_its_trace(rig &r, const std::string &path)
{
    if (path == r.trace_path) {
        return true;
    }
    close_trace(r.trace);
    r.trace_path = path;
    return path.empty() || open_trace(r.trace, path);
}
} // namespace

bool take_daemon(rig &r)
{
    const running_daemon found = find_running_daemon(r.device);
    if (found.pid < 0 || !open_its_trace(r, found.trace)) {
        return false;
    }
    r.process = {};
    r.process.pid = found.pid;
    r.process.ours = false;
    r.process.device = r.device;
    r.launched = true;
    r.reads_faults = found.reads_faults;
    r.wires.registered_unseen = found.trace.empty();
    look_back(r);
    r.state.started |= found.has_threads && r.trace_path.empty();
    return true;
}

bool await_daemon(rig &r, std::string &error)
{
    for (int left = WAIT_FOR_DAEMON_MS; left > 0 && interrupt_signal == 0; left -= LOOK_AGAIN_MS) {
        if (take_daemon(r)) {
            return true;
        }
        usleep(LOOK_AGAIN_MS * 1000);
    }
    error = "no daemon runs in " + r.device + "; start one with KIV_DEVICE_DIR=" + r.device + " KIV_TRACE=" + r.device +
            "/trace KIV_FAULTS=1 kiv_mirta_led";
    return false;
}

bool attach_rig(rig &r, const std::string &device, std::string &error)
{
    std::error_code failure;
    r.attached = true;
    r.options.real_time = true;
    r.device = std::filesystem::absolute(device, failure).lexically_normal().string();
    r.real_start_ns = real_now_ns();
    r.wall_offset_ns = real_wall_ns();
    mkdir(r.device.c_str(), 0700);
    if (!enter_world(r, error)) {
        return false;
    }
    // A directory that somebody has made by hand: without the item the daemon shows nothing.
    take_daemon(r);
    const bool furnished = std::filesystem::exists(r.device + "/cfg/531", failure);
    return r.state.started || furnished || write_device_file(r.device, {"cfg/531", "1"}, error);
}
