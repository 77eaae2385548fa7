/* A small uloop, source-compatible with the part of libubox that the device's programs use, and C like it: a C++
 * program includes it through ubox/uloop.h. */
#ifndef LIBUBOX_ULOOP_H
#define LIBUBOX_ULOOP_H

#include <stdbool.h>
#include <stdint.h>

struct uloop_fd;

typedef void (*uloop_fd_handler)(struct uloop_fd *u, unsigned int events);

#define ULOOP_READ (1 << 0)

struct uloop_fd {
    uloop_fd_handler cb;
    int fd;
    bool eof;
    bool error;
    bool registered;
    uint8_t flags;
};

/* Any thread may add while another one runs the loop. A descriptor is deleted on the thread that runs the loop, or
 * while none does. */
int uloop_fd_add(struct uloop_fd *sock, unsigned int flags);
int uloop_fd_delete(struct uloop_fd *sock);

int uloop_init(void);
int uloop_run_timeout(int timeout);
static inline int uloop_run(void)
{
    return uloop_run_timeout(-1);
}
void uloop_end(void); /* any thread; the loop returns after the callback that runs */
void uloop_done(void);

#endif
