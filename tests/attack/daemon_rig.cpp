#include "daemon_rig.h"

#include "kiv/reg.h"
#include "kiv/socket.h"
#include "standin.h"

#include <chrono>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <functional>
#include <iterator>
#include <poll.h>
#include <stdlib.h>
#include <sys/mount.h>
#include <sys/prctl.h>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

using namespace std::chrono_literals;

constexpr int patience_ms = 10'000; // a sanitizer makes it slow, but not that slow
constexpr int answer_ms = 3000;

static bool within_patience(const std::function<bool()> &done)
{
    const auto until = std::chrono::steady_clock::now() + std::chrono::milliseconds(patience_ms);
    while (!done()) {
        if (std::chrono::steady_clock::now() > until)
            return false;
        std::this_thread::sleep_for(1ms);
    }
    return true;
}

static bool receive(int queue, int wait_ms, svc_msg &message)
{
    pollfd ready = {queue, POLLIN, 0};
    message = {};
    return poll(&ready, 1, wait_ms) == 1 && kiv_recv_msg(queue, &message, sizeof message) > 0;
}

static std::string content(const std::string &file)
{
    std::ifstream in(file);
    return {std::istreambuf_iterator<char>(in), {}};
}

bool daemon_rig::open(const std::string &product, const char *disk_size)
{
    directory = testing::TempDir() + "kiv-attack-XXXXXX";
    if (mkdtemp(directory.data()) == nullptr)
        return false;
    if (disk_size != nullptr && mount("tmpfs", directory.c_str(), "tmpfs", 0, disk_size) != 0)
        return false;
    setenv("KIV_DEVICE_DIR", directory.c_str(), 1);
    setenv("KIV_LOG", "none", 1);
    standin_reload();
    if (standin_device_dir() < 0)
        return false;
    write("cfg/531", "1");
    write("cfg/6000", product);
    return kiv_init_msg("MSG_ID_DAEMON", &daemon_queue) >= 0 && kiv_init_msg("MSG_ID_MAIN", &main_queue) >= 0;
}

void daemon_rig::close()
{
    kill_daemon();
    ::close(daemon_queue);
    ::close(main_queue);
    umount2(directory.c_str(), MNT_DETACH);
    for (const char *file : {"", ".log", ".trace"})
        std::filesystem::remove_all(directory + file);
}

void daemon_rig::launch()
{
    const std::string log = directory + ".log";
    const std::string trace = directory + ".trace";
    pid = fork();
    if (pid != 0)
        return;
    prctl(PR_SET_PDEATHSIG, SIGKILL);
    setenv("KIV_FAULTS", "1", 1);
    setenv("KIV_LOG", log.c_str(), 1);
    setenv("KIV_TRACE", trace.c_str(), 1);
    if (freopen("/dev/null", "w", stdout) != nullptr)
        execl(KIV_DAEMON, KIV_DAEMON, nullptr);
    _exit(127);
}

void daemon_rig::kill_daemon() const
{
    if (pid > 0 && kill(pid, SIGKILL) == 0)
        waitpid(pid, nullptr, 0);
}

bool daemon_rig::wait_for_hello() const
{
    svc_msg message;
    return receive(daemon_queue, patience_ms, message);
}

bool daemon_rig::go() const
{
    daemon_record record = {};
    record.record_type = DAEMON_RECORD_START;
    return within_patience([&] { return kiv_send_msg("MSG_ID_LED", &record, sizeof record) == 0; });
}

bool daemon_rig::start()
{
    svc_msg old;
    while (receive(daemon_queue, 0, old) || receive(main_queue, 0, old)) {
    }
    launch();
    return wait_for_hello() && go();
}

bool daemon_rig::answers() const
{
    while (!next_reverser(main_queue, 0).empty()) {
    }
    return within_patience([&] {
        return notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_QUICKEN_ACK) &&
               next_reverser(main_queue, answer_ms) == "4104";
    });
}

void daemon_rig::write(const std::string &file, std::string_view text) const
{
    const std::string fresh = path(file) + "~";
    std::ofstream(fresh) << text;
    std::filesystem::rename(fresh, path(file));
}

std::string daemon_rig::log() const
{
    return content(directory + ".log");
}

std::string daemon_rig::trace() const
{
    return content(directory + ".trace");
}

bool daemon_rig::log_shows(const std::string &text) const
{
    return within_patience([&] { return log().find(text) != std::string::npos; });
}

bool daemon_rig::trace_shows(const std::string &text) const
{
    return within_patience([&] { return trace().find(text) != std::string::npos; });
}

bool notify(int module_id, uint32_t event, std::string_view text)
{
    svc_msg message = {};
    message.us_cmd = MSG_CMD_SERVICE_NOTIFY;
    message.us_dest_module_id = KIV_MODULE_LED;
    message.us_source_module_id = static_cast<uint16_t>(module_id);
    message.us_data_len = static_cast<uint16_t>(sizeof event + text.size() + 1);
    message.ul_event_mask = event;
    memcpy(message.p_data, text.data(), text.size());
    return kiv_msg_send(&message, message.us_data_len) == 0;
}

bool send_command(int cmd)
{
    svc_msg message = {};
    message.us_cmd = static_cast<uint16_t>(cmd);
    message.us_dest_module_id = KIV_MODULE_LED;
    return kiv_msg_send(&message, 0) == 0;
}

// Its other messages are registrations.
std::string next_reverser(int main_queue, int wait_ms)
{
    svc_msg message;
    while (receive(main_queue, wait_ms, message)) {
        if (message.us_cmd == MSG_CMD_SERVICE_NOTIFY)
            return message.p_data;
    }
    return "";
}
