// What the stand-ins share: the device directory, the sockets in it, the trace and the faults. Private to them.
#pragma once

#include <atomic>
#include <cstddef>
#include <cstdint>

// device.cpp

enum { STANDIN_TEXT_MAX = 4096 }; // longest text stored under a key

// The device directory, made on first use. -1 when there is none that can be trusted.
int standin_device_dir();

// The address of a file in the device directory as a path of at most size bytes. False when it does not fit.
bool standin_device_path(const char *file, char *path, size_t size);

// One line on standard error; a line that repeats the last one is left out.
__attribute__((format(printf, 1, 2))) void standin_error(const char *format, ...);

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

// bus.cpp

enum { STANDIN_SEND_WAIT_MS = 2000 }; // how long a sender waits on a full queue

// Binds the datagram socket FILE, held by a lock on FILE.lock until the process ends. Returns the socket, or -1.
int standin_bind(const char *file);

// Sends one datagram to a queue. Returns 0 or a negative errno: -EAGAIN when it stayed full for wait_ms.
int standin_send(const char *queue_name, const void *data, size_t length, int wait_ms);

const char *standin_module_queue(int module_id); // null for a module without a queue

// trace.cpp

// Not 0 while calls are traced or can be made to fail. A stand-in looks here first and else just does its work.
extern std::atomic<int> standin_watched;

struct trace_line {
    const char *call;
    size_t length;
    size_t limit; // arguments stop here, so that the result always finds room
    char text[8704];
};

void trace_reload(); // reads KIV_TRACE and KIV_FAULTS

void trace_begin(trace_line &line, const char *call);
__attribute__((format(printf, 2, 3))) void trace_add(trace_line &line, const char *format, ...);
void trace_text(trace_line &line, const char *text);                          // in quotes, with C escapes
void trace_text_of(trace_line &line, const char *text, size_t size);          // at most size bytes
void trace_message(trace_line &line, const unsigned char *data, size_t size); // ", record ..." or ", cmd ..."
bool trace_fault(trace_line &line, int *result); // true: the call fails, its line is written
void trace_result(trace_line &line, int result);
void trace_end(trace_line &line); // writes the line

void trace_label(const char *name); // names the calling thread, unless it is the main one
void trace_label_receiver();        // "receive" for the first thread beside the main one

// Opens a file to append to; "-" is standard error. Returns -1 after a line on standard error.
int standin_open_sink(const char *variable, const char *path);

// faults.cpp

// Looks for a line in faults/CALL that matches the arguments. True: the call fails with *result.
bool standin_fault(const char *call, const char *arguments, int *result);
