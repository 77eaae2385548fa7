// What stands in front of every call that the daemon makes of the ten libraries. The list of calls (calls.cpp) is built
// twice: in the recorder a call goes through to the device's own library and leaves its line in the trace, in the
// replay a recorded line answers it.
#pragma once

#include "kiv/adabsp.h"
#include "kiv/cfg.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/log.h"
#include "kiv/nv.h"
#include "kiv/tr181.h"
#include "trace/calls.h"

#include <cstdlib>
#include <ctime>
#include <dlfcn.h>
#include <fcntl.h>
#include <pthread.h>
#include <unistd.h>

#define KIV_NEXT_FUNCTIONS(X)                                                                                          \
    X(kiv_syslog_append)                                                                                               \
    X(kiv_init_msg)                                                                                                    \
    X(kiv_send_msg)                                                                                                    \
    X(kiv_recv_msg)                                                                                                    \
    X(kiv_msg_send)                                                                                                    \
    X(kiv_reg_table_init)                                                                                              \
    X(kiv_reg_proc)                                                                                                    \
    X(kiv_reg_func)                                                                                                    \
    X(kiv_nvconfig_read)                                                                                               \
    X(kiv_nvconfig_write)                                                                                              \
    X(kiv_cfg_get_item)                                                                                                \
    X(kiv_bsp_set_leds_sync)                                                                                           \
    X(kiv_bsp_get_charger_connect_status_sync)                                                                         \
    X(kiv_bsp_get_battery_online_status_sync)                                                                          \
    X(kiv_bsp_get_sensor_temp_sync)                                                                                    \
    X(kiv_bsp_register_battery_online_ind)                                                                             \
    X(kiv_bsp_register_battery_offline_ind)                                                                            \
    X(kiv_bsp_register_charger_connect_ind)                                                                            \
    X(kiv_bsp_register_charger_disconnect_ind)                                                                         \
    X(kiv_ipc_init)                                                                                                    \
    X(kiv_timer)                                                                                                       \
    X(kiv_delete_timer)                                                                                                \
    X(kiv_lib_led_relight_msg)                                                                                         \
    X(libkiv_tr181_Init)                                                                                               \
    X(libkiv_tr181_set_tbl)                                                                                            \
    X(time)                                                                                                            \
    X(sleep)                                                                                                           \
    X(usleep)                                                                                                          \
    X(open)                                                                                                            \
    X(read)                                                                                                            \
    X(close)                                                                                                           \
    X(system)                                                                                                          \
    X(pthread_create)                                                                                                  \
    X(pthread_self)                                                                                                    \
    X(pthread_mutex_lock)

// The functions of the next object in search order, the device's libraries and the C library. Those of the device are
// null in the replay.
struct next_functions {
// NOLINTNEXTLINE(bugprone-macro-parentheses): a name that is declared takes none
#define X(name) decltype(&::name) name;
    KIV_NEXT_FUNCTIONS(X)
#undef X
};
const next_functions &next(); // found at its first call; also before the constructors of this library

// Where the callers lie that the daemon consists of: the program, and for what it calls last in a function, which
// returns elsewhere, this library and the C library.
void find_callers();
bool is_program(const void *caller);
bool is_daemon(const void *caller);

#define CALLER __builtin_return_address(0)

// The recorded end of a line, behind ") = ": the result, and what the call handed out.
struct answer {
    long long result;
    const char *rest;
};

// They hand out what a call handed out when it was recorded, and leave alone what it left alone. Replay only.
void put_handle(const answer &told, int *handle);
void put_message(const answer &told, void *buffer, int size);
void put_text(const answer &told, void *buffer, int size);
void put_bytes(const answer &told, void *buffer, size_t size);
void put_item(const answer &told, int item, void *buffer, int size);
void put_query(const answer &told, bsp_query_result *result);
void put_temperature(const answer &told, bsp_sensor_temp *temp);
inline void nothing(const answer &) {}
inline void no_arguments(trace_line &) {}

// The daemon's callbacks, and what the device's libraries are given in their place.
using timer_callback = void (*)(void *);
enum ind_slot { BATTERY_ONLINE, BATTERY_OFFLINE, CHARGER_CONNECT, CHARGER_DISCONNECT, IND_SLOTS };
bsp_ind_callback keep_callback(ind_slot slot, bsp_ind_callback callback);
