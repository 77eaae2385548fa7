// The functions that the clock stands in front of, as the next object in search order defines them: the sanitizer's
// runtime when the daemon is built with one, so that it still sees every lock and every thread.
#pragma once

#include <fcntl.h>
#include <poll.h>
#include <pthread.h>
#include <sched.h>
#include <semaphore.h>
#include <sys/epoll.h>
#include <sys/socket.h>
#include <sys/time.h>
#include <time.h>
#include <unistd.h>

#define KIV_REAL_FUNCTIONS(X)                                                                                          \
    X(pthread_create)                                                                                                  \
    X(pthread_join)                                                                                                    \
    X(pthread_self)                                                                                                    \
    X(pthread_mutex_lock)                                                                                              \
    X(pthread_mutex_trylock)                                                                                           \
    X(pthread_mutex_unlock)                                                                                            \
    X(pthread_cond_init)                                                                                               \
    X(pthread_cond_destroy)                                                                                            \
    X(pthread_cond_wait)                                                                                               \
    X(pthread_cond_timedwait)                                                                                          \
    X(pthread_cond_clockwait)                                                                                          \
    X(pthread_cond_signal)                                                                                             \
    X(pthread_cond_broadcast)                                                                                          \
    X(sem_wait)                                                                                                        \
    X(sem_timedwait)                                                                                                   \
    X(sem_trywait)                                                                                                     \
    X(sem_post)                                                                                                        \
    X(sched_yield)                                                                                                     \
    X(sleep)                                                                                                           \
    X(usleep)                                                                                                          \
    X(nanosleep)                                                                                                       \
    X(clock_nanosleep)                                                                                                 \
    X(pause)                                                                                                           \
    X(time)                                                                                                            \
    X(clock_gettime)                                                                                                   \
    X(recv)                                                                                                            \
    X(recvfrom)                                                                                                        \
    X(recvmsg)                                                                                                         \
    X(poll)                                                                                                            \
    X(ppoll)                                                                                                           \
    X(epoll_wait)                                                                                                      \
    X(open)                                                                                                            \
    X(openat)

struct real_functions {
// NOLINTNEXTLINE(bugprone-macro-parentheses): a name that is declared takes none
#define X(name) decltype(&::name) name;
    KIV_REAL_FUNCTIONS(X)
#undef X
    int (*gettimeofday)(struct timeval *, void *);
};

const real_functions &real();

// True when the address lies in the main program itself, not in one of its libraries.
bool in_main_program(const void *address);

// Adds a line to the daemon's trace, when there is one: call(arguments), and its result once it has one.
void trace_call(const char *call, const char *arguments);
void trace_call(const char *call, const char *quoted_argument, int result);
