#include "kiv/adabsp.h"

#include "indications.h"
#include "leds.h"
#include "standin.h"
#include "trace/calls.h"

#include <array>
#include <cstdio>
#include <cstring>

enum {
    BSP_IND_BATTERY_ONLINE = 1350,
    BSP_IND_BATTERY_OFFLINE = 1351,
    BSP_IND_CHARGER_CONNECT = 1356,
    BSP_IND_CHARGER_DISCONNECT = 1357,
};

int kiv_bsp_set_leds_sync(led_request request, int *result)
{
    const int code = standin_call(
        __func__, [&](trace_line &line) { trace_led_request(line, request); }, [&] { return leds_set(request); });
    if (result != nullptr) {
        *result = code;
    }
    return code == 0 ? 0 : -1;
}

static int query(const char *name, bsp_query_result *result)
{
    char text[32];
    int values[2] = {};
    if (result == nullptr || standin_read_text("bsp", name, text, sizeof text) < 0) {
        return -1;
    }
    switch (standin_parse_ints(text, values, 2)) {
    case 1:
        *result = {0, values[0]};
        return 0;
    case 2:
        *result = {values[0], values[1]};
        return 0;
    default:
        standin_error("bsp/%s: not \"DATA\" or \"RET DATA\"", name);
        return -1;
    }
}

static int query_call(const char *call, const char *name, bsp_query_result *answer)
{
    return standin_call(
        call, no_arguments, [&] { return query(name, answer); },
        [&](trace_line &line, int result) { trace_query_result(line, result, answer); });
}

int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *result)
{
    return query_call(__func__, "charger", result);
}

int kiv_bsp_get_battery_online_status_sync(bsp_query_result *result)
{
    return query_call(__func__, "battery", result);
}

static int read_sensor(int sensor_id, bsp_sensor_temp *temp)
{
    char name[16];
    char text[16];
    int value = 0;
    if (sensor_id < 0 || sensor_id >= BSP_SENSOR_COUNT || temp == nullptr) {
        return -1;
    }
    snprintf(name, sizeof name, "sensor_%d", sensor_id);
    if (standin_read_text("bsp", name, text, sizeof text) < 0) {
        return -1;
    }
    if (standin_parse_ints(text, &value, 1) != 1) {
        standin_error("bsp/%s: not a number", name);
        return -1;
    }
    *temp = {0, value};
    return 0;
}

int kiv_bsp_get_sensor_temp_sync(int sensor_id, bsp_sensor_temp *temp)
{
    return standin_call(
        __func__, [&](trace_line &line) { trace_int(line, sensor_id); }, [&] { return read_sensor(sensor_id, temp); },
        [&](trace_line &line, int result) { trace_sensor_result(line, result, temp); });
}

struct ind_row {
    int event_id;
    std::atomic<bsp_ind_callback> callback;
};

static std::array<ind_row, 4> ind_rows = {
    {
     {BSP_IND_BATTERY_ONLINE, nullptr},
     {BSP_IND_BATTERY_OFFLINE, nullptr},
     {BSP_IND_CHARGER_CONNECT, nullptr},
     {BSP_IND_CHARGER_DISCONNECT, nullptr},
     }
};

static int set_callback(int event_id, bsp_ind_callback callback)
{
    for (ind_row &row : ind_rows) {
        if (row.event_id == event_id && callback != nullptr) {
            row.callback = callback;
            return 0;
        }
    }
    return -1;
}

static int register_ind(const char *call, int event_id, bsp_ind_callback callback)
{
    return standin_call(call, no_arguments, [&] { return set_callback(event_id, callback); });
}

int kiv_bsp_register_battery_online_ind(bsp_ind_callback callback)
{
    return register_ind(__func__, BSP_IND_BATTERY_ONLINE, callback);
}

int kiv_bsp_register_battery_offline_ind(bsp_ind_callback callback)
{
    return register_ind(__func__, BSP_IND_BATTERY_OFFLINE, callback);
}

int kiv_bsp_register_charger_connect_ind(bsp_ind_callback callback)
{
    return register_ind(__func__, BSP_IND_CHARGER_CONNECT, callback);
}

int kiv_bsp_register_charger_disconnect_ind(bsp_ind_callback callback)
{
    return register_ind(__func__, BSP_IND_CHARGER_DISCONNECT, callback);
}

static bool is_own_row(int event_id)
{
    for (const ind_row &row : ind_rows) {
        if (row.event_id == event_id) {
            return true;
        }
    }
    return false;
}

static bool is_repeated(size_t index, bsp_ind_callback callback)
{
    for (size_t earlier = 0; earlier < index; earlier++) {
        if (ind_rows[earlier].callback == callback) {
            return true;
        }
    }
    return false;
}

// An indication without a registration of its own reaches everyone who registered for anything, once.
void bsp_deliver_ind(int event_id, bool has_record)
{
    std::array<int32_t, 16> record = {event_id};
    const bool for_all = !is_own_row(event_id);
    for (size_t index = 0; index < ind_rows.size(); index++) {
        const bsp_ind_callback callback = ind_rows[index].callback;
        if (callback == nullptr || (for_all ? is_repeated(index, callback) : ind_rows[index].event_id != event_id)) {
            continue;
        }
        callback(event_id, 0, has_record ? record.data() : nullptr);
    }
}
