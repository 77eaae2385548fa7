#include "world/bus.h"

#include "kiv/reg.h"
#include "trace/board_names.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

namespace
{
constexpr uint32_t SECOND_WORD = 0x40000000; // events of the second mask carry it
constexpr int MASKS = 4;

bool socket_address(const std::string &path, sockaddr_un &address, std::string &error)
{
    address = {};
    address.sun_family = AF_UNIX;
    if (path.size() >= sizeof address.sun_path) {
        error = path + " is too long for a socket; choose a shorter TMPDIR";
        return false;
    }
    memcpy(address.sun_path, path.c_str(), path.size() + 1);
    return true;
}

// Returns 0 or an errno.
int send_datagram(const std::string &path, const std::string &bytes, std::string &error)
{
    sockaddr_un address;
    if (!socket_address(path, address, error)) {
        return ENAMETOOLONG;
    }
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    const ssize_t sent = sendto(fd, bytes.data(), bytes.size(), MSG_DONTWAIT | MSG_NOSIGNAL,
                                reinterpret_cast<const sockaddr *>(&address), sizeof address);
    const int failure = sent >= 0 ? 0 : errno;
    if (fd >= 0) {
        close(fd);
    }
    if (failure == ENOENT || failure == ECONNREFUSED) {
        error = "nobody listens: the daemon has not been started, or does not want this";
    } else if (failure != 0) {
        error = path + ": " + strerror(failure);
    }
    return failure;
}

} // namespace

bool has_reader(const std::string &socket_path)
{
    sockaddr_un address;
    std::string error;
    if (!socket_address(socket_path, address, error)) {
        return false;
    }
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    const bool connected = connect(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0;
    if (fd >= 0) {
        close(fd);
    }
    return connected;
}

namespace
{
bool open_queue(bus &b, const std::string &name, int module_id, std::string &error)
{
    sockaddr_un address;
    const std::string path = b.device + "/bus/" + name;
    if (!socket_address(path, address, error)) {
        return false;
    }
    if (has_reader(path)) {
        return true;
    }
    unlink(path.c_str());
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (fd >= 0 && bind(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0) {
        b.queues.push_back({fd, module_id});
        return true;
    }
    error = path + ": " + strerror(errno);
    if (fd >= 0) {
        close(fd);
    }
    return false;
}

int send_now(bus &b, const std::string &bytes, std::string &error)
{
    const int failure = send_datagram(b.device + "/bus/MSG_ID_LED", bytes, error);
    b.in_queue += failure == 0;
    return failure;
}

bool has_room(const bus &b)
{
    return b.in_queue < KIV_QUEUE_DEPTH;
}

// A module may be asked more than once; it then tells what it was asked for last.
void note_registration(bus &b, const module_queue &queue, const svc_msg &message, size_t size)
{
    constexpr size_t masks_at = offsetof(svc_msg, ul_event_mask);
    std::vector<uint32_t> masks(MASKS);
    if (size < masks_at + MASKS * sizeof(uint32_t) || message.us_cmd != MSG_CMD_SERVICE_REG) {
        return;
    }
    memcpy(masks.data(), reinterpret_cast<const char *>(&message) + masks_at, MASKS * sizeof(uint32_t));
    b.registered[queue.module_id] = masks;
}
} // namespace

bool open_bus(bus &b, const std::string &device, std::string &error)
{
    b.device = device;
    mkdir((device + "/bus").c_str(), 0700);
    if (!open_queue(b, "MSG_ID_DAEMON", 0, error)) {
        return false;
    }
    for (const module_row &module : module_rows) {
        if (module.module_id != KIV_MODULE_LED && !open_queue(b, module.queue, module.module_id, error)) {
            return false;
        }
    }
    return true;
}

void close_bus(bus &b)
{
    for (const module_queue &queue : b.queues) {
        close(queue.fd);
    }
    b = {};
}

bool send_to_daemon(bus &b, const std::string &bytes, std::string &error)
{
    const int failure = b.pending.empty() && has_room(b) ? send_now(b, bytes, error) : EAGAIN;
    if (failure == EAGAIN) {
        b.pending.push_back(bytes);
    }
    return failure == 0 || failure == EAGAIN;
}

bool send_indication(const bus &b, const std::string &text, std::string &error)
{
    return send_datagram(b.device + "/bsp/ind", text, error) == 0;
}

void message_taken(bus &b)
{
    b.in_queue -= b.in_queue > 0;
}

void forget_queue(bus &b)
{
    b.pending.clear();
    b.in_queue = 0;
}

int deliver_pending(bus &b)
{
    int count = 0;
    std::string error;
    while (!b.pending.empty() && has_room(b) && send_now(b, b.pending.front(), error) == 0) {
        b.pending.pop_front();
        count++;
    }
    return count;
}

int drain(bus &b)
{
    int count = 0;
    svc_msg message;
    for (const module_queue &queue : b.queues) {
        ssize_t got = 0;
        while ((got = recv(queue.fd, &message, sizeof message, MSG_DONTWAIT)) >= 0) {
            note_registration(b, queue, message, static_cast<size_t>(got));
            count++;
        }
    }
    return count;
}

bool is_heard(const bus &b, int module_id, uint32_t event)
{
    const auto masks = b.registered.find(module_id);
    if (module_id == KIV_MODULE_SLEEP || b.registered_unseen) {
        return true;
    }
    return masks != b.registered.end() && (masks->second[event & SECOND_WORD ? 1 : 0] & event) == event;
}
