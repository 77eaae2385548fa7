#include "bus.h"

#include "kiv/socket.h"
#include "names.h"

#include <array>
#include <cerrno>
#include <cstring>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

namespace
{
bool send_datagram(const std::string &path, const std::string &bytes, std::string &error)
{
    sockaddr_un address = {};
    address.sun_family = AF_UNIX;
    if (path.size() >= sizeof address.sun_path) {
        error = path + " is too long for a socket; choose a shorter TMPDIR";
        return false;
    }
    memcpy(address.sun_path, path.c_str(), path.size() + 1);
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    const ssize_t sent = sendto(fd, bytes.data(), bytes.size(), MSG_DONTWAIT | MSG_NOSIGNAL,
                                reinterpret_cast<const sockaddr *>(&address), sizeof address);
    const int failure = errno;
    if (fd >= 0)
        close(fd);
    if (sent >= 0)
        return true;
    if (failure == EAGAIN)
        error = "the queue is full: the daemon is busy until some time has passed (use 'after')";
    else if (failure == ENOENT || failure == ECONNREFUSED)
        error = "nobody listens: the daemon has not been started, or does not want this";
    else
        error = path + ": " + strerror(failure);
    return false;
}
} // namespace

bool open_bus(bus &b, const std::string &device, std::string &error)
{
    std::vector<std::string> names = {"MSG_ID_DAEMON"};
    b.device = device;
    for (const module_name &module : all_modules())
        names.emplace_back(module.queue);
    for (const std::string &name : names) {
        int handle = -1;
        if (kiv_init_msg(name.c_str(), &handle) < 0) {
            error = "the queue " + name + " cannot be opened in " + device;
            return false;
        }
        b.queues.push_back(handle);
    }
    return true;
}

void close_bus(bus &b)
{
    for (const int queue : b.queues)
        close(queue);
    b.queues.clear();
}

bool send_to_daemon(const bus &b, const std::string &bytes, std::string &error)
{
    return send_datagram(b.device + "/bus/MSG_ID_LED", bytes, error);
}

bool send_indication(const bus &b, const std::string &text, std::string &error)
{
    return send_datagram(b.device + "/bsp/ind", text, error);
}

int drain(const bus &b)
{
    int count = 0;
    std::array<char, KIV_SVC_MSG_SIZE> buffer;
    for (const int queue : b.queues) {
        while (recv(queue, buffer.data(), buffer.size(), MSG_DONTWAIT) >= 0)
            count++;
    }
    return count;
}
