#include "libubox/uloop.h"

#include <errno.h>
#include <stdatomic.h>
#include <sys/epoll.h>
#include <sys/eventfd.h>
#include <unistd.h>

static atomic_int poll_fd = -1;
static atomic_int wake_fd = -1; /* readable once the loop shall end */
static atomic_bool ending;

static int watch(int fd, void *owner)
{
    struct epoll_event event = {.events = EPOLLIN | EPOLLRDHUP, .data.ptr = owner};
    return epoll_ctl(poll_fd, EPOLL_CTL_ADD, fd, &event);
}

static void handle(struct uloop_fd *sock, uint32_t happened)
{
    sock->eof = (happened & (EPOLLRDHUP | EPOLLHUP)) != 0;
    sock->error = (happened & EPOLLERR) != 0;
    /* A closed peer stays readable for good: one last call, then the loop leaves it alone. */
    if (sock->eof || sock->error) {
        uloop_fd_delete(sock);
    }
    if (sock->cb) {
        sock->cb(sock, (happened & EPOLLIN) != 0 ? ULOOP_READ : 0);
    }
}

int uloop_init(void)
{
    if (poll_fd >= 0) {
        return 0;
    }
    poll_fd = epoll_create1(EPOLL_CLOEXEC);
    wake_fd = eventfd(0, EFD_CLOEXEC | EFD_NONBLOCK);
    if (poll_fd < 0 || wake_fd < 0 || watch(wake_fd, NULL) != 0) {
        uloop_done();
        return -1;
    }
    return 0;
}

int uloop_fd_add(struct uloop_fd *sock, unsigned int flags)
{
    if (sock->registered) {
        return 0;
    }
    if ((flags & ULOOP_READ) == 0) {
        errno = EINVAL;
        return -1;
    }
    sock->eof = false;
    sock->error = false;
    sock->flags = (uint8_t)flags;
    /* From the next line on the loop's thread may call back. */
    sock->registered = true;
    if (watch(sock->fd, sock) == 0) {
        return 0;
    }
    sock->registered = false;
    return -1;
}

int uloop_fd_delete(struct uloop_fd *sock)
{
    if (!sock->registered) {
        return 0;
    }
    sock->registered = false;
    sock->flags = 0;
    return epoll_ctl(poll_fd, EPOLL_CTL_DEL, sock->fd, NULL);
}

/* One event a wait: a callback may delete any other descriptor and nothing stale is left to call. */
int uloop_run_timeout(int timeout)
{
    while (!ending) {
        struct epoll_event event = {0};
        const int count = epoll_wait(poll_fd, &event, 1, timeout);
        if (count < 0 && errno != EINTR) {
            return -1;
        }
        if (count == 0) {
            return 0;
        }
        if (count == 1 && event.data.ptr) {
            handle(event.data.ptr, event.events);
        }
    }
    ending = false;
    uint64_t wakes = 0;
    return read(wake_fd, &wakes, sizeof wakes) < 0 && errno != EAGAIN ? -1 : 0;
}

void uloop_end(void)
{
    const uint64_t one = 1;
    ending = true;
    if (write(wake_fd, &one, sizeof one) < 0) {
        return; /* not set up: the next run returns at once */
    }
}

void uloop_done(void)
{
    const int old_poll = atomic_exchange(&poll_fd, -1);
    const int old_wake = atomic_exchange(&wake_fd, -1);
    if (old_poll >= 0) {
        close(old_poll);
    }
    if (old_wake >= 0) {
        close(old_wake);
    }
    ending = false;
}
