#include "kiv/tr181.h"

#include "standin.h"

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <string_view>

enum { LED_NAME_SIZE = 68, LED_TEXT_SIZE = 36, FLAG_SET = 1 };

// A parameter of a table: where its flag and its value stand. A size of 0 is an int32.
struct parameter {
    int table_id;
    const char *name;
    size_t flag_at;
    size_t value_at;
    size_t size;
};

constexpr std::array parameters = {
    parameter{KIV_TR181_TBL_LEDS,     "LEDNumberOfEntries", KIV_TR181_PARAM1_FLAG, KIV_TR181_PARAM1, 0            },
    parameter{KIV_TR181_TBL_LEDS_LED, "Name",               KIV_TR181_PARAM1_FLAG, KIV_TR181_PARAM1, LED_NAME_SIZE},
    parameter{KIV_TR181_TBL_LEDS_LED, "Status",             KIV_TR181_PARAM2_FLAG, KIV_TR181_PARAM2, LED_TEXT_SIZE},
    parameter{KIV_TR181_TBL_LEDS_LED, "Location",           KIV_TR181_PARAM3_FLAG, KIV_TR181_PARAM3, LED_TEXT_SIZE},
};

static std::atomic<bool> is_connected{false};

static int read_int(const char *record, size_t at)
{
    int32_t value = 0;
    memcpy(&value, record + at, sizeof value);
    return value;
}

static bool is_set(const char *record, const parameter &row)
{
    uint16_t flag = 0;
    memcpy(&flag, record + row.flag_at, sizeof flag);
    return flag == FLAG_SET;
}

// Object paths are letters, digits and dots; the path becomes a file name.
static bool copy_path(const char *record, char *path, size_t size)
{
    const size_t length = strnlen(record + KIV_TR181_PATH, KIV_TR181_PATH_SIZE);
    if (length == KIV_TR181_PATH_SIZE || length >= size)
        return false;
    memcpy(path, record + KIV_TR181_PATH, length);
    path[length] = '\0';
    const size_t good = strspn(path, "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789.");
    return good == length && standin_is_plain_name(path);
}

static int write_record(int table_id, const char *record)
{
    char path[KIV_TR181_PATH_SIZE + 1];
    char text[512];
    if (!is_connected || record == nullptr || !copy_path(record, path, sizeof path))
        return -1;
    if (table_id != KIV_TR181_TBL_LEDS && table_id != KIV_TR181_TBL_LEDS_LED)
        return -1;
    int length = snprintf(text, sizeof text, "Instance: %d", read_int(record, KIV_TR181_INSTANCE));
    for (const parameter &row : parameters) {
        const auto at = static_cast<size_t>(length);
        if (row.table_id != table_id || !is_set(record, row))
            continue;
        if (row.size == 0)
            length += snprintf(text + at, sizeof text - at, "\n%s: %d", row.name, read_int(record, row.value_at));
        else
            length += snprintf(text + at, sizeof text - at, "\n%s: %.*s", row.name, static_cast<int>(row.size),
                               record + row.value_at);
    }
    return standin_write_text("tr181", path, text, length);
}

static int connect_store()
{
    if (standin_device_dir() < 0)
        return -1;
    is_connected = true;
    return 0;
}

int libkiv_tr181_Init(void)
{
    if (standin_watched == 0)
        return connect_store();
    trace_line line;
    int result = 0;
    trace_begin(line, "libkiv_tr181_Init");
    if (trace_fault(line, &result))
        return result;
    result = connect_store();
    trace_result(line, result);
    trace_end(line);
    return result;
}

static void trace_record(trace_line &line, int table_id, const char *record)
{
    if (record == nullptr) {
        trace_add(line, "null");
        return;
    }
    trace_text_of(line, record + KIV_TR181_PATH, KIV_TR181_PATH_SIZE);
    for (const parameter &row : parameters) {
        if (row.table_id != table_id || !is_set(record, row))
            continue;
        trace_add(line, " %s ", row.name);
        if (row.size == 0)
            trace_add(line, "%d", read_int(record, row.value_at));
        else
            trace_text_of(line, record + row.value_at, row.size);
    }
}

int libkiv_tr181_set_tbl(int table_id, void *record, int arg3, int arg4)
{
    const char *bytes = static_cast<const char *>(record);
    if (standin_watched == 0)
        return write_record(table_id, bytes);
    trace_line line;
    int result = 0;
    trace_begin(line, "libkiv_tr181_set_tbl");
    trace_add(line, "%d, ", table_id);
    trace_record(line, table_id, bytes);
    trace_add(line, ", %d, %d", arg3, arg4);
    if (trace_fault(line, &result))
        return result;
    result = write_record(table_id, bytes);
    trace_result(line, result);
    trace_end(line);
    return result;
}
