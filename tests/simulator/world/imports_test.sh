#!/usr/bin/env bash
# Lists what the daemon and its libraries import that waits or tells the time, and fails on a function that the clock
# does not stand in front of: imports_test.sh CLOCK PROGRAM...
set -euo pipefail
clock=$1
shift

waits_or_tells_time='
accept accept4 alarm clock_gettime clock_nanosleep cnd_timedwait cnd_wait connect epoll_pwait epoll_pwait2 epoll_wait
fcntl flock fsync ftime gettimeofday lockf mq_receive mq_send mq_timedreceive mq_timedsend msgrcv msgsnd mtx_lock
mtx_timedlock nanosleep pause poll popen ppoll pselect pthread_barrier_wait pthread_cond_clockwait
pthread_cond_timedwait pthread_cond_wait pthread_create pthread_join pthread_mutex_clocklock pthread_mutex_lock
pthread_mutex_timedlock pthread_once pthread_rwlock_clockrdlock pthread_rwlock_clockwrlock pthread_rwlock_rdlock
pthread_rwlock_timedrdlock pthread_rwlock_timedwrlock pthread_rwlock_wrlock pthread_timedjoin_np read readv recv recvfrom
recvmmsg recvmsg sched_yield select sem_clockwait sem_timedwait sem_wait semop semtimedop send sendmmsg sendmsg sendto
setitimer sigsuspend sigtimedwait sigwait sigwaitinfo sleep splice syscall system thrd_sleep time timer_create
timer_settime timerfd_create timespec_get usleep wait wait3 wait4 waitid waitpid write writev'

# Each with what makes it so in this code.
declare -A harmless=(
    [connect]='of a datagram socket, which does not wait'
    [fcntl]='without F_SETLKW'
    [flock]='with LOCK_NB'
    [sigtimedwait]='with a time of zero'
    [waitpid]='of a child that has been told to end'
    [writev]='to a file or to standard error'
)

covered=$(nm -D --defined-only "$clock" | awk '{ print $3 }')
failed=0
for name in $(nm -D --undefined-only "$@" | awk '$1 == "U" { sub("@.*", "", $2); print $2 }' | sort -u); do
    grep -qwF -- "$name" <<<"$waits_or_tells_time" || continue
    if grep -qxF -- "$name" <<<"$covered"; then
        echo "$name: the clock's"
    elif [ -n "${harmless[$name]:-}" ]; then
        echo "$name: harmless, ${harmless[$name]}"
    else
        echo "$name: neither the clock's nor known to be harmless"
        failed=1
    fi
done
exit $failed
