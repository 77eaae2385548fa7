#include "rig.h"

#include "language/words.h"
#include "seen/led_files.h"
#include "world/device.h"
#include "world/interrupt.h"
#include "world/standstill.h"

#include <cstdlib>
#include <ctime>
#include <filesystem>
#include <unistd.h>
#include <utility>

namespace fs = std::filesystem;

namespace
{
constexpr int64_t FIRST_DAY_NS = 1'767'225'600 * NS_PER_S; // 2026-01-01 00:00:00 UTC
constexpr int64_t LONGEST_UNREST_NS = 20 * NS_PER_S;
constexpr useconds_t LOOK_AGAIN_US = 5000;
constexpr off_t TRACE_MAX = 64 * 1024 * 1024; // of what has been read and need not be kept

// Without a trace, the LEDs' own files show what they can.
std::vector<trace_entry> new_entries(rig &r)
{
    const bool traced = r.trace.fd >= 0;
    std::vector<trace_entry> entries = traced ? read_trace(r.trace) : read_led_files(r.device, r.state);
    for (trace_entry &entry : entries) {
        entry.time_us = (traced ? entry.time_us : real_now_ns() / 1000) - r.real_start_ns / 1000;
    }
    r.wires.in_queue = traced ? r.wires.in_queue : 0; // nothing tells what the daemon has taken
    return entries;
}

// A call that was made to fail has taken nothing; its line ends behind the result.
bool has_taken_message(const trace_entry &entry)
{
    return entry.call == "kiv_recv_msg" && atoi(entry.result.c_str()) > 0 &&
           entry.result.find(',') != std::string::npos;
}

// A daemon that others have started may have registered while nobody, or somebody else, was the other modules.
void note_registration(bus &wires, const trace_entry &entry)
{
    int module_id = 0;
    std::vector<uint32_t> masks(4);
    if (entry.call == "kiv_reg_func" && entry.result == "0" &&
        sscanf(entry.arguments.c_str(), "%d, %*d, %x %x %x %x", &module_id, &masks[0], &masks[1], &masks[2],
               &masks[3]) == 5) {
        wires.registered[module_id] = masks;
    }
}

void take(rig &r, const trace_entry &entry)
{
    observe(r.state, entry);
    if (r.watcher) {
        r.watcher(entry);
    }
    if (r.attached) {
        note_registration(r.wires, entry);
    }
    if (has_taken_message(entry)) {
        message_taken(r.wires);
    }
}

// Returns how many entries were new.
size_t look(rig &r)
{
    size_t count = 0;
    std::vector<trace_entry> entries;
    do {
        entries = new_entries(r);
        count += entries.size();
        for (const trace_entry &entry : entries) {
            timeline_entry(r.line, r.state, entry);
            take(r, entry);
        }
    } while (!entries.empty() && r.trace.fd >= 0);
    return count;
}

// While the daemon is at rest: nobody writes.
void trim_trace(rig &r)
{
    if (!r.keep_trace && r.trace.rest.empty() && lseek(r.trace.fd, 0, SEEK_CUR) > TRACE_MAX &&
        truncate(r.trace_path.c_str(), 0) == 0) {
        lseek(r.trace.fd, 0, SEEK_SET);
    }
}

// From deadline to deadline, so that the other modules take what they are sent while it comes, and the trace is read
// while it grows.
bool pass_virtual_time(rig &r, int64_t until_ns, std::string &error)
{
    for (bool moved = false;;) {
        const int64_t next = r.process.next_deadline_ns;
        const int64_t step = next > r.now_ns && next < until_ns ? next : until_ns;
        const run_result result = run_until(r.process, moved ? r.now_ns : step, r.wall_offset_ns, r.now_ns);
        look(r);
        if (result == run_result::STUCK) {
            error = "the daemon " + r.process.end;
            return false;
        }
        if (!r.trace.rest.empty()) {
            error = "its trace ends in the middle of a line: a byte of it was lost";
            return false;
        }
        if (result == run_result::ENDED) {
            return true;
        }
        trim_trace(r);
        // What waited for room in a queue goes on at the same time.
        moved = drain(r.wires) + deliver_pending(r.wires) > 0;
        if (!moved && r.now_ns >= until_ns) {
            return true;
        }
    }
}

bool is_at_rest(const rig &r)
{
    const pid_t daemon = daemon_pid(r.process);
    if ((r.attached || r.process.under) && what_it_does(daemon) == process_activity::HELD) {
        return true; // a debugger has it; nobody knows for how long
    }
    return r.wires.pending.empty() && r.wires.in_queue == 0 && waits_for_message(daemon);
}

// Until the daemon has taken every message and waits for the next one, and at least until then.
void pass_real_time(rig &r, int64_t until_ns)
{
    const int64_t give_up = std::max(real_now_ns(), r.real_start_ns + until_ns) + LONGEST_UNREST_NS;
    for (bool rests = false;;) {
        const bool rested = std::exchange(rests, is_at_rest(r));
        const bool moved = look(r) + static_cast<size_t>(drain(r.wires) + deliver_pending(r.wires)) > 0;
        const int64_t now = real_now_ns();
        r.now_ns = now - r.real_start_ns;
        const bool over = r.now_ns >= until_ns && ((rested && !moved) || now >= give_up);
        // What it did before it came to rest is in the trace by now.
        if (has_ended(r.process) || over || interrupt_signal != 0) {
            look(r);
            return;
        }
        if (!moved) {
            timeline_flush(r.line, r.state);
        }
        usleep(LOOK_AGAIN_US);
    }
}

bool begin_run(rig &r, std::string &error)
{
    r.wall_offset_ns = r.options.real_time ? real_wall_ns() : FIRST_DAY_NS;
    r.real_start_ns = r.options.real_time ? real_now_ns() : 0;
    if (!open_trace(r.trace, r.trace_path)) {
        error = r.trace_path + " cannot be opened";
        return false;
    }
    lseek(r.trace.fd, 0, SEEK_END);
    return write_device_file(r.device, {"cfg/531", "1"}, error);
}
} // namespace

