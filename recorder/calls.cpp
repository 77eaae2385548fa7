// Every call of the contract: its arguments, the call itself, what it handed out, and how a recorded line hands that
// out.
#ifdef KIV_REPLAY
#include "replay.h"
#else
#include "record.h"
#endif

#include <cstdarg>
#include <cstdio>

namespace
{
enum { LOG_LINE_MAX = 4096 };

int simple_call(const char *call, const void *caller, auto arguments, auto work)
{
    return front_call(call, caller, arguments, work, trace_result, nothing);
}

int register_ind(const char *call, const void *caller, ind_slot slot, bsp_ind_callback callback, auto real)
{
    return front_call(
        call, caller, no_arguments, [&] { return real(keep_callback(slot, callback)); }, trace_result,
        [&](const answer &) { keep_callback(slot, callback); });
}

int query(const char *call, const void *caller, bsp_query_result *result, auto real)
{
    return front_call(
        call, caller, no_arguments, [&] { return real(result); },
        [&](trace_line &line, int returned) { trace_query_result(line, returned, result); },
        [&](const answer &told) { put_query(told, result); });
}
} // namespace

extern "C" {

void kiv_syslog_append(int level, const char *file, int at_line, int log_id, const char *format, ...)
{
    char text[LOG_LINE_MAX];
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    front_call(
        __func__, CALLER, [&](trace_line &line) { trace_log(line, level, file, at_line, log_id, text); },
        [&] {
            next().kiv_syslog_append(level, file, at_line, log_id, "%s", text);
            return 0;
        },
        [](trace_line &line, int) { trace_close(line); }, nothing);
}

int kiv_init_msg(const char *queue_name, int *handle)
{
    return front_call(
        __func__, CALLER, [&](trace_line &line) { trace_init_msg(line, queue_name); },
        [&] { return next().kiv_init_msg(queue_name, handle); },
        [&](trace_line &line, int result) { trace_init_msg_result(line, result, handle); },
        [&](const answer &told) { put_handle(told, handle); });
}

int kiv_send_msg(const char *queue_name, const void *data, int length)
{
    return front_call(
        __func__, CALLER, [&](trace_line &line) { trace_send_msg(line, queue_name, length); },
        [&] { return next().kiv_send_msg(queue_name, data, length); },
        [&](trace_line &line, int result) { trace_send_msg_result(line, result, data, length); }, nothing);
}

int kiv_recv_msg(int handle, void *buffer, int size)
{
    trace_label_receiver();
    return front_call(
        __func__, CALLER, [&](trace_line &line) { trace_recv_msg(line, handle, size); },
        [&] { return next().kiv_recv_msg(handle, buffer, size); },
        [&](trace_line &line, int result) { trace_recv_msg_result(line, result, buffer); },
        [&](const answer &told) { put_message(told, buffer, size); });
}

int kiv_msg_send(const svc_msg *message, int data_len)
{
    return simple_call(
        __func__, CALLER, [&](trace_line &line) { trace_msg_send(line, message, data_len); },
        [&] { return next().kiv_msg_send(message, data_len); });
}

int kiv_reg_table_init(int module_id)
{
    return simple_call(
        __func__, CALLER, [&](trace_line &line) { trace_int(line, module_id); },
        [&] { return next().kiv_reg_table_init(module_id); });
}

int kiv_reg_proc(int source_module_id, const uint32_t *masks)
{
    return simple_call(
        __func__, CALLER, [&](trace_line &line) { trace_reg_proc(line, source_module_id, masks); },
        [&] { return next().kiv_reg_proc(source_module_id, masks); });
}

int kiv_reg_func(int source_module_id, int dest_module_id, const reg_masks *masks)
{
    return simple_call(
        __func__, CALLER, [&](trace_line &line) { trace_reg_func(line, source_module_id, dest_module_id, masks); },
        [&] { return next().kiv_reg_func(source_module_id, dest_module_id, masks); });
}

int kiv_nvconfig_read(const char *key, char *buffer, int size)
{
    return front_call(
        __func__, CALLER, [&](trace_line &line) { trace_nv_read(line, key, size); },
        [&] { return next().kiv_nvconfig_read(key, buffer, size); },
        [&](trace_line &line, int result) { trace_text_result(line, result, buffer); },
        [&](const answer &told) { put_text(told, buffer, size); });
}

int kiv_nvconfig_write(const char *key, const char *value, int length)
{
    return simple_call(
        __func__, CALLER, [&](trace_line &line) { trace_nv_write(line, key, value, length); },
        [&] { return next().kiv_nvconfig_write(key, value, length); });
}

int kiv_cfg_get_item(int item, void *buffer, int size)
{
    return front_call(
        __func__, CALLER, [&](trace_line &line) { trace_cfg_get(line, item, size); },
        [&] { return next().kiv_cfg_get_item(item, buffer, size); },
        [&](trace_line &line, int result) {
            trace_cfg_get_result(line, result, item, buffer, size);
            keep_item(item, buffer, size);
        },
        [&](const answer &told) { put_item(told, item, buffer, size); });
}

int kiv_bsp_set_leds_sync(led_request request, int *result)
{
    int returned = 0;
    front_call(
        __func__, CALLER, [&](trace_line &line) { trace_led_request(line, request); },
        [&] {
            returned = next().kiv_bsp_set_leds_sync(request, result);
            return result ? *result : returned;
        },
        trace_result,
        [&](const answer &told) {
            returned = told.result == 0 ? 0 : -1;
            if (result) {
                *result = static_cast<int>(told.result);
            }
        });
    return returned;
}

int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *result)
{
    return query(__func__, CALLER, result, next().kiv_bsp_get_charger_connect_status_sync);
}

