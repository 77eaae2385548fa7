#include "standin.h"

#include "kiv/socket.h"

#include <array>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <poll.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/un.h>
#include <unistd.h>

struct module_row {
    int module_id;
    const char *queue_name;
};

constexpr std::array module_rows = {
    module_row{KIV_MODULE_MAIN,   "MSG_ID_MAIN"  },
    module_row{KIV_MODULE_PPP,    "MSG_ID_PPP"   },
    module_row{KIV_MODULE_SMS,    "MSG_ID_SMS"   },
    module_row{KIV_MODULE_WLAN,   "MSG_ID_WLAN"  },
    module_row{KIV_MODULE_MDM,    "MSG_ID_MDM"   },
    module_row{KIV_MODULE_NWINFO, "MSG_ID_NWINFO"},
    module_row{KIV_MODULE_DST,    "MSG_ID_DST"   },
    module_row{KIV_MODULE_SLEEP,  "MSG_ID_SLEEP" },
    module_row{KIV_MODULE_LED,    "MSG_ID_LED"   },
    module_row{KIV_MODULE_VOICE,  "MSG_ID_VOICE" },
};

const char *standin_module_queue(int module_id)
{
    for (const module_row &row : module_rows) {
        if (row.module_id == module_id)
            return row.queue_name;
    }
    return nullptr;
}

// The lock is held by the open file until the process ends, also when it is killed.
static int take_lock(const char *file)
{
    char path[NAME_MAX + 32];
    char holder[16] = "";
    snprintf(path, sizeof path, "%s.lock", file);
    const int fd = openat(standin_device_dir(), path, O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600);
    if (fd < 0) {
        standin_error("%s: %s", path, strerror(errno));
        return -1;
    }
    if (flock(fd, LOCK_EX | LOCK_NB) != 0) {
        const ssize_t length = pread(fd, holder, sizeof holder - 1, 0);
        holder[length > 0 ? length : 0] = '\0';
        standin_error("%s is already held by process %.*s", file, static_cast<int>(strcspn(holder, "\n")), holder);
        close(fd);
        return -1;
    }
    const int length = snprintf(holder, sizeof holder, "%d\n", static_cast<int>(getpid()));
    if (ftruncate(fd, 0) != 0 || pwrite(fd, holder, static_cast<size_t>(length), 0) != length)
        standin_error("%s cannot be written: %s", path, strerror(errno));
    return fd;
}

static bool socket_address(const char *file, sockaddr_un &address)
{
    address.sun_family = AF_UNIX;
    return standin_device_path(file, address.sun_path, sizeof address.sun_path);
}

int standin_bind(const char *file)
{
    sockaddr_un address{};
    if (standin_device_dir() < 0)
        return -1;
    if (!socket_address(file, address)) {
        standin_error("%s: the name is too long for a socket", file);
        return -1;
    }
    const int lock = take_lock(file);
    if (lock < 0)
        return -1;
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    // Whoever bound the name before us is gone: we hold the lock.
    unlinkat(standin_device_dir(), file, 0);
    if (fd >= 0 && bind(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0)
        return fd;
    standin_error("%s cannot be bound: %s", file, strerror(errno));
    if (fd >= 0)
        close(fd);
    close(lock);
    return -1;
}

static long long monotonic_ms()
{
    timespec now{};
    clock_gettime(CLOCK_MONOTONIC, &now);
    return now.tv_sec * 1000LL + now.tv_nsec / 1000000;
}

// Other senders may take the room that poll has seen, so the wait goes on until the time is over.
static int send_within(int fd, const void *data, size_t length, int wait_ms)
{
    const long long until = wait_ms > 0 ? monotonic_ms() + wait_ms : 0;
    for (int left = wait_ms;;) {
        if (send(fd, data, length, MSG_DONTWAIT | MSG_NOSIGNAL) >= 0)
            return 0;
        const int failure = errno;
        if (failure == EINTR)
            continue;
        if (failure != EAGAIN || left <= 0)
            return -failure;
        pollfd room{fd, POLLOUT, 0};
        if (poll(&room, 1, left) < 0 && errno != EINTR)
            return -errno;
        left = static_cast<int>(until - monotonic_ms());
    }
}

int standin_send(const char *queue_name, const void *data, size_t length, int wait_ms)
{
    char file[NAME_MAX + 8];
    sockaddr_un address{};
    if (!standin_is_plain_name(queue_name))
        return -EINVAL;
    snprintf(file, sizeof file, "bus/%s", queue_name);
    if (!socket_address(file, address))
        return -ENAMETOOLONG;
    // A socket a message: only a connected one learns from poll that the queue has room again.
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (fd < 0)
        return -errno;
    int result = connect(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0 ? 0 : -errno;
    if (result == 0)
        result = send_within(fd, data, length, wait_ms);
    close(fd);
    return result;
}
