// The replay's front: a call waits for its turn in the recording, is compared with the line, and is answered by it.
// Exactly one thread of the daemon runs at a time, and it runs until its next call.
#pragma once

#include "front.h"

#include <string>

constexpr bool REPLAYS = true;

bool takes_call(const void *caller); // the daemon's own

// Waits until the recording goes on with this thread's call. Ends the process when it goes on with something else.
// Returns what stands behind the arguments: ") = 0" and the rest.
const std::string &replay_take(const trace_line &line);

// Waits until the recording goes on with this thread, whatever it does then.
void replay_wait_for_turn();

// The recording's next line of this thread, when it is that call; null otherwise.
const std::string *replay_next_is(const char *call);

answer parse_answer(const std::string &tail);

template <typename Arguments, typename Work, typename Results, typename Answer>
auto front_call(const char *call, const void *, Arguments arguments, Work work, Results, Answer put)
{
    trace_line line;
    trace_begin(line, call);
    arguments(line);
    const answer told = parse_answer(replay_take(line));
    put(told);
    return static_cast<decltype(work())>(told.result);
}

bool front_sleep(const char *call, unsigned amount); // false: nothing waits in real time

int start_timer(timer_callback callback, void *argument, int period_ms, int repeat); // none runs here
void keep_timer(int handle, timer_callback callback, void *argument);
inline void forget_timer(int) {} // the recording says when it fires
inline void keep_item(int, const void *, int) {}

// Of the C library: the loop in which indications arrive never ends, and a thread is one of the replay's.
[[noreturn]] void replay_serve_loop();
int replay_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *), void *argument);
[[noreturn]] void replay_rest(); // the calling thread makes no more calls
