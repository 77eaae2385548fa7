// Reads and waits on sockets. A call that would block waits for the baton instead and is made when it cannot.
#include "baton.h"
#include "real.h"

#include <cerrno>

namespace
{
bool would_block(int fd, int flags)
{
    return baton_held() && !(flags & MSG_DONTWAIT) && !(fcntl(fd, F_GETFL) & O_NONBLOCK);
}

void wait_for_input(int fd)
{
    pollfd entry = {fd, POLLIN, 0};
    baton_wait({.fds = &entry, .fd_count = 1});
}

// Another reader was faster.
bool refused(ssize_t result)
{
    return result < 0 && (errno == EAGAIN || errno == EWOULDBLOCK);
}

int64_t deadline_after(int64_t ns)
{
    return ns < 0 ? FOREVER : virtual_monotonic_ns() + ns;
}
} // namespace

extern "C" {

ssize_t recv(int fd, void *buffer, size_t size, int flags)
{
    if (!would_block(fd, flags))
        return real().recv(fd, buffer, size, flags);
    ssize_t result = -1;
    do {
        wait_for_input(fd);
        result = real().recv(fd, buffer, size, MSG_DONTWAIT | flags);
    } while (refused(result));
    return result;
}

ssize_t recvfrom(int fd, void *buffer, size_t size, int flags, sockaddr *from, socklen_t *from_size)
{
    if (!would_block(fd, flags))
        return real().recvfrom(fd, buffer, size, flags, from, from_size);
    ssize_t result = -1;
    do {
        wait_for_input(fd);
        result = real().recvfrom(fd, buffer, size, MSG_DONTWAIT | flags, from, from_size);
    } while (refused(result));
    return result;
}

ssize_t recvmsg(int fd, msghdr *message, int flags)
{
    if (!would_block(fd, flags))
        return real().recvmsg(fd, message, flags);
    ssize_t result = -1;
    do {
        wait_for_input(fd);
        result = real().recvmsg(fd, message, MSG_DONTWAIT | flags);
    } while (refused(result));
    return result;
}

int poll(pollfd *fds, nfds_t count, int timeout_ms)
{
    if (!baton_held())
        return real().poll(fds, count, timeout_ms);
    if (timeout_ms != 0)
        baton_wait({.fds = fds, .fd_count = count, .deadline_ns = deadline_after(timeout_ms * int64_t{1'000'000})});
    return real().poll(fds, count, 0);
}

int ppoll(pollfd *fds, nfds_t count, const timespec *timeout, const sigset_t *mask)
{
    if (!baton_held())
        return real().ppoll(fds, count, timeout, mask);
    const int64_t ns = timeout ? timeout->tv_sec * NS_PER_SECOND + timeout->tv_nsec : -1;
    if (ns != 0)
        baton_wait({.fds = fds, .fd_count = count, .deadline_ns = deadline_after(ns)});
    return real().poll(fds, count, 0);
}

int epoll_wait(int epoll_fd, epoll_event *events, int max_events, int timeout_ms)
{
    if (!baton_held())
        return real().epoll_wait(epoll_fd, events, max_events, timeout_ms);
    pollfd entry = {epoll_fd, POLLIN, 0};
    if (timeout_ms != 0)
        baton_wait({.fds = &entry, .fd_count = 1, .deadline_ns = deadline_after(timeout_ms * int64_t{1'000'000})});
    return real().epoll_wait(epoll_fd, events, max_events, 0);
}
}
