// Reads and waits on sockets. A call that would block waits for the baton instead and is made when it cannot.
#include "baton.h"
#include "real.h"

#include <array>
#include <cerrno>
#include <sys/select.h>

namespace
{
bool would_block(int fd, int flags)
{
    return baton_held() && !(flags & MSG_DONTWAIT) && !(fcntl(fd, F_GETFL) & O_NONBLOCK);
}

int64_t deadline_after(int64_t ns)
{
    return ns < 0 ? FOREVER : virtual_monotonic_ns() + ns;
}

int64_t timeout_of(int fd, int option)
{
    timeval limit = {};
    socklen_t size = sizeof limit;
    if (getsockopt(fd, SOL_SOCKET, option, &limit, &size) != 0 || (limit.tv_sec == 0 && limit.tv_usec == 0)) {
        return -1;
    }
    return limit.tv_sec * NS_PER_SECOND + limit.tv_usec * int64_t{1000};
}

// False, with errno set, when the socket's own limit of time has passed.
bool await(int fd, short events, int limit_option)
{
    pollfd entry = {fd, events, 0};
    const int64_t deadline = deadline_after(timeout_of(fd, limit_option));
    if (baton_wait({.fds = &entry, .fd_count = 1, .deadline_ns = deadline}) != TIMED_OUT) {
        return true;
    }
    errno = EAGAIN;
    return false;
}

bool wait_for_input(int fd)
{
    return await(fd, POLLIN, SO_RCVTIMEO);
}

// Waits only when there is no room: most writes find some, and are no occasion for another thread.
bool wait_for_room(int fd)
{
    pollfd entry = {fd, POLLOUT, 0};
    return real().poll(&entry, 1, 0) != 0 || await(fd, POLLOUT, SO_SNDTIMEO);
}

// Another reader was faster.
bool refused(ssize_t result)
{
    return result < 0 && (errno == EAGAIN || errno == EWOULDBLOCK);
}

} // namespace

bool wait_before_read(int fd)
{
    pollfd entry = {fd, POLLIN, 0};
    return !baton_held() || real().poll(&entry, 1, 0) != 0 || !would_block(fd, 0) || wait_for_input(fd);
}

