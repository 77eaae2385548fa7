#include "standin.h"

#include "trace/board_names.h"

#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <mutex>
#include <poll.h>
#include <sys/file.h>
#include <sys/socket.h>
#include <sys/stat.h>
#include <sys/un.h>
#include <unistd.h>

const char *standin_module_queue(int module_id)
{
    for (const module_row &row : module_rows) {
        if (row.module_id == module_id) {
            return row.queue;
        }
    }
    return nullptr;
}

// The queues of this process, by their lock files. A lock is held by the open file until the process ends, also when it
// is killed.
struct owned_queue {
    dev_t device;
    ino_t inode;
    bool is_bound;
};

static std::mutex owned_lock;
static std::array<owned_queue, 64> owned; // the last ones; under owned_lock
static size_t owned_count;

static owned_queue *find_owned(const struct stat &info)
{
    for (owned_queue &queue : owned) {
        if (queue.inode == info.st_ino && queue.device == info.st_dev && info.st_nlink > 0) {
            return &queue;
        }
    }
    return nullptr;
}

static void say_who_holds(int lock, const char *file)
{
    char holder[16] = "";
    const ssize_t length = pread(lock, holder, sizeof holder - 1, 0);
    holder[length > 0 ? length : 0] = '\0';
    standin_error("%s is already held by process %.*s", file, static_cast<int>(strcspn(holder, "\n")), holder);
}

static bool sign_lock(int lock)
{
    char holder[16];
    const int length = snprintf(holder, sizeof holder, "%d\n", static_cast<int>(getpid()));
    return ftruncate(lock, 0) == 0 && pwrite(lock, holder, static_cast<size_t>(length), 0) == length;
}

// Takes the lock of an opened lock file. True: its descriptor must stay open. False: it may be closed, the queue is
// ours already (*queue) or another process's (null).
static bool take_lock(int lock, const char *file, owned_queue **queue)
{
    struct stat info {
    };
    *queue = fstat(lock, &info) == 0 ? find_owned(info) : nullptr;
    if (*queue != nullptr) {
        return false;
    }
    if (flock(lock, LOCK_EX | LOCK_NB) != 0) {
        say_who_holds(lock, file);
        return false;
    }
    if (!sign_lock(lock)) {
        standin_error("%s.lock cannot be written: %s", file, strerror(errno));
    }
    *queue = &owned[owned_count++ % owned.size()];
    **queue = {info.st_dev, info.st_ino, false};
    return true;
}

// Null when another process owns the queue. Under owned_lock.
static owned_queue *own_queue(const char *file)
{
    char path[NAME_MAX + 32];
    owned_queue *queue = nullptr;
    snprintf(path, sizeof path, "%s.lock", file);
    const int lock = openat(standin_device_dir(), path, O_RDWR | O_CREAT | O_CLOEXEC | O_NOFOLLOW, 0600);
    if (lock < 0) {
        standin_error("%s: %s", path, strerror(errno));
        return nullptr;
    }
    if (!take_lock(lock, file, &queue)) {
        close(lock);
    }
    return queue;
}

bool standin_own(const char *file)
{
    if (standin_device_dir() < 0) {
        return false;
    }
    const std::lock_guard guard(owned_lock);
    return own_queue(file) != nullptr;
}

void standin_own_nothing()
{
    const std::lock_guard guard(owned_lock);
    owned = {};
}

static bool socket_address(const char *file, sockaddr_un &address)
{
    address.sun_family = AF_UNIX;
    return standin_device_path(file, address.sun_path, sizeof address.sun_path);
}

static int bind_socket(const char *file, const sockaddr_un &address)
{
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    // Whoever bound the name before us is gone: we hold the lock.
    unlinkat(standin_device_dir(), file, 0);
    if (fd >= 0 && bind(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0) {
        return fd;
    }
    standin_error("%s cannot be bound: %s", file, strerror(errno));
    if (fd >= 0) {
        close(fd);
    }
    return -1;
}

int standin_bind(const char *file)
{
    sockaddr_un address{};
    if (standin_device_dir() < 0) {
        return -1;
    }
    if (!socket_address(file, address)) {
        standin_error("%s: the name is too long for a socket", file);
        return -1;
    }
    const std::lock_guard guard(owned_lock);
    owned_queue *queue = own_queue(file);
    if (queue == nullptr) {
        return -1;
    }
    if (queue->is_bound) {
        standin_error("%s is already held by process %d", file, static_cast<int>(getpid()));
        return -1;
    }
    const int fd = bind_socket(file, address);
    queue->is_bound = fd >= 0;
    return fd;
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
        if (send(fd, data, length, MSG_DONTWAIT | MSG_NOSIGNAL) >= 0) {
            return 0;
        }
        const int failure = errno;
        if (failure == EINTR) {
            continue;
        }
        if (failure != EAGAIN || left <= 0) {
            return -failure;
        }
        pollfd room{fd, POLLOUT, 0};
        if (poll(&room, 1, left) < 0 && errno != EINTR) {
            return -errno;
        }
        left = static_cast<int>(until - monotonic_ms());
    }
}

int standin_send(const char *queue_name, const void *data, size_t length, int wait_ms)
{
    char file[NAME_MAX + 8];
    sockaddr_un address{};
    if (!standin_is_plain_name(queue_name)) {
        return -EINVAL;
    }
    snprintf(file, sizeof file, "bus/%s", queue_name);
    if (!socket_address(file, address)) {
        return -ENAMETOOLONG;
    }
    // A socket a message: only a connected one learns from poll that the queue has room again.
    const int fd = socket(AF_UNIX, SOCK_DGRAM | SOCK_CLOEXEC, 0);
    if (fd < 0) {
        return -errno;
    }
    int result = connect(fd, reinterpret_cast<const sockaddr *>(&address), sizeof address) == 0 ? 0 : -errno;
    if (result == 0) {
        result = send_within(fd, data, length, wait_ms);
    }
    close(fd);
    return result;
}
