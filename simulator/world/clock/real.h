// The functions that the clock stands in front of, as the next object in search order defines them: the sanitizer's
// runtime when the daemon is built with one, so that it still sees every lock and every thread.
#pragma once

#include "trace/line.h"

#include <fcntl.h>
#include <poll.h>
#include <pthread.h>
#include <sched.h>
#include <semaphore.h>
#include <stdio.h>
#include <sys/epoll.h>
#include <sys/select.h>
#include <sys/socket.h>
#include <sys/stat.h>
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
    X(open64)                                                                                                          \
    X(openat)                                                                                                          \
    X(openat64)                                                                                                        \
    X(fopen)                                                                                                           \
    X(fopen64)                                                                                                         \
    X(access)                                                                                                          \
    X(faccessat)                                                                                                       \
    X(stat)                                                                                                            \
    X(stat64)                                                                                                          \
    X(lstat)                                                                                                           \
    X(lstat64)                                                                                                         \
    X(fstatat)                                                                                                         \
    X(fstatat64)                                                                                                       \
    X(read)                                                                                                            \
    X(pthread_mutex_timedlock)                                                                                         \
    X(pthread_mutex_clocklock)                                                                                         \
    X(pthread_rwlock_rdlock)                                                                                           \
    X(pthread_rwlock_wrlock)                                                                                           \
    X(pthread_rwlock_tryrdlock)                                                                                        \
    X(pthread_rwlock_trywrlock)                                                                                        \
    X(pthread_rwlock_timedrdlock)                                                                                      \
    X(pthread_rwlock_timedwrlock)                                                                                      \
    X(pthread_rwlock_clockrdlock)                                                                                      \
    X(pthread_rwlock_clockwrlock)                                                                                      \
    X(pthread_rwlock_unlock)                                                                                           \
    X(pthread_once)                                                                                                    \
    X(syscall)                                                                                                         \
    X(timespec_get)                                                                                                    \
    X(send)                                                                                                            \
    X(sendto)                                                                                                          \
    X(sendmsg)                                                                                                         \
    X(write)                                                                                                           \
    X(select)

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

// The stand-ins' trace; absent when the device's own libraries run in their place.
void trace_begin(trace_line &line, const char *call) __attribute__((weak));
void trace_add(trace_line &line, const char *format, ...) __attribute__((weak));
void trace_text(trace_line &line, const char *text) __attribute__((weak));
void trace_close(trace_line &line) __attribute__((weak));
void trace_result(trace_line &line, int result) __attribute__((weak));
void trace_number_result(trace_line &line, long long result) __attribute__((weak));
void trace_bytes_result(trace_line &line, int result, const void *buffer) __attribute__((weak));
void trace_end(trace_line &line) __attribute__((weak));

// True when the call is the daemon's own and there is a trace to write it to.
bool is_traced(const void *caller);