int kiv_bsp_get_battery_online_status_sync(bsp_query_result *result)
{
    return query(__func__, CALLER, result, next().kiv_bsp_get_battery_online_status_sync);
}

int kiv_bsp_get_sensor_temp_sync(int sensor_id, bsp_sensor_temp *temp)
{
    return front_call(
        __func__, CALLER, [&](trace_line &line) { trace_int(line, sensor_id); },
        [&] { return next().kiv_bsp_get_sensor_temp_sync(sensor_id, temp); },
        [&](trace_line &line, int result) { trace_sensor_result(line, result, temp); },
        [&](const answer &told) { put_temperature(told, temp); });
}

#define REGISTER_IND(name, slot)                                                                                       \
    int name(bsp_ind_callback callback)                                                                                \
    {                                                                                                                  \
        return register_ind(__func__, CALLER, slot, callback, next().name);                                            \
    }
REGISTER_IND(kiv_bsp_register_battery_online_ind, BATTERY_ONLINE)
REGISTER_IND(kiv_bsp_register_battery_offline_ind, BATTERY_OFFLINE)
REGISTER_IND(kiv_bsp_register_charger_connect_ind, CHARGER_CONNECT)
REGISTER_IND(kiv_bsp_register_charger_disconnect_ind, CHARGER_DISCONNECT)

int kiv_ipc_init(int log_id, int flag)
{
    return simple_call(
        __func__, CALLER, [&](trace_line &line) { trace_ints(line, log_id, flag); },
        [&] { return next().kiv_ipc_init(log_id, flag); });
}

int kiv_timer(timer_callback callback, void *argument, int period_ms, int repeat)
{
    return front_call(
        __func__, CALLER, [&](trace_line &line) { trace_timer(line, period_ms, repeat); },
        [&] { return start_timer(callback, argument, period_ms, repeat); }, trace_result,
        [&](const answer &told) { keep_timer(static_cast<int>(told.result), callback, argument); });
}

int kiv_delete_timer(int handle)
{
    return simple_call(
        __func__, CALLER, [&](trace_line &line) { trace_int(line, handle); },
        [&] {
            const int result = next().kiv_delete_timer(handle);
            forget_timer(handle);
            return result;
        });
}

int kiv_lib_led_relight_msg()
{
    return simple_call(__func__, CALLER, no_arguments, [&] { return next().kiv_lib_led_relight_msg(); });
}

int libkiv_tr181_Init()
{
    return simple_call(__func__, CALLER, no_arguments, [&] { return next().libkiv_tr181_Init(); });
}

int libkiv_tr181_set_tbl(int table_id, void *record, int arg3, int arg4)
{
    return simple_call(
        __func__, CALLER, [&](trace_line &line) { trace_set_tbl(line, table_id, record, arg3, arg4); },
        [&] { return next().libkiv_tr181_set_tbl(table_id, record, arg3, arg4); });
}
}