extern "C" {

ssize_t recv(int fd, void *buffer, size_t size, int flags)
{
    if (!would_block(fd, flags)) {
        return real().recv(fd, buffer, size, flags);
    }
    ssize_t result = -1;
    do {
        if (!wait_for_input(fd)) {
            return -1;
        }
        result = real().recv(fd, buffer, size, MSG_DONTWAIT | flags);
    } while (refused(result));
    return result;
}

ssize_t recvfrom(int fd, void *buffer, size_t size, int flags, sockaddr *from, socklen_t *from_size)
{
    if (!would_block(fd, flags)) {
        return real().recvfrom(fd, buffer, size, flags, from, from_size);
    }
    ssize_t result = -1;
    do {
        if (!wait_for_input(fd)) {
            return -1;
        }
        result = real().recvfrom(fd, buffer, size, MSG_DONTWAIT | flags, from, from_size);
    } while (refused(result));
    return result;
}

ssize_t recvmsg(int fd, msghdr *message, int flags)
{
    if (!would_block(fd, flags)) {
        return real().recvmsg(fd, message, flags);
    }
    ssize_t result = -1;
    do {
        if (!wait_for_input(fd)) {
            return -1;
        }
        result = real().recvmsg(fd, message, MSG_DONTWAIT | flags);
    } while (refused(result));
    return result;
}

ssize_t send(int fd, const void *data, size_t size, int flags)
{
    if (!would_block(fd, flags)) {
        return real().send(fd, data, size, flags);
    }
    ssize_t result = -1;
    do {
        if (!wait_for_room(fd)) {
            return -1;
        }
        result = real().send(fd, data, size, MSG_DONTWAIT | flags);
    } while (refused(result) && await(fd, POLLOUT, SO_SNDTIMEO));
    return result;
}

ssize_t sendto(int fd, const void *data, size_t size, int flags, const sockaddr *to, socklen_t to_size)
{
    if (!would_block(fd, flags)) {
        return real().sendto(fd, data, size, flags, to, to_size);
    }
    ssize_t result = -1;
    do {
        if (!wait_for_room(fd)) {
            return -1;
        }
        result = real().sendto(fd, data, size, MSG_DONTWAIT | flags, to, to_size);
    } while (refused(result) && await(fd, POLLOUT, SO_SNDTIMEO));
    return result;
}

ssize_t sendmsg(int fd, const msghdr *message, int flags)
{
    if (!would_block(fd, flags)) {
        return real().sendmsg(fd, message, flags);
    }
    ssize_t result = -1;
    do {
        if (!wait_for_room(fd)) {
            return -1;
        }
        result = real().sendmsg(fd, message, MSG_DONTWAIT | flags);
    } while (refused(result) && await(fd, POLLOUT, SO_SNDTIMEO));
    return result;
}

ssize_t write(int fd, const void *data, size_t size)
{
    if (baton_held() && would_block(fd, 0) && !wait_for_room(fd)) {
        return -1;
    }
    return real().write(fd, data, size);
}

int select(int count, fd_set *readable, fd_set *writable, fd_set *exceptional, timeval *timeout)
{
    if (!baton_held()) {
        return real().select(count, readable, writable, exceptional, timeout);
    }
    std::array<pollfd, FD_SETSIZE> fds;
    nfds_t used = 0;
    for (int fd = 0; fd < count && fd < FD_SETSIZE; fd++) {
        const int events = (readable && FD_ISSET(fd, readable) ? POLLIN : 0) |
                           (writable && FD_ISSET(fd, writable) ? POLLOUT : 0) |
                           (exceptional && FD_ISSET(fd, exceptional) ? POLLPRI : 0);
        if (events != 0) {
            fds[used++] = {fd, static_cast<short>(events), 0};
        }
    }
    const int64_t ns = timeout ? timeout->tv_sec * NS_PER_SECOND + timeout->tv_usec * int64_t{1000} : -1;
    if (ns != 0) {
        baton_wait({.fds = fds.data(), .fd_count = used, .deadline_ns = deadline_after(ns)});
    }
    timeval at_once = {};
    return real().select(count, readable, writable, exceptional, &at_once);
}

int poll(pollfd *fds, nfds_t count, int timeout_ms)
{
    if (!baton_held()) {
        return real().poll(fds, count, timeout_ms);
    }
    if (timeout_ms != 0) {
        baton_wait({.fds = fds, .fd_count = count, .deadline_ns = deadline_after(timeout_ms * int64_t{1'000'000})});
    }
    return real().poll(fds, count, 0);
}

int ppoll(pollfd *fds, nfds_t count, const timespec *timeout, const sigset_t *mask)
{
    if (!baton_held()) {
        return real().ppoll(fds, count, timeout, mask);
    }
    const int64_t ns = timeout ? timeout->tv_sec * NS_PER_SECOND + timeout->tv_nsec : -1;
    if (ns != 0) {
        baton_wait({.fds = fds, .fd_count = count, .deadline_ns = deadline_after(ns)});
    }
    return real().poll(fds, count, 0);
}

int epoll_wait(int epoll_fd, epoll_event *events, int max_events, int timeout_ms)
{
    if (!baton_held()) {
        return real().epoll_wait(epoll_fd, events, max_events, timeout_ms);
    }
    pollfd entry = {epoll_fd, POLLIN, 0};
    if (timeout_ms != 0) {
        baton_wait({.fds = &entry, .fd_count = 1, .deadline_ns = deadline_after(timeout_ms * int64_t{1'000'000})});
    }
    return real().epoll_wait(epoll_fd, events, max_events, 0);
}
}
