// What waits in real time and is not worth a virtual one: a run that needs it ends at once, and says by which name.
#include "baton.h"

#include <cstdlib>
#include <cstring>
#include <dlfcn.h>
#include <unistd.h>

namespace
{
using any_function = long (*)(long, long, long, long, long, long);

[[noreturn]] void refuse(const char *name)
{
    char text[128] = "the clock of the simulator does not cover ";
    strncat(text, name, sizeof text - strlen(text) - 2);
    strcat(text, "\n");
    if (write(STDERR_FILENO, text, strlen(text)) < 0) {
        _exit(EXIT_FAILURE);
    }
    _exit(EXIT_FAILURE);
}
} // namespace

// In real time the call goes on to where it belongs.
// The headers declare most of these in their own way, so ours have a name of their own until they are linked.
#define KIV_REFUSED(name)                                                                                              \
    extern "C" long refused_##name(long, long, long, long, long, long) __asm__(#name);                                 \
    extern "C" long refused_##name(long a, long b, long c, long d, long e, long f)                                     \
    {                                                                                                                  \
        if (baton_held()) {                                                                                            \
            refuse(#name);                                                                                             \
        }                                                                                                              \
        return reinterpret_cast<any_function>(dlsym(RTLD_NEXT, #name))(a, b, c, d, e, f);                              \
    }

KIV_REFUSED(timerfd_create)
KIV_REFUSED(timer_create)
KIV_REFUSED(pselect)
KIV_REFUSED(epoll_pwait)
KIV_REFUSED(pthread_barrier_wait)
KIV_REFUSED(sem_clockwait)
KIV_REFUSED(sigwaitinfo)
KIV_REFUSED(thrd_sleep)
KIV_REFUSED(mtx_lock)
KIV_REFUSED(cnd_wait)
KIV_REFUSED(cnd_timedwait)
KIV_REFUSED(mq_receive)
KIV_REFUSED(mq_timedreceive)
KIV_REFUSED(msgrcv)
