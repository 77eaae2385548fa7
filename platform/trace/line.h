// One line of the trace as text, in a buffer of fixed size: nothing here allocates, opens, writes or locks. A line that
// outgrows its buffer is cut, its result never.
#pragma once

#include <cstddef>
#include <ctime>

// The exit status of a process whose trace lost a byte; the cause stands on its standard error.
enum { TRACE_LOST_STATUS = 74 };

struct trace_line {
    const char *call;
    size_t length;
    size_t limit; // arguments stop here, so that the result always finds room
    char text[8704];
};

void trace_begin(trace_line &line, const char *call); // call: kept by address until the line is written
__attribute__((format(printf, 2, 3))) void trace_add(trace_line &line, const char *format, ...);
void trace_text(trace_line &line, const char *text);                 // in quotes, with C escapes; null: the word null
void trace_text_of(trace_line &line, const char *text, size_t size); // at most size bytes
void trace_result(trace_line &line, int result);                     // ends the arguments of a call
void trace_close(trace_line &line);                                  // ends those of an event, which has no result

// What stands before the arguments, "SECONDS.MICROS THREAD CALL(". Returns the length; 96 bytes hold every head.
size_t trace_head(char *head, size_t size, const timespec &monotonic, const char *thread, const char *call);

// threads.cpp: how the trace names threads.

const char *trace_thread();         // the calling thread's name: "main", what trace_label gave it, or "t" and a number
void trace_label(const char *name); // names the calling thread, at most 11 characters, unless it is the main one
void trace_label_receiver();        // "receive" for the first thread beside the main one
