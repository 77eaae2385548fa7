#include "record.h"

#include <array>
#include <atomic>
#include <cerrno>
#include <climits>
#include <cstdio>
#include <cstring>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/uio.h>

namespace
{
constexpr size_t RECORD_MAX_DEFAULT = 4 * 1024 * 1024;
constexpr size_t RECORD_MAX_LEAST = 64 * 1024; // a line has up to 9 KiB
constexpr size_t PRODUCT_SIZE = 128;

pthread_mutex_t lock = PTHREAD_MUTEX_INITIALIZER; // the file, and all below it here
std::atomic<int> file{-1};                        // -1: nothing is recorded, or nothing any more
size_t file_size;
size_t file_max; // of one of the two files
std::array<char, PATH_MAX> path;
std::array<char, PATH_MAX> old_path;
std::array<char, PRODUCT_SIZE> product;

thread_local int depth [[gnu::tls_model("initial-exec")]]; // above 0 inside a library

void say(const char *what, int failure)
{
    char text[PATH_MAX + 128];
    const int length = snprintf(text, sizeof text, "libkivrecord: %s: %s: %s\n", path.data(), what, strerror(failure));
    [[maybe_unused]] const ssize_t written = write(STDERR_FILENO, text, static_cast<size_t>(length));
}

void give_up(const char *what, int failure)
{
    const int old = file.exchange(-1);
    if (old >= 0) {
        next().close(old);
        say(what, failure);
    }
}

// Whole lines only: the half of one that a killed process has left is taken off.
size_t size_of_whole_lines(int fd, off_t size)
{
    std::array<char, 4096> block;
    while (size > 0) {
        const off_t from = std::max<off_t>(0, size - static_cast<off_t>(block.size()));
        const ssize_t got = pread(fd, block.data(), static_cast<size_t>(size - from), from);
        if (got <= 0) {
            break;
        }
        for (off_t at = got; at-- > 0;) {
            if (block[static_cast<size_t>(at)] == '\n') {
                return static_cast<size_t>(from + at + 1);
            }
        }
        size = from;
    }
    return 0;
}

// Only a regular file: a pipe or a terminal could make the daemon wait.
int open_file(int flags)
{
    struct stat info = {};
    const int fd = next().open(path.data(), O_RDWR | O_CREAT | O_APPEND | O_CLOEXEC | O_NONBLOCK | flags, 0600);
    if (fd >= 0 && (fstat(fd, &info) != 0 || !S_ISREG(info.st_mode))) {
        next().close(fd);
        errno = EINVAL;
        return -1;
    }
    if (fd >= 0) {
        file_size = size_of_whole_lines(fd, info.st_size);
        if (ftruncate(fd, static_cast<off_t>(file_size)) != 0) {
            next().close(fd);
            return -1;
        }
    }
    return fd;
}

// One write a line. What could be written of a line that does not fit is taken off again, and the recording is over.
void put(const trace_line &line)
{
    char head[96];
    char newline[] = "\n";
    timespec now = {};
    clock_gettime(CLOCK_MONOTONIC, &now);
    const size_t length = trace_head(head, sizeof head, now, trace_thread(), line.call);
    iovec parts[] = {
        {head,                          length     },
        {const_cast<char *>(line.text), line.length},
        {newline,                       1          }
    };
    const size_t whole = length + line.length + 1;
    const ssize_t written = writev(file, parts, 3);
    if (written == static_cast<ssize_t>(whole)) {
        file_size += whole;
        return;
    }
    const int failure = written < 0 ? errno : ENOSPC;
    [[maybe_unused]] const int shortened = ftruncate(file, static_cast<off_t>(file_size));
    give_up("the recording ends", failure);
}

[[gnu::noinline]] void put_head(bool goes_on)
{
    trace_line line;
    trace_begin(line, goes_on ? "kiv_trace_goes_on" : "kiv_trace");
    if (goes_on) {
        trace_goes_on(line, product.data());
    } else {
        trace_start(line);
    }
    put(line);
}

// The older file goes, the newer one becomes the older, and says what it goes on with.
void change_files()
{
    const int old = file;
    const int fresh = rename(path.data(), old_path.data()) == 0 ? open_file(O_TRUNC) : -1;
    if (fresh < 0) {
        give_up("the recording ends", errno);
        return;
    }
    file = fresh;
    next().close(old);
    put_head(true);
}

size_t parse_size(const char *text)
{
    char *unit = nullptr;
    const unsigned long long number = text ? strtoull(text, &unit, 10) : 0;
    const int shift = !unit ? 0 : *unit == 'K' ? 10 : *unit == 'M' ? 20 : 0;
    const size_t size = number > (SIZE_MAX >> shift) ? SIZE_MAX : static_cast<size_t>(number) << shift;
    return text ? std::max(size, RECORD_MAX_LEAST) : RECORD_MAX_DEFAULT;
}

// A file that outgrows the process's limit would end the process.
size_t max_of_one_file()
{
    rlimit limit = {};
    size_t most = parse_size(getenv("KIV_RECORD_MAX")) / 2;
    if (getrlimit(RLIMIT_FSIZE, &limit) == 0 && limit.rlim_cur != RLIM_INFINITY) {
        most = std::min<size_t>(most, static_cast<size_t>(limit.rlim_cur));
    }
    return most;
}

// Everything that allocates happens here, before the daemon's first line. Children find no variable and record nothing.
__attribute__((constructor)) void begin_recording()
{
    const char *name = getenv("KIV_RECORD");
    find_callers();
    if (!name || !*name || !next().kiv_recv_msg) {
        return; // not asked for, or a program in front of the daemon, such as a shell
    }
    snprintf(path.data(), path.size(), "%s", name);
    snprintf(old_path.data(), old_path.size(), "%.*s.1", PATH_MAX - 3, name);
    file_max = max_of_one_file();
    const int fd = open_file(0);
    if (fd < 0) {
        say("nothing is recorded", errno);
    }
    unsetenv("KIV_RECORD");
    unsetenv("KIV_RECORD_MAX");
    file = fd;
    if (fd >= 0) {
        put_head(false);
    }
}
} // namespace

// Never built with a sanitizer, as the C library's front calls it.
__attribute__((no_sanitize("thread"))) bool takes_call(const void *caller)
{
    return file.load() >= 0 && depth == 0 && is_daemon(caller);
}

void record_enter()
{
    depth++;
}

void record_leave()
{
    depth--;
}

void record_write(const trace_line &line)
{
    constexpr size_t head_size = 96;
    pthread_mutex_lock(&lock);
    if (file >= 0 && file_size + head_size + line.length > file_max) {
        change_files();
    }
    if (file >= 0) {
        put(line);
    }
    pthread_mutex_unlock(&lock);
}

void keep_item(int item, const void *buffer, int size)
{
    if (item == KIV_CFG_PRODUCT_TYPE_ID && size > 0) {
        snprintf(product.data(), product.size(), "%.*s", size, static_cast<const char *>(buffer));
    }
}
