// What each platform call writes into its line of the trace: its arguments before the call, and after it its result
// with what the call handed out. A call without a function for its result uses trace_result. Arguments may be null and
// out of range: they are shown as far as they can be read.
#pragma once

#include "trace/line.h"

#include "kiv/adabsp.h"
#include "kiv/reg.h"
#include "kiv/socket.h"

#include <cstdint>

// The first line of a process: the trace's format, the program and its version.
enum { TRACE_FORMAT = 1 };
void trace_start(trace_line &line); // the whole event
// The first line of a file that goes on with a trace whose beginning is in an older one: the product's text as well.
void trace_goes_on(trace_line &line, const char *product); // the whole event

// libkivlog: an event, it ends with trace_close. A longer text is cut.
enum { TRACE_LOG_MAX = 1023 };
void trace_log(trace_line &line, int level, const char *file, int at_line, int log_id, const char *text);

// libkivsocket
void trace_init_msg(trace_line &line, const char *queue_name);
void trace_init_msg_result(trace_line &line, int result, const int *handle);
void trace_send_msg(trace_line &line, const char *queue_name, int length);
void trace_send_msg_result(trace_line &line, int result, const void *data, int length);
void trace_recv_msg(trace_line &line, int handle, int size);
void trace_recv_msg_result(trace_line &line, int result, const void *buffer);
void trace_msg_send(trace_line &line, const svc_msg *message, int data_len);

// libkivreg
void trace_reg_proc(trace_line &line, int source_module_id, const uint32_t *masks);
void trace_reg_func(trace_line &line, int source_module_id, int dest_module_id, const reg_masks *masks);

// libkivnv, libkivcfg
void trace_nv_read(trace_line &line, const char *key, int size);
void trace_nv_write(trace_line &line, const char *key, const char *value, int length);
void trace_text_result(trace_line &line, int result, const char *text); // of kiv_nvconfig_read
void trace_cfg_get(trace_line &line, int item, int size);
void trace_cfg_get_result(trace_line &line, int result, int item, const void *buffer, int size);

// libkivadabsp; the result of kiv_bsp_set_leds_sync is its result code
void trace_led_request(trace_line &line, const led_request &request);
void trace_query_result(trace_line &line, int result, const bsp_query_result *answer);
void trace_sensor_result(trace_line &line, int result, const bsp_sensor_temp *temp);
void trace_indication(trace_line &line, int event_id, bool has_record); // the whole event

// libkivipc
void trace_timer(trace_line &line, int period_ms, int repeat);
void trace_timer_fire(trace_line &line, int handle); // the whole event

// libkivtr181
void trace_set_tbl(trace_line &line, int table_id, const void *record, int arg3, int arg4);

// One number or two: kiv_reg_table_init, kiv_ipc_init, kiv_delete_timer, kiv_bsp_get_sensor_temp_sync
void trace_int(trace_line &line, int argument);
void trace_ints(trace_line &line, int first, int second);

// The C library, as far as the daemon observes the device through it. time, pthread_self: a number. open, of the
// kernel's LED folder only, and system: a text. read, from what open gave: two numbers, then the bytes.
// pthread_create is written when it fails. sleep and usleep are written when they begin, without a result.
void trace_number_result(trace_line &line, long long result);
void trace_bytes_result(trace_line &line, int result, const void *buffer);
