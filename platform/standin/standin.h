// What the stand-ins share: the device directory, the sockets in it, the trace and the faults. Private to them.
#pragma once

#include "trace/line.h"

#include <atomic>
#include <cstddef>
#include <cstdint>
#include <sys/uio.h>

// device.cpp

enum { STANDIN_TEXT_MAX = 4096 }; // longest text stored under a key

// The device directory with its folders, made on first use. -1 when there is none that can be trusted.
int standin_device_dir();

// Opens FOLDER/NAME of the device directory, never through a symbolic link. Returns the descriptor, or -1 and errno,
// with a line on standard error when a link or a removed directory is to blame.
int standin_open(int device, const char *file, int flags);

// The address of a file in the device directory as a path of at most size bytes. False when it does not fit.
bool standin_device_path(const char *file, char *path, size_t size);

// A name that stays inside its folder: not empty, no '/', no leading '.', 255 characters at most.
bool standin_is_plain_name(const char *name);

// Reads FOLDER/NAME without its trailing newline: at most size - 1 characters and a terminator. Returns the length,
// or -1 with the buffer untouched.
int standin_read_text(const char *folder, const char *name, char *buffer, int size);

// Writes FOLDER/NAME and a newline, whole: a reader sees the old text or the new one. Returns 0, or -1.
int standin_write_text(const char *folder, const char *name, const char *text, int length);

// Reads up to count whitespace-separated decimal numbers. Returns how many there are, -1 when anything else is there.
int standin_parse_ints(const char *text, int *values, int count);

// Grows when the variables are read again; what a stand-in has derived from them is then stale.
extern std::atomic<unsigned> standin_generation;

// Reads the variables again; for tests, while no other thread is inside a stand-in.
void standin_reload();

// sink.cpp

// One line on standard error; a line that repeats the last one is left out.
__attribute__((format(printf, 1, 2))) void standin_error(const char *format, ...);
void standin_forget_error(); // the next line is new again

// Opens a file to append to; "-" is standard error. Returns -1 after a line on standard error.
int standin_open_sink(const char *variable, const char *path);

// Writes the parts whole, and changes them. Returns 0 or an errno; a broken pipe is EPIPE and no signal.
int standin_write(int fd, iovec *parts, int count);

// bus.cpp

enum { STANDIN_SEND_WAIT_MS = 2000 }; // how long a sender waits on a full queue

// Makes the queue FILE this process's, by a lock on FILE.lock that ends with the process. False, after a line on
// standard error, when it is another's.
bool standin_own(const char *file);

void standin_own_nothing(); // for tests, in a child process that stands for another one

// Owns the queue FILE and binds its datagram socket, once. Returns the socket, or -1.
int standin_bind(const char *file);

// Sends one datagram to a queue. Returns 0 or a negative errno: -EAGAIN when it stayed full for wait_ms.
int standin_send(const char *queue_name, const void *data, size_t length, int wait_ms);

const char *standin_module_queue(int module_id); // null for a module without a queue

// trace.cpp

// Not 0 while calls are traced or can be made to fail. A stand-in looks here first and else just does its work.
extern std::atomic<int> standin_watched;

void trace_reload(); // reads KIV_TRACE and KIV_FAULTS

bool trace_fault(trace_line &line, int *result); // true: the call fails, its line is written
void trace_end(trace_line &line);                // writes the line

// faults.cpp

// Looks for a line in faults/CALL that matches the arguments. True: the call fails with *result.
bool standin_fault(const char *call, const char *arguments, int *result);

// The frame of every call of the contract. A call that is made to fail is not carried out.

// The half that is seldom needed, apart, so that the line does not lie on the stack of the other.
template <typename Arguments, typename Work, typename Results>
[[gnu::noinline]] int standin_watched_call(const char *call, Arguments arguments, Work work, Results results)
{
    trace_line line;
    int result = 0;
    trace_begin(line, call);
    arguments(line);
    if (trace_fault(line, &result)) {
        return result;
    }
    result = work();
    results(line, result);
    trace_end(line);
    return result;
}

// arguments(line) writes the call's arguments, work() carries it out and returns its result, results(line, result)
// writes that and what the call handed out: the functions of trace/calls.h. Returns the result.
template <typename Arguments, typename Work, typename Results = void (*)(trace_line &, int)>
int standin_call(const char *call, Arguments arguments, Work work, Results results = trace_result)
{
    return standin_watched == 0 ? work() : standin_watched_call(call, arguments, work, results);
}

// An event: nothing that a caller asked for, so nothing that can be made to fail. write(line) writes it whole.
template <typename Write> void standin_event(const char *name, Write write)
{
    if (standin_watched != 0) {
        trace_line line;
        trace_begin(line, name);
        write(line);
        trace_end(line);
    }
}

inline void no_arguments(trace_line &) {}
