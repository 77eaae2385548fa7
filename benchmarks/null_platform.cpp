#include "null_platform.h"

#include "kiv/adabsp.h"
#include "kiv/cfg.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/log.h"
#include "kiv/mem.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "kiv/tr181.h"
#include "null_nv.h"

#include <cstring>

static const svc_msg *fed_messages;
static const int *fed_lengths;
static size_t fed_count;
static size_t fed_at;

void null_platform_feed(const svc_msg *messages, const int *lengths, size_t count)
{
    fed_messages = messages;
    fed_lengths = lengths;
    fed_count = count;
    fed_at = 0;
}

int kiv_recv_msg(int, void *buffer, int)
{
    const int length = fed_lengths[fed_at];

    std::memcpy(buffer, &fed_messages[fed_at], static_cast<size_t>(length));
    fed_at = fed_at + 1 == fed_count ? 0 : fed_at + 1;
    return length;
}

void kiv_syslog_append(int, const char *, int, int, const char *, ...) {}

int kiv_bsp_set_leds_sync(led_request, int *result)
{
    *result = 0;
    return 0;
}

int kiv_nvconfig_read(const char *key, char *buffer, int size)
{
    return null_nv_read(key, buffer, size);
}

static int answer_yes(bsp_query_result *result)
{
    *result = {.ret = 0, .data = 1};
    return 0;
}

int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *result)
{
    return answer_yes(result);
}

int kiv_bsp_get_battery_online_status_sync(bsp_query_result *result)
{
    return answer_yes(result);
}

void kiv_mem_set(void *dest, int value, size_t size)
{
    std::memset(dest, value, size);
}

void kiv_mem_cpy(void *dest, const void *src, size_t size)
{
    std::memcpy(dest, src, size);
}

// clang-format off
int kiv_timer(void (*)(void *), void *, int, int) { return 1; }
int kiv_delete_timer(int) { return 0; }
int kiv_msg_send(const svc_msg *, int) { return 0; }
int kiv_nvconfig_write(const char *, const char *, int) { return 0; }
int kiv_lib_led_relight_msg() { return 0; }
int kiv_bsp_get_sensor_temp_sync(int, bsp_sensor_temp *) { return -1; }
int kiv_bsp_register_battery_online_ind(bsp_ind_callback) { return 0; }
int kiv_bsp_register_battery_offline_ind(bsp_ind_callback) { return 0; }
int kiv_bsp_register_charger_connect_ind(bsp_ind_callback) { return 0; }
int kiv_bsp_register_charger_disconnect_ind(bsp_ind_callback) { return 0; }
int kiv_cfg_get_item(int, void *, int) { return -1; }
int kiv_ipc_init(int, int) { return 0; }
int kiv_reg_table_init(int) { return 0; }
int kiv_reg_proc(int, const uint32_t *) { return 1; }
int kiv_reg_func(int, int, const reg_masks *) { return 0; }
int kiv_init_msg(const char *, int *) { return 0; }
int kiv_send_msg(const char *, const void *, int) { return 0; }
int libkiv_tr181_Init() { return 0; }
int libkiv_tr181_set_tbl(int, void *, int, int) { return 0; }
// clang-format on
