#include "libubox/uloop.h"

#include <atomic>
#include <cerrno>
#include <sys/epoll.h>
#include <sys/eventfd.h>
#include <unistd.h>

static std::atomic<int> poll_fd{-1};
static std::atomic<int> wake_fd{-1}; // readable once the loop shall end
static std::atomic<bool> ending{false};

static int watch(int fd, void *owner)
{
    epoll_event event{};
    event.events = EPOLLIN | EPOLLRDHUP;
    event.data.ptr = owner;
    return epoll_ctl(poll_fd, EPOLL_CTL_ADD, fd, &event);
}

static void handle(uloop_fd *sock, uint32_t happened)
{
    sock->eof = (happened & (EPOLLRDHUP | EPOLLHUP)) != 0;
    sock->error = (happened & EPOLLERR) != 0;
    // A closed peer stays readable for good: one last call, then the loop leaves it alone.
    if (sock->eof || sock->error)
        uloop_fd_delete(sock);
    if (sock->cb != nullptr)
        sock->cb(sock, (happened & EPOLLIN) != 0 ? ULOOP_READ : 0);
}

int uloop_init(void)
{
    if (poll_fd >= 0)
        return 0;
    poll_fd = epoll_create1(EPOLL_CLOEXEC);
    wake_fd = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (poll_fd < 0 || wake_fd < 0 || watch(wake_fd, nullptr) != 0) {
        uloop_done();
        return -1;
    }
    return 0;
}

int uloop_fd_add(uloop_fd *sock, unsigned int flags)
{
    if (sock->registered)
        return 0;
    if ((flags & ULOOP_READ) == 0) {
        errno = EINVAL;
        return -1;
    }
    sock->eof = false;
    sock->error = false;
    sock->flags = static_cast<uint8_t>(flags);
    // From the next line on the loop's thread may call back.
    sock->registered = true;
    if (watch(sock->fd, sock) == 0)
        return 0;
    sock->registered = false;
    return -1;
}

int uloop_fd_delete(uloop_fd *sock)
{
    if (!sock->registered)
        return 0;
    sock->registered = false;
    sock->flags = 0;
    return epoll_ctl(poll_fd, EPOLL_CTL_DEL, sock->fd, nullptr);
}

// One event a wait: a callback may delete any other descriptor and nothing stale is left to call.
int uloop_run_timeout(int timeout)
{
    while (!ending) {
        epoll_event event{};
        const int count = epoll_wait(poll_fd, &event, 1, timeout);
        if (count < 0 && errno != EINTR)
            return -1;
        if (count == 0)
            return 0;
        if (count == 1 && event.data.ptr != nullptr)
            handle(static_cast<uloop_fd *>(event.data.ptr), event.events);
    }
    ending = false;
    uint64_t wakes = 0;
    return read(wake_fd, &wakes, sizeof wakes) < 0 && errno != EAGAIN ? -1 : 0;
}

void uloop_end(void)
{
    const uint64_t one = 1;
    ending = true;
    if (write(wake_fd, &one, sizeof one) < 0)
        return; // not set up: the next run returns at once
}

void uloop_done(void)
{
    const int old_poll = poll_fd.exchange(-1);
    const int old_wake = wake_fd.exchange(-1);
    if (old_poll >= 0)
        close(old_poll);
    if (old_wake >= 0)
        close(old_wake);
    ending = false;
}
