#include "kiv/nv.h"

#include "standin.h"
#include "trace/calls.h"

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
    return standin_call(
        __func__, [&](trace_line &line) { trace_nv_read(line, key, size); },
        [&] { return read_key(key, buffer, size); },
        [&](trace_line &line, int result) { trace_text_result(line, result, buffer); });
}

int kiv_nvconfig_write(const char *key, const char *value, int length)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_nv_write(line, key, value, length); },
        [&] { return write_key(key, value, length); });
}
