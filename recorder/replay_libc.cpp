// What only a replay has to stand in front of: where the daemon would block, it waits for its turn in the recording.
#include "replay.h"

#include "kiv/mem.h"

#include <cstring>
#include <semaphore.h>

bool takes_call(const void *caller)
{
    find_callers();
    return is_program(caller);
}

bool front_sleep(const char *call, unsigned amount)
{
    trace_line line;
    trace_begin(line, call);
    trace_add(line, "%u", amount);
    replay_take(line);
    replay_wait_for_turn();
    return false;
}

extern "C" {

int pthread_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *), void *argument) noexcept
{
    if (!takes_call(CALLER)) {
        return next().pthread_create(id, attributes, body, argument);
    }
    if (!replay_next_is("pthread_create")) {
        return replay_create(id, attributes, body, argument);
    }
    return front_call(
        "pthread_create", CALLER, no_arguments, [] { return 0; }, trace_result, nothing);
}

// The lock went to the thread whose calls come first in the recording.
int pthread_mutex_lock(pthread_mutex_t *mutex) noexcept
{
    if (takes_call(CALLER)) {
        replay_wait_for_turn();
    }
    return next().pthread_mutex_lock(mutex);
}

int sem_wait(sem_t *)
{
    replay_rest();
}

int pause()
{
    replay_rest();
}

int uloop_run_timeout(int)
{
    replay_serve_loop();
}

void uloop_run()
{
    replay_serve_loop();
}

void kiv_mem_set(void *dest, int value, size_t size)
{
    memset(dest, value, size);
}

void kiv_mem_cpy(void *dest, const void *src, size_t size)
{
    memcpy(dest, src, size);
}
}
