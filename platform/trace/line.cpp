#include "trace/line.h"

#include <cstdarg>
#include <cstdint>
#include <cstdio>

enum { ARGUMENTS_LIMIT = 4352 }; // holds the longest message with every byte escaped

void trace_begin(trace_line &line, const char *call)
{
    line.call = call;
    line.length = 0;
    line.limit = ARGUMENTS_LIMIT;
    line.text[0] = '\0';
}

void trace_add(trace_line &line, const char *format, ...)
{
    va_list arguments;
    va_start(arguments, format);
    const int length = vsnprintf(line.text + line.length, line.limit - line.length, format, arguments);
    va_end(arguments);
    if (length > 0) {
        line.length += static_cast<size_t>(length);
    }
    if (line.length >= line.limit) {
        line.length = line.limit - 1;
    }
}

// The escape of one byte; every \x escape has two digits.
static const char *escape(unsigned char byte, char *room, size_t size)
{
    switch (byte) {
    case '\n':
        return "\\n";
    case '\r':
        return "\\r";
    case '\t':
        return "\\t";
    case '"':
        return "\\\"";
    case '\\':
        return "\\\\";
    default:
        room[0] = static_cast<char>(byte);
        room[1] = '\0';
        if (byte < 0x20 || byte >= 0x7f) {
            snprintf(room, size, "\\x%02x", byte);
        }
        return room;
    }
}

void trace_text_of(trace_line &line, const char *text, size_t size)
{
    if (text == nullptr) {
        trace_add(line, "null");
        return;
    }
    trace_add(line, "\"");
    for (size_t at = 0; at < size && text[at] != '\0' && line.length + 8 < line.limit; at++) {
        char room[8];
        const char *shown = escape(static_cast<unsigned char>(text[at]), room, sizeof room);
        while (*shown != '\0') {
            line.text[line.length++] = *shown++;
        }
    }
    trace_add(line, "\"");
}

void trace_text(trace_line &line, const char *text)
{
    trace_text_of(line, text, SIZE_MAX);
}

void trace_result(trace_line &line, int result)
{
    line.limit = sizeof line.text;
    trace_add(line, ") = %d", result);
}

void trace_close(trace_line &line)
{
    line.limit = sizeof line.text;
    trace_add(line, ")");
}

size_t trace_head(char *head, size_t size, const timespec &monotonic, const char *thread, const char *call)
{
    const int length = snprintf(head, size, "%lld.%06ld %s %s(", static_cast<long long>(monotonic.tv_sec),
                                monotonic.tv_nsec / 1000, thread, call);
    return length > 0 ? static_cast<size_t>(length) : 0;
}
