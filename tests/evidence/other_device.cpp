// A device that has nothing of the stand-ins: all ten libraries in one object, with settings, messages and timers of
// its own. It plays a short story by itself, a hundred times as fast as its timers say, and then as many messages as
// OTHER_DEVICE_FLOOD says.
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

#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <ctime>
#include <mutex>
#include <thread>
#include <unistd.h>

namespace
{
constexpr int HANDLE = 7;
constexpr int HASTE = 100;
constexpr useconds_t BETWEEN_MESSAGES_US = 20'000;

struct setting {
    const char *key;
    const char *value;
};
constexpr setting settings[] = {
    {"battery_exist",         "1"    },
    {"battery_value",         "55"   },
    {"network_type",          "LTE"  },
    {"night_mode_switch",     "1"    },
    {"night_mode_start_time", "00:00"},
    {"night_mode_end_time",   "00:00"},
    {"nitz_sync_flag",        "1"    },
};

struct story_message {
    uint16_t source;
    uint32_t event;
    const char *text;
};
constexpr story_message story[] = {
    {KIV_MODULE_MAIN,  REG_MC_EVENT_POWERON,    ""     },
    {KIV_MODULE_WLAN,  REG_WLAN_CURRENT_STATUS, "1"    },
    {KIV_MODULE_SMS,   REG_WMS_SMS_NEW_SMS,     ""     },
    {KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT,  "1\x01"},
    {KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT,  "0"    },
};
constexpr size_t STORY_LENGTH = sizeof story / sizeof story[0];

std::atomic<size_t> received;
std::atomic<int> timers;
std::mutex one_callback; // at a time

int take_start(void *buffer)
{
    daemon_record record = {};
    record.record_type = DAEMON_RECORD_START;
    memcpy(buffer, &record, sizeof record);
    return sizeof record;
}

// What stands behind the terminator is not zero, as with a sender that does not clear its buffer.
int take_message(const story_message &told, void *buffer)
{
    svc_msg message = {};
    message.us_cmd = MSG_CMD_SERVICE_NOTIFY;
    message.us_dest_module_id = KIV_MODULE_LED;
    message.us_source_module_id = told.source;
    message.ul_event_mask = told.event;
    memset(message.p_data, '#', sizeof message.p_data);
    memcpy(message.p_data, told.text, strlen(told.text) + 1);
    message.us_data_len = 64;
    memcpy(buffer, &message, 76);
    return 76;
}
} // namespace

extern "C" {
__attribute__((noreturn)) void uloop_run_timeout(int);

void kiv_syslog_append(int, const char *, int, int, const char *format, ...)
{
    char length[64] = "";
    kiv_nvconfig_read("log_level", length, sizeof length); // a library that uses another one
    time(nullptr);
    write(STDERR_FILENO, format, 0);
}

int kiv_init_msg(const char *, int *handle)
{
    *handle = HANDLE;
    return 0;
}

int kiv_send_msg(const char *, const void *, int)
{
    return 0;
}

int kiv_recv_msg(int, void *buffer, int)
{
    static const size_t flood = strtoul(getenv("OTHER_DEVICE_FLOOD"), nullptr, 10);
    const size_t at = received++;
    if (at == 0) {
        return take_start(buffer);
    }
    if (at <= STORY_LENGTH) {
        usleep(BETWEEN_MESSAGES_US);
        return take_message(story[at - 1], buffer);
    }
    if (at > STORY_LENGTH + flood) {
        for (;;) {
            pause();
        }
    }
    return take_message(story[3 + at % 2], buffer);
}

int kiv_msg_send(const svc_msg *message, int)
{
    return kiv_send_msg("MSG_ID_MAIN", message, 1);
}

int kiv_reg_table_init(int)
{
    return 0;
}

int kiv_reg_proc(int, const uint32_t *)
{
    return 1;
}

int kiv_reg_func(int, int, const reg_masks *)
{
    return 0;
}

int kiv_nvconfig_read(const char *key, char *buffer, int size)
{
    for (const setting &one : settings) {
        if (strcmp(one.key, key) == 0) {
            snprintf(buffer, static_cast<size_t>(size), "%s", one.value);
            return 0;
        }
    }
    return -1;
}

int kiv_nvconfig_write(const char *, const char *, int)
{
    return 0;
}

int kiv_cfg_get_item(int item, void *buffer, int size)
{
    if (item == KIV_CFG_9X15_LED_ID) {
        *static_cast<char *>(buffer) = 1;
        return 1;
    }
    return snprintf(static_cast<char *>(buffer), static_cast<size_t>(size), "DRIVER_UFI");
}

int kiv_bsp_set_leds_sync(led_request request, int *result)
{
    *result = request.led_id == LED_SMS_GREEN ? -19 : 0;
    return 0;
}

int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *)
{
    return -1;
}

int kiv_bsp_get_battery_online_status_sync(bsp_query_result *)
{
    return -1;
}

int kiv_bsp_get_sensor_temp_sync(int, bsp_sensor_temp *)
{
    return -1;
}

int kiv_bsp_register_battery_online_ind(bsp_ind_callback)
{
    return 0;
}

int kiv_bsp_register_battery_offline_ind(bsp_ind_callback)
{
    return 0;
}

int kiv_bsp_register_charger_connect_ind(bsp_ind_callback)
{
    return 0;
}

int kiv_bsp_register_charger_disconnect_ind(bsp_ind_callback)
{
    return 0;
}

int kiv_ipc_init(int, int)
{
    return 0;
}

int kiv_timer(void (*callback)(void *), void *argument, int period_ms, int repeat)
{
    std::thread([=] {
        do {
            std::this_thread::sleep_for(std::chrono::microseconds(period_ms * 1000 / HASTE));
            const std::lock_guard guard(one_callback);
            callback(argument);
        } while (repeat != 0);
    }).detach();
    return ++timers;
}

int kiv_delete_timer(int)
{
    return 0;
}

int kiv_lib_led_relight_msg()
{
    return 0;
}

int libkiv_tr181_Init()
{
    return 0;
}

int libkiv_tr181_set_tbl(int, void *, int, int)
{
    return 0;
}

void kiv_mem_set(void *dest, int value, size_t size)
{
    memset(dest, value, size);
}

void kiv_mem_cpy(void *dest, const void *src, size_t size)
{
    memcpy(dest, src, size);
}

void uloop_run_timeout(int)
{
    for (;;) {
        pause();
    }
}
}
