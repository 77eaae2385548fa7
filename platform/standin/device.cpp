#include "standin.h"

#include <array>
#include <cctype>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <mutex>
#include <sys/stat.h>
#include <sys/uio.h>
#include <unistd.h>

constexpr std::array folders = {"bus", "nv", "cfg", "leds", "bsp", "reg", "tr181", "faults"};

static std::mutex device_lock;
static std::atomic<int> device_fd{-1};
static char device_path[PATH_MAX]; // written once, under device_lock, before device_fd

std::atomic<unsigned> standin_generation{0};

static bool find_device_path(char *path, size_t size)
{
    const char *chosen = getenv("KIV_DEVICE_DIR");
    const char *runtime = getenv("XDG_RUNTIME_DIR");
    int length = -1;
    if (chosen != nullptr && chosen[0] != '\0') {
        length = snprintf(path, size, "%s", chosen);
    } else if (runtime != nullptr && runtime[0] == '/') {
        length = snprintf(path, size, "%s/kiv", runtime);
    } else if (geteuid() == 0) {
        length = snprintf(path, size, "/run/kiv");
    }
    if (length < 0) {
        standin_error("no device directory: set KIV_DEVICE_DIR");
    } else if (static_cast<size_t>(length) >= size) {
        standin_error("the path of the device directory is too long");
    }
    return length >= 0 && static_cast<size_t>(length) < size;
}

static void make_with_parents(char *path)
{
    for (char *slash = strchr(path + 1, '/'); slash != nullptr; slash = strchr(slash + 1, '/')) {
        *slash = '\0';
        mkdir(path, 0700);
        *slash = '/';
    }
    mkdir(path, 0700);
}

// The other programs of the device trust what lies in here, so nobody else may be able to put it there. Folder: one of
// the directory, or "" for itself.
static bool is_ours(int fd, const char *folder)
{
    char path[PATH_MAX + 16];
    struct stat info {
    };
    snprintf(path, sizeof path, "%s%s%s", device_path, folder[0] == '\0' ? "" : "/", folder);
    if (fd < 0 || fstat(fd, &info) != 0) {
        standin_error("device directory %s: %s", path, strerror(errno));
        return false;
    }
    if (info.st_uid != geteuid()) {
        standin_error("device directory %s is refused: it belongs to user %u", path,
                      static_cast<unsigned>(info.st_uid));
        return false;
    }
    if ((info.st_mode & (S_IWGRP | S_IWOTH)) != 0) {
        standin_error("device directory %s is refused: others can write to it (mode %04o)", path,
                      static_cast<unsigned>(info.st_mode & 07777));
        return false;
    }
    return true;
}

static bool folders_are_ours(int device)
{
    for (const char *folder : folders) {
        mkdirat(device, folder, 0700);
        const int fd = openat(device, folder, O_RDONLY | O_DIRECTORY | O_CLOEXEC | O_NOFOLLOW);
        const bool ours = is_ours(fd, folder);
        if (fd >= 0) {
            close(fd);
        }
        if (!ours) {
            return false;
        }
    }
    return true;
}

