#include "device_run.h"

#include "kiv/reg.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <linux/sockios.h>
#include <sys/ioctl.h>
#include <sys/prctl.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <sys/wait.h>
#include <unistd.h>
#include <utility>

namespace fs = std::filesystem;

constexpr char IN_MEMORY[] = "/dev/shm"; // as on the device, where the files of LEDs reach no disk

constexpr std::array<std::pair<const char *, const char *>, 8> settings = {
    {{"cfg/531", "1"},
     {"cfg/6000", "DRIVER_UFI"},
     {"nv/network_type", "LTE"},
     {"nv/signalbar", "4"},
     {"nv/battery_charging", "0"},
     {"nv/battery_exist", "1"},
     {"nv/battery_value", "45"},
     {"nv/wifi_onoff_state", "1"}}
};

void give_up(const char *what)
{
    std::fprintf(stderr, "error: %s: %s\n", what, std::strerror(errno));
    std::exit(EXIT_FAILURE);
}

static std::string make_directory()
{
    std::string pattern = std::string(IN_MEMORY) + "/kiv-bench-XXXXXX";
    if (mkdtemp(pattern.data()) == nullptr) {
        give_up(pattern.c_str());
    }
    for (const char *folder : {"cfg", "nv"}) {
        fs::create_directory(pattern + "/" + folder);
    }
    for (const auto &[file, text] : settings) {
        std::ofstream(pattern + "/" + file) << text << '\n';
    }
    return pattern;
}

[[noreturn]] static void become_daemon()
{
    const std::string program = fs::read_symlink("/proc/self/exe").parent_path() / "kiv_mirta_led";

    prctl(PR_SET_PDEATHSIG, SIGKILL);
    const int nowhere = open("/dev/null", O_WRONLY | O_CLOEXEC);
    dup2(nowhere, STDOUT_FILENO);
    execl(program.c_str(), program.c_str(), nullptr);
    give_up(program.c_str());
}

// brightness: of a file that the payload's 0 or 1 is written into, as the LED's is; -1 for none.
[[noreturn]] static void only_receive(const char *queue_name, int brightness, int ready)
{
    svc_msg message;
    int queue = -1;

    prctl(PR_SET_PDEATHSIG, SIGKILL);
    if (kiv_init_msg(queue_name, &queue) < 0 || write(ready, "", 1) != 1) {
        give_up(queue_name);
    }
    for (;;) {
        recv(queue, &message, sizeof message, 0);
        if (brightness >= 0 && pwrite(brightness, message.p_data[0] == '1' ? "2\n" : "0\n", 2, 0) != 2) {
            give_up("the bare LED");
        }
    }
}

static pid_t start_receiver(const char *queue_name, int brightness)
{
    std::array<int, 2> ready;
    char byte;
    if (pipe2(ready.data(), O_CLOEXEC) != 0) {
        give_up("pipe");
    }
    const pid_t pid = fork();
    if (pid == 0) {
        only_receive(queue_name, brightness, ready[1]);
    }
    close(ready[1]);
    if (pid < 0 || read(ready[0], &byte, 1) != 1) {
        give_up(queue_name);
    }
    close(ready[0]);
    return pid;
}

void start_bare_led(device_run &device)
{
    const std::string path = device.dir + BARE_BRIGHTNESS;
    const int brightness = open(path.c_str(), O_RDWR | O_CREAT | O_CLOEXEC, 0600);
    if (brightness < 0 || write(brightness, "2\n", 2) != 2) {
        give_up(path.c_str());
    }
    device.bare_led = start_receiver(BARE_LED_QUEUE, brightness);
    close(brightness);
}

static int32_t receive_record(int queue)
{
    daemon_record record = {};
    if (kiv_recv_msg(queue, &record, sizeof record) != sizeof record) {
        give_up("the daemon's record");
    }
    return record.record_type;
}

// The system daemon's part of the start.
static pid_t start_daemon()
{
    int queue = -1;
    daemon_record start = {};
    if (kiv_init_msg("MSG_ID_DAEMON", &queue) < 0) {
        give_up("MSG_ID_DAEMON");
    }
    const pid_t pid = fork();
    if (pid == 0) {
        become_daemon();
    }
    start.record_type = DAEMON_RECORD_START;
    if (receive_record(queue) != DAEMON_RECORD_HELLO || kiv_send_msg(LED_QUEUE, &start, sizeof start) != 0 ||
        receive_record(queue) != DAEMON_RECORD_REG_COMPLETE) {
        give_up("the daemon does not start");
    }
    return pid;
}

device_run start_device()
{
    device_run device;

    device.dir = make_directory();
    setenv("KIV_DEVICE_DIR", device.dir.c_str(), 1);
    setenv("KIV_LOG", "none", 1);
    for (const char *variable : {"KIV_TRACE", "KIV_FAULTS", "KIV_LED_DIR", "KIV_LED_MAP"}) {
        unsetenv(variable);
    }
    device.bare = start_receiver(BARE_QUEUE, -1);
    device.daemon = start_daemon();

    const svc_msg power_on = notification(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON, "");
    kiv_send_msg(LED_QUEUE, &power_on, message_length(power_on));
    return device;
}

void end_device(device_run &device)
{
    for (const pid_t pid : {device.daemon, device.bare, device.bare_led}) {
        if (pid > 0) {
            kill(pid, SIGKILL);
            waitpid(pid, nullptr, 0);
        }
    }
    fs::remove_all(device.dir);
}

svc_msg notification(uint16_t module, uint32_t event, const char *payload)
{
    svc_msg message = {};

    message.us_cmd = MSG_CMD_SERVICE_NOTIFY;
    message.us_dest_module_id = KIV_MODULE_LED;
    message.us_source_module_id = module;
    message.us_data_len = static_cast<uint16_t>(sizeof message.ul_event_mask + std::strlen(payload) + 1);
    message.ul_event_mask = event;
    std::memcpy(message.p_data, payload, std::strlen(payload));
    return message;
}

int message_length(const svc_msg &message)
{
    return static_cast<int>(offsetof(svc_msg, ul_event_mask)) + message.us_data_len;
}

int connect_queue(const device_run &device, const char *queue_name)
{
    sockaddr_un address = {};
    address.sun_family = AF_UNIX;
    std::snprintf(address.sun_path, sizeof address.sun_path, "%s/bus/%s", device.dir.c_str(), queue_name);

    const int queue = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (queue < 0 || connect(queue, reinterpret_cast<const sockaddr *>(&address), sizeof address) != 0) {
        give_up(address.sun_path);
    }
    return queue;
}

void wait_until_taken(int queue)
{
    for (int waiting = 1; ioctl(queue, SIOCOUTQ, &waiting) == 0 && waiting > 0;) {
        usleep(20); // spinning would take a core from the reader
    }
}
