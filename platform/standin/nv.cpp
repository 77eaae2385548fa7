#include "kiv/nv.h"

#include "standin.h"

static int read_key(const char *key, char *buffer, int size)
{
    return standin_is_plain_name(key) && standin_read_text("nv", key, buffer, size) >= 0 ? 0 : -1;
}

static int write_key(const char *key, const char *value, int length)
{
    return standin_is_plain_name(key) ? standin_write_text("nv", key, value, length) : -1;
}

int kiv_nvconfig_read(const char *key, char *buffer, int size)
{
    if (standin_watched == 0)
        return read_key(key, buffer, size);
    trace_line line;
    int result = 0;
    trace_begin(line, "kiv_nvconfig_read");
    trace_text(line, key);
    trace_add(line, ", %d", size);
    if (trace_fault(line, &result))
        return result;
    result = read_key(key, buffer, size);
    trace_result(line, result);
    if (result == 0) {
        trace_add(line, ", ");
        trace_text(line, buffer);
    }
    trace_end(line);
    return result;
}

int kiv_nvconfig_write(const char *key, const char *value, int length)
{
    if (standin_watched == 0)
        return write_key(key, value, length);
    trace_line line;
    int result = 0;
    trace_begin(line, "kiv_nvconfig_write");
    trace_text(line, key);
    trace_add(line, ", ");
    trace_text_of(line, value, length > 0 ? static_cast<size_t>(length) : 0);
    trace_add(line, ", %d", length);
    if (trace_fault(line, &result))
        return result;
    result = write_key(key, value, length);
    trace_result(line, result);
    trace_end(line);
    return result;
}