int64_t real_now_ns()
{
    timespec now = {};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return now.tv_sec * NS_PER_S + now.tv_nsec;
}

int64_t real_wall_ns()
{
    timespec now = {};
    clock_gettime(CLOCK_REALTIME, &now);
    return now.tv_sec * NS_PER_S + now.tv_nsec;
}

bool enter_world(rig &r, std::string &error)
{
    // The stand-ins of this process are part of the device, but not of the daemon's trace.
    setenv("KIV_DEVICE_DIR", r.device.c_str(), 1);
    unsetenv("KIV_TRACE");
    unsetenv("KIV_FAULTS");
    return open_bus(r.wires, r.device, error);
}

bool set_up_rig(rig &r, const daemon_options &options, const std::string &trace_path, std::string &error)
{
    r.options = options;
    r.device = make_device(error);
    if (r.device.empty()) {
        return false;
    }
    r.trace_path = trace_path.empty() ? r.device + "/trace" : trace_path;
    return begin_run(r, error) && enter_world(r, error);
}

// The stand-ins of this process hold on to the directory and its queues, which therefore stay.
bool renew_rig(rig &r, std::string &error)
{
    kill_daemon(r.process);
    close_trace(r.trace);
    drain(r.wires);
    forget_queue(r.wires);
    std::error_code failure;
    for (const fs::directory_entry &entry : fs::directory_iterator(r.device, failure)) {
        if (entry.path().filename() != "bus") {
            fs::remove_all(entry.path(), failure);
        }
    }
    r.wires.registered.clear();
    rig fresh;
    fresh.options = r.options;
    fresh.device = r.device;
    fresh.trace_path = r.trace_path;
    fresh.wires = std::move(r.wires);
    fresh.line.out = r.line.out;
    fresh.line.every_request = r.line.every_request;
    fresh.line.moment_length_us = r.line.moment_length_us;
    fresh.watcher = std::move(r.watcher);
    fresh.keep_trace = r.keep_trace;
    r = std::move(fresh);
    return begin_run(r, error);
}

void take_down_rig(rig &r, bool keep_device)
{
    kill_daemon(r.process);
    close_trace(r.trace);
    close_bus(r.wires);
    if (!keep_device && !r.attached && !r.device.empty()) {
        remove_device(r.device);
    }
}

bool launch_daemon(rig &r, std::string &error)
{
    if (!launch(r.process, r.options, r.device, r.trace_path, r.now_ns, r.wall_offset_ns, error)) {
        return false;
    }
    r.launched = true;
    // A person may have to tell a debugger to run it.
    while (r.process.under && r.options.real_time && daemon_pid(r.process) < 0 && !has_ended(r.process) &&
           interrupt_signal == 0) {
        usleep(LOOK_AGAIN_US);
    }
    if (!r.options.real_time && wait_until_idle(r.process, r.now_ns) == run_result::STUCK) {
        error = "the daemon " + r.process.end;
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
    if (went_on && r.process.lost_trace) {
        error = "the daemon " + r.process.end + ": its trace could not be written";
        return false;
    }
    return went_on;
}

void glance(rig &r)
{
    const bool moved = look(r) + static_cast<size_t>(drain(r.wires) + deliver_pending(r.wires)) > 0;
    r.now_ns = real_now_ns() - r.real_start_ns;
    if (r.process.pid >= 0) {
        has_ended(r.process);
    }
    if (!moved) {
        timeline_flush(r.line, r.state);
    }
}

void look_back(rig &r)
{
    for (std::vector<trace_entry> entries; !(entries = new_entries(r)).empty();) {
        for (const trace_entry &entry : entries) {
            take(r, entry);
        }
        begin_step(r.state);
    }
    r.line.before = r.state.leds;
}

void new_step(rig &r)
{
    std::string text;
    begin_step(r.state);
    r.line.changes.clear();
    r.line.requests.clear();
    if (read_file(r.device + "/stdout", text)) {
        r.printed_before = text.size();
    }
}

std::string printed_in_step(const rig &r)
{
    std::string text;
    read_file(r.device + "/stdout", text);
    return text.substr(std::min(r.printed_before, text.size()));
}
