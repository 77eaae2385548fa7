#include "standin.h"

#include <cerrno>
#include <csignal>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <mutex>
#include <pthread.h>
#include <sys/uio.h>
#include <unistd.h>

static std::mutex error_lock;
static char last_error[512];

// Returns the first of the parts that is not written yet, or null, with that part cut to what is left of it.
static iovec *skip_written(iovec *part, const iovec *end, size_t written)
{
    for (; part != end && written >= part->iov_len; part++) {
        written -= part->iov_len;
    }
    if (part == end) {
        return nullptr;
    }
    part->iov_base = static_cast<char *>(part->iov_base) + written;
    part->iov_len -= written;
    return part;
}

static int write_parts(int fd, iovec *parts, int count)
{
    const iovec *end = parts + count;
    while (parts != nullptr) {
        const ssize_t written = writev(fd, parts, static_cast<int>(end - parts));
        if (written < 0 && errno != EINTR) {
            return errno;
        }
        parts = skip_written(parts, end, written < 0 ? 0 : static_cast<size_t>(written));
    }
    return 0;
}

int standin_write(int fd, iovec *parts, int count)
{
    sigset_t broken_pipe;
    sigset_t before;
    sigset_t pending;
    const timespec at_once = {};
    sigemptyset(&broken_pipe);
    sigaddset(&broken_pipe, SIGPIPE);
    pthread_sigmask(SIG_BLOCK, &broken_pipe, &before);
    sigpending(&pending);
    const int result = write_parts(fd, parts, count);
    // Only a signal of our own making is taken back.
    if (result == EPIPE && sigismember(&pending, SIGPIPE) == 0) {
        sigtimedwait(&broken_pipe, nullptr, &at_once);
    }
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
    return result;
}

void standin_error(const char *format, ...)
{
    char text[sizeof last_error];
    const int prefix = snprintf(text, sizeof text, "platform: ");
    const auto at = static_cast<size_t>(prefix);
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text + at, sizeof text - at, format, arguments);
    va_end(arguments);

    const std::lock_guard guard(error_lock);
    if (strcmp(text, last_error) == 0) {
        return;
    }
    memcpy(last_error, text, sizeof text);
    char newline[] = "\n";
    iovec parts[] = {
        {text,    strlen(text)},
        {newline, 1           }
    };
    standin_write(STDERR_FILENO, parts, 2); // where it fails, there is nowhere left to say so
}

void standin_forget_error()
{
    const std::lock_guard guard(error_lock);
    last_error[0] = '\0';
}

int standin_open_sink(const char *variable, const char *path)
{
    if (strcmp(path, "-") == 0) {
        return STDERR_FILENO;
    }
    const int fd = open(path, O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
    if (fd < 0) {
        standin_error("%s=%s: %s", variable, path, strerror(errno));
    }
    return fd;
}
