#include "rig.h"

#include "device.h"
#include "words.h"

#include <cstdlib>
#include <ctime>
#include <unistd.h>

namespace
{
constexpr int64_t FIRST_DAY_NS = 1'767'225'600 * NS_PER_S; // 2026-01-01 00:00:00 UTC
constexpr int64_t QUIET_NS = 100 * NS_PER_MS;
constexpr int64_t LONGEST_UNREST_NS = 20 * NS_PER_S;
constexpr useconds_t LOOK_AGAIN_US = 5000;

int64_t real_now_ns()
{
    timespec now = {};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return now.tv_sec * NS_PER_S + now.tv_nsec;
}

// Returns how many entries were new.
size_t look(rig &r)
{
    std::vector<trace_entry> entries = read_trace(r.trace);
    for (trace_entry &entry : entries) {
        entry.time_us -= r.real_start_ns / 1000;
        timeline_entry(r.line, r.state, entry);
        observe(r.state, entry);
    }
    return entries.size();
}

bool pass_virtual_time(rig &r, int64_t until_ns, std::string &error)
{
    run_result result = run_result::IDLE;
    do {
        result = run_until(r.process, until_ns, r.wall_offset_ns, r.now_ns);
        look(r);
        // What waited for room in another module's queue goes on at the same time.
    } while (result == run_result::IDLE && drain(r.wires) > 0);
    if (result != run_result::STUCK)
        return true;
    error = "the daemon has not come to rest for a minute of real time";
    return false;
}

// The daemon is left alone until its trace is quiet, and at least until then.
void pass_real_time(rig &r, int64_t until_ns)
{
    int64_t last_sign = real_now_ns();
    const int64_t give_up = std::max(last_sign, r.real_start_ns + until_ns) + LONGEST_UNREST_NS;
    for (;;) {
        drain(r.wires);
        const int64_t now = real_now_ns();
        if (look(r) > 0)
            last_sign = now;
        r.now_ns = now - r.real_start_ns;
        const bool quiet = now - last_sign >= QUIET_NS || now >= give_up;
        if (has_ended(r.process) || (r.now_ns >= until_ns && quiet))
            return;
        usleep(LOOK_AGAIN_US);
    }
}
} // namespace

bool set_up_rig(rig &r, const daemon_options &options, const std::string &trace_path, std::string &error)
{
    r.options = options;
    r.device = make_device(error);
    if (r.device.empty())
        return false;
    // The stand-ins of this process are part of the device, but not of the daemon's trace.
    setenv("KIV_DEVICE_DIR", r.device.c_str(), 1);
    unsetenv("KIV_TRACE");
    unsetenv("KIV_FAULTS");
    r.trace_path = trace_path.empty() ? r.device + "/trace" : trace_path;
    r.wall_offset_ns = FIRST_DAY_NS;
    r.real_start_ns = options.real_time ? real_now_ns() : 0;
    if (!open_trace(r.trace, r.trace_path)) {
        error = r.trace_path + " cannot be opened";
        return false;
    }
    lseek(r.trace.fd, 0, SEEK_END);
    return write_device_file(r.device, {"cfg/531", "1"}, error) && open_bus(r.wires, r.device, error);
}

void take_down_rig(rig &r, bool keep_device)
{
    kill_daemon(r.process);
    close_trace(r.trace);
    close_bus(r.wires);
    if (!keep_device && !r.device.empty())
        remove_device(r.device);
}

bool launch_daemon(rig &r, std::string &error)
{
    if (!launch(r.process, r.options, r.device, r.trace_path, r.now_ns, r.wall_offset_ns, error))
        return false;
    r.launched = true;
    if (!r.options.real_time && wait_until_idle(r.process, r.now_ns) == run_result::STUCK) {
        error = "the daemon has not come to rest for a minute of real time";
        return false;
    }
    return pass_time(r, r.now_ns, error);
}

bool pass_time(rig &r, int64_t until_ns, std::string &error)
{
    bool went_on = true;
    if (r.process.pid < 0) {
        r.now_ns = std::max(r.now_ns, until_ns);
        look(r);
    } else if (r.options.real_time) {
        pass_real_time(r, until_ns);
    } else {
        went_on = pass_virtual_time(r, until_ns, error);
    }
    timeline_flush(r.line, r.state);
    return went_on;
}

void new_step(rig &r)
{
    std::string text;
    begin_step(r.state);
    if (read_file(r.device + "/stdout", text))
        r.printed_before = text.size();
}

std::string printed_in_step(const rig &r)
{
    std::string text;
    read_file(r.device + "/stdout", text);
    return text.substr(std::min(r.printed_before, text.size()));
}
