#include "kiv/tr181.h"

#include "standin.h"
#include "trace/calls.h"
#include "trace/tr181_parameters.h"

#include <cstdio>
#include <cstring>

static std::atomic<bool> is_connected{false};

// Object paths are letters, digits and dots; the path becomes a file name.
static bool copy_path(const char *record, char *path, size_t size)
{
    const size_t length = strnlen(record + KIV_TR181_PATH, KIV_TR181_PATH_SIZE);
    if (length == KIV_TR181_PATH_SIZE || length >= size) {
        return false;
    }
    memcpy(path, record + KIV_TR181_PATH, length);
    path[length] = '\0';
    const size_t good = strspn(path, "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789.");
    return good == length && standin_is_plain_name(path);
}

static int write_record(int table_id, const char *record)
{
    char path[KIV_TR181_PATH_SIZE + 1];
    char text[512];
    if (!is_connected || record == nullptr || !copy_path(record, path, sizeof path)) {
        return -1;
    }
    if (table_id != KIV_TR181_TBL_LEDS && table_id != KIV_TR181_TBL_LEDS_LED) {
        return -1;
    }
    int length = snprintf(text, sizeof text, "Instance: %d", tr181_int(record, KIV_TR181_INSTANCE));
    for (const tr181_parameter &row : tr181_parameters) {
        const auto at = static_cast<size_t>(length);
        if (row.table_id != table_id || !tr181_is_set(record, row)) {
            continue;
        }
        if (row.size == 0) {
            length += snprintf(text + at, sizeof text - at, "\n%s: %d", row.name, tr181_int(record, row.value_at));
        } else {
            length += snprintf(text + at, sizeof text - at, "\n%s: %.*s", row.name, static_cast<int>(row.size),
                               record + row.value_at);
        }
    }
    return standin_write_text("tr181", path, text, length);
}

static int connect_store()
{
    if (standin_device_dir() < 0) {
        return -1;
    }
    is_connected = true;
    return 0;
}

int libkiv_tr181_Init(void)
{
    return standin_call(__func__, no_arguments, connect_store);
}

int libkiv_tr181_set_tbl(int table_id, void *record, int arg3, int arg4)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_set_tbl(line, table_id, record, arg3, arg4); },
        [&] { return write_record(table_id, static_cast<const char *>(record)); });
}
