// The recorder's front: a call goes through to the device's own library and leaves its line in the recording.
#pragma once

#include "front.h"

constexpr bool REPLAYS = false;

// True when the call is to be written: the recording goes on, the caller is the daemon (a tail call returns into the C
// library, a callback into the recorder), and no library is making the call on behalf of another one.
bool takes_call(const void *caller);

// The calling thread is inside a library until the matching record_leave.
void record_enter();
void record_leave();

void record_write(const trace_line &line); // a whole line, in the order of time; any thread

template <typename Arguments, typename Work, typename Results, typename Answer>
[[gnu::noinline]] auto record_call(const char *call, Arguments arguments, Work work, Results results)
{
    trace_line line;
    trace_begin(line, call);
    arguments(line);
    record_enter();
    const auto result = work();
    record_leave();
    results(line, result);
    record_write(line);
    return result;
}

template <typename Arguments, typename Work, typename Results, typename Answer>
auto front_call(const char *call, const void *caller, Arguments arguments, Work work, Results results, Answer)
{
    return takes_call(caller) ? record_call<Arguments, Work, Results, Answer>(call, arguments, work, results) : work();
}

bool front_sleep(const char *call, unsigned amount); // written when it begins; true: the caller is to sleep

// The device's timer service calls the recorder, which writes the event and calls the daemon.
int start_timer(timer_callback callback, void *argument, int period_ms, int repeat);
void forget_timer(int handle);
inline void keep_timer(int, timer_callback, void *) {}

void keep_item(int item, const void *buffer, int size); // the product's text goes into every file
