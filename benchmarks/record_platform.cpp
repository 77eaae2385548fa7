#include "record_platform.h"

#include "kiv/adabsp.h"
#include "kiv/cfg.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/log.h"
#include "kiv/mem.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "kiv/socket.h"
#include "kiv/tr181.h"
#include "null_nv.h"

#include <cstdarg>
#include <cstdio>
#include <cstdlib>
#include <cstring>

bool recording;
std::string recorded;

static void statement(const std::string &text)
{
    if (recording) {
        recorded += "    " + text + ";\n";
    }
}

static std::string number(long long value)
{
    return std::to_string(value);
}

static std::string quoted(const char *text)
{
    std::string out = "\"";
    for (const char *at = text; *at != '\0'; ++at) {
        char octal[8];
        const auto byte = static_cast<unsigned char>(*at);
        if (byte < 0x20 || byte > 0x7e || byte == '"' || byte == '\\') {
            std::snprintf(octal, sizeof octal, "\\%03o", byte);
            out += octal;
        } else {
            out += *at;
        }
    }
    return out + "\"";
}

static void unknown(const char *what)
{
    std::fprintf(stderr, "error: a call that cannot be recorded: %s\n", what);
    std::exit(EXIT_FAILURE);
}

static int not_recorded(const char *call)
{
    unknown(call);
    return -1;
}

void kiv_syslog_append(int level, const char *file, int line, int log_id, const char *format, ...)
{
    std::string call = "kiv_syslog_append(" + number(level) + ", " + quoted(file) + ", " + number(line) + ", " +
                       number(log_id) + ", " + quoted(format);
    va_list arguments;
    va_start(arguments, format);
    for (const char *at = std::strchr(format, '%'); at != nullptr; at = std::strchr(at + 1, '%')) {
        ++at;
        if (*at == 'd') {
            call += ", " + number(va_arg(arguments, int));
        } else if (*at == 's') {
            call += ", " + quoted(va_arg(arguments, const char *));
        } else {
            unknown(format);
        }
    }
    va_end(arguments);
    statement(call + ")");
}

int kiv_bsp_set_leds_sync(led_request request, int *result)
{
    statement("result = 0");
    statement("kiv_bsp_set_leds_sync({" + number(request.led_id) + ", " + number(request.led_operation) + ", " +
              number(request.brightness) + ", " + number(request.blink_time1) + ", " + number(request.blink_time2) +
              "}, &result)");
    *result = 0;
    return 0;
}

int kiv_nvconfig_read(const char *key, char *buffer, int size)
{
    statement("kiv_nvconfig_read(" + quoted(key) + ", text, " + number(size) + ")");
    return null_nv_read(key, buffer, size);
}

int kiv_nvconfig_write(const char *key, const char *value, int length)
{
    statement("kiv_nvconfig_write(" + quoted(key) + ", " + quoted(value) + ", " + number(length) + ")");
    return 0;
}

int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *result)
{
    statement("kiv_bsp_get_charger_connect_status_sync(&answer)");
    *result = {.ret = 0, .data = 1};
    return 0;
}

int kiv_bsp_get_battery_online_status_sync(bsp_query_result *result)
{
    statement("kiv_bsp_get_battery_online_status_sync(&answer)");
    *result = {.ret = 0, .data = 1};
    return 0;
}

int kiv_timer(void (*)(void *), void *, int period_ms, int repeat)
{
    statement("kiv_timer(callback, text, " + number(period_ms) + ", " + number(repeat) + ")");
    return 1;
}

int kiv_delete_timer(int handle)
{
    statement("kiv_delete_timer(" + number(handle) + ")");
    return 0;
}

int kiv_msg_send(const svc_msg *, int data_len)
{
    statement("kiv_msg_send(&answer_message, " + number(data_len) + ")");
    return 0;
}

int kiv_lib_led_relight_msg()
{
    statement("kiv_lib_led_relight_msg()");
    return 0;
}

// What no notification calls.
// clang-format off
void kiv_mem_set(void *, int, size_t) { unknown("kiv_mem_set"); }
void kiv_mem_cpy(void *, const void *, size_t) { unknown("kiv_mem_cpy"); }
int kiv_bsp_get_sensor_temp_sync(int, bsp_sensor_temp *) { return not_recorded("kiv_bsp_get_sensor_temp_sync"); }
int kiv_bsp_register_battery_online_ind(bsp_ind_callback) { return not_recorded("kiv_bsp_register_*"); }
int kiv_bsp_register_battery_offline_ind(bsp_ind_callback) { return not_recorded("kiv_bsp_register_*"); }
int kiv_bsp_register_charger_connect_ind(bsp_ind_callback) { return not_recorded("kiv_bsp_register_*"); }
int kiv_bsp_register_charger_disconnect_ind(bsp_ind_callback) { return not_recorded("kiv_bsp_register_*"); }
int kiv_cfg_get_item(int, void *, int) { return not_recorded("kiv_cfg_get_item"); }
int kiv_ipc_init(int, int) { return not_recorded("kiv_ipc_init"); }
int kiv_reg_table_init(int) { return not_recorded("kiv_reg_table_init"); }
int kiv_reg_proc(int, const uint32_t *) { return not_recorded("kiv_reg_proc"); }
int kiv_reg_func(int, int, const reg_masks *) { return not_recorded("kiv_reg_func"); }
int kiv_init_msg(const char *, int *) { return not_recorded("kiv_init_msg"); }
int kiv_send_msg(const char *, const void *, int) { return not_recorded("kiv_send_msg"); }
int kiv_recv_msg(int, void *, int) { return not_recorded("kiv_recv_msg"); }
int libkiv_tr181_Init() { return not_recorded("libkiv_tr181_Init"); }
int libkiv_tr181_set_tbl(int, void *, int, int) { return not_recorded("libkiv_tr181_set_tbl"); }
// clang-format on