static int open_device_dir()
{
    if (!find_device_path(device_path, sizeof device_path)) {
        return -1;
    }
    make_with_parents(device_path);
    const int fd = open(device_path, O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (!is_ours(fd, "") || !folders_are_ours(fd)) {
        if (fd >= 0) {
            close(fd);
        }
        return -1;
    }
    return fd;
}

int standin_device_dir()
{
    const int fd = device_fd.load(std::memory_order_acquire);
    if (fd >= 0) {
        return fd;
    }
    const std::lock_guard guard(device_lock);
    if (device_fd < 0) {
        device_fd = open_device_dir();
    }
    return device_fd;
}

bool standin_device_path(const char *file, char *path, size_t size)
{
    const int fd = standin_device_dir();
    if (fd < 0) {
        return false;
    }
    int length = snprintf(path, size, "%s/%s", device_path, file);
    // A long or a relative path is reached through the open directory.
    if (length < 0 || static_cast<size_t>(length) >= size || device_path[0] != '/') {
        length = snprintf(path, size, "/proc/self/fd/%d/%s", fd, file);
    }
    return length > 0 && static_cast<size_t>(length) < size;
}

bool standin_is_plain_name(const char *name)
{
    if (name == nullptr || name[0] == '\0' || name[0] == '.') {
        return false;
    }
    const size_t length = strnlen(name, NAME_MAX + 1);
    return length <= NAME_MAX && memchr(name, '/', length) == nullptr;
}

int standin_open(int device, const char *file, int flags)
{
    struct stat info {
    };
    const int fd = openat(device, file, flags | O_CLOEXEC | O_NOFOLLOW, 0600);
    if (fd >= 0) {
        return fd;
    }
    const int failure = errno;
    if (failure == ELOOP) {
        standin_error("%s is refused: it is a symbolic link", file);
    } else if (failure == ENOENT && fstat(device, &info) == 0 && info.st_nlink == 0) {
        standin_error("device directory %s has been removed", device_path);
    }
    errno = failure;
    return -1;
}

static int read_some(int fd, char *buffer, int size)
{
    int length = 0;
    while (length < size) {
        const ssize_t got = read(fd, buffer + length, static_cast<size_t>(size - length));
        if (got < 0 && errno == EINTR) {
            continue;
        }
        if (got < 0) {
            return -1;
        }
        length += static_cast<int>(got);
        if (length < size) {
            break; // a file ends where it gives less than it is asked for
        }
    }
    return length;
}

int standin_read_text(const char *folder, const char *name, char *buffer, int size)
{
    char path[NAME_MAX + 32];
    const int device = standin_device_dir();
    if (device < 0 || size <= 0 || buffer == nullptr) {
        return -1;
    }
    snprintf(path, sizeof path, "%s/%s", folder, name);
    const int fd = standin_open(device, path, O_RDONLY | O_NONBLOCK);
    if (fd < 0) {
        return -1;
    }
    // One byte more than fits, where the terminator goes: it tells a newline at the end from a longer text.
    int length = read_some(fd, buffer, size);
    close(fd);
    if (length < 0) {
        return -1;
    }
    if (length == size || (length > 0 && buffer[length - 1] == '\n')) {
        length--;
    }
    buffer[length] = '\0';
    return length;
}

static bool write_whole(int fd, const char *text, int length)
{
    char newline[] = "\n";
    iovec parts[] = {
        {const_cast<char *>(text), static_cast<size_t>(length)},
        {newline,                  1                          }
    };
    return writev(fd, parts, 2) == length + 1;
}

int standin_write_text(const char *folder, const char *name, const char *text, int length)
{
    char path[NAME_MAX + 32];
    char fresh[64];
    const int device = standin_device_dir();
    if (device < 0 || text == nullptr || length < 0 || length > STANDIN_TEXT_MAX) {
        return -1;
    }
    snprintf(path, sizeof path, "%s/%s", folder, name);
    // The leading dot keeps it apart from every key; the thread id from every other writer.
    snprintf(fresh, sizeof fresh, "%s/.new-%d", folder, static_cast<int>(gettid()));
    const int fd = standin_open(device, fresh, O_WRONLY | O_CREAT | O_TRUNC);
    if (fd < 0) {
        return -1;
    }
    const bool written = write_whole(fd, text, length);
    if (close(fd) == 0 && written && renameat(device, fresh, device, path) == 0) {
        return 0;
    }
    unlinkat(device, fresh, 0);
    return -1;
}

int standin_parse_ints(const char *text, int *values, int count)
{
    int found = 0;
    for (const char *at = text;; found++) {
        while (isspace(static_cast<unsigned char>(*at)) != 0) {
            at++;
        }
        if (*at == '\0') {
            return found;
        }
        char *end = nullptr;
        errno = 0;
        const long value = strtol(at, &end, 10);
        if (end == at || errno != 0 || found == count || value < INT_MIN || value > INT_MAX) {
            return -1;
        }
        if (*end != '\0' && isspace(static_cast<unsigned char>(*end)) == 0) {
            return -1;
        }
        values[found] = static_cast<int>(value);
        at = end;
    }
}

void standin_reload()
{
    const std::lock_guard guard(device_lock);
    const int old = device_fd.exchange(-1);
    if (old >= 0) {
        close(old);
    }
    standin_forget_error();
    trace_reload();
    standin_generation++;
}
