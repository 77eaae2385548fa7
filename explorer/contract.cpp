// The platform's contract, on the explorer's world.
#include "daemon.h"
#include "kiv/adabsp.h"
#include "kiv/cfg.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/log.h"
#include "kiv/mem.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "kiv/tr181.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>

indication_callback board_callback;

namespace
{
// Before anything is explored the table is filled, so a literal's address finds its key at once.
struct key_by_address {
    const char *address;
    uint8_t key;
};
std::array<key_by_address, 256> read_keys;

uint8_t key_of_nv(const char *name)
{
    const size_t hash = reinterpret_cast<uintptr_t>(name) * 0x9e3779b97f4a7c15U >> 56;
    for (size_t i = 0; i < read_keys.size(); i++) {
        key_by_address &row = read_keys[(hash + i) % read_keys.size()];
        if (row.address == name) {
            return row.key;
        }
        if (row.address == nullptr) {
            row = {name, key_number("nv/" + std::string(name))};
            return row.key;
        }
    }
    give_up("the daemon reads more NV keys than the world has room for");
}

// An LED of brightness 0 is dark, whatever it was asked to do.
uint8_t look_of(const led_request &request)
{
    if (request.led_operation == LED_OP_OFF || request.brightness == 0) {
        return 0;
    }
    const led_mode mode = request.led_operation == LED_OP_ON ? led_mode::ON : led_mode::BLINK;
    return look_number({mode, request.brightness, request.blink_time1, request.blink_time2});
}
} // namespace

bool is_registered(int module_id, uint32_t event)
{
    const std::string *masks = text_of("registered/" + std::to_string(module_id));
    const uint32_t second_word = 0x40000000;
    if (masks == nullptr) {
        return false;
    }
    uint32_t mask[2] = {};
    sscanf(masks->c_str(), "%x %x", &mask[0], &mask[1]);
    return (mask[(event & second_word) != 0 ? 1 : 0] & event & ~second_word) != 0;
}

// What the daemon ignores has a result that would hurt it if it looked.
void kiv_syslog_append(int, const char *, int, int, const char *, ...) {}

int kiv_init_msg(const char *, int *handle)
{
    *handle = 1;
    return 0;
}

int kiv_recv_msg(int, void *buffer, int)
{
    const daemon_record start = {
        .record_type = DAEMON_RECORD_START, .process_name = {}, .queue_name = {}, .reserved = 0};
    memcpy(buffer, &start, sizeof start);
    return sizeof start;
}

int kiv_reg_func(int source_module_id, int, const reg_masks *masks)
{
    char text[32];
    snprintf(text, sizeof text, "%x %x", masks->mask1, masks->mask2);
    const uint8_t key = key_number("registered/" + std::to_string(source_module_id));
    world.texts[key] = text_number(key, text);
    return 0;
}

int kiv_cfg_get_item(int item, void *buffer, int size)
{
    const std::string *text = text_of("cfg/" + std::to_string(item));
    if ((world.refused & REFUSED_CONFIGURATION) != 0 || (text == nullptr && item != KIV_CFG_9X15_LED_ID)) {
        return -1;
    }
    if (item == KIV_CFG_9X15_LED_ID) {
        *static_cast<uint8_t *>(buffer) = 1;
        return 0;
    }
    snprintf(static_cast<char *>(buffer), static_cast<size_t>(size), "%s", text->c_str());
    return 0;
}

int kiv_nvconfig_read(const char *key, char *buffer, int size)
{
    happened.last_nv_read = key_of_nv(key);
    const std::string *text = read_text(happened.last_nv_read);
    if (text == nullptr || (world.refused & REFUSED_NV_READS) != 0) {
        return -1;
    }
    const size_t length = std::min(text->size(), static_cast<size_t>(size) - 1);
    memcpy(buffer, text->data(), length);
    buffer[length] = '\0';
    return 0;
}

int kiv_nvconfig_write(const char *key, const char *value, int length)
{
    if ((world.refused & REFUSED_NV_WRITES) != 0) {
        happened.refused |= NIGHT_UNTOLD; // the daemon writes nothing else
        return -1;
    }
    happened.accepted |= NIGHT_UNTOLD;
    happened.refused &= ~unsigned{NIGHT_UNTOLD};
    const uint8_t number = key_of_nv(key);
    world.texts[number] = text_number(number, std::string(value, static_cast<size_t>(length)));
    return 0;
}

static unsigned refusal_of(int led)
{
    switch (led) {
    case LED_NET_RED:
    case LED_NET_BLUE:
    case LED_NET_WHITE:
        return NET_REFUSED;
    case LED_SIG_6:
        return SIG_6_REFUSED;
    case LED_SIG_BLUE:
        return SIG_BLUE_REFUSED;
    default:
        return 0;
    }
}

// As the board knows it.
static bool is_sane(const led_request &request)
{
    constexpr int HIGHEST_BRIGHTNESS = 4;
    return !led_name(request.led_id).empty() && request.brightness >= 0 && request.brightness <= HIGHEST_BRIGHTNESS;
}

int kiv_bsp_set_leds_sync(led_request request, int *result)
{
    happened.led_requests++;
    if ((world.refused & REFUSED_LEDS) != 0 || !is_sane(request)) {
        happened.refused |= refusal_of(request.led_id);
        *result = -1;
        return 0;
    }
    world.leds[static_cast<size_t>(request.led_id)] = look_of(request);
    happened.accepted |= refusal_of(request.led_id);
    happened.refused &= ~refusal_of(request.led_id);
    *result = 0;
    return 0;
}

static int answer(const char *path, bsp_query_result *result)
{
    const std::string *text = read_text(key_number(path));
    if (text == nullptr || (world.refused & REFUSED_SUPPLY) != 0) {
        return -1;
    }
    result->data = atoi(text->c_str());
    return 0;
}

// All seven sensors stand at the temperature of the first.
int kiv_bsp_get_sensor_temp_sync(int, bsp_sensor_temp *temp)
{
    static const uint8_t key = key_number("bsp/sensor_0");
    const std::string *text = read_text(key);
    if (text == nullptr || (world.refused & REFUSED_SENSORS) != 0) {
        return -1;
    }
    temp->temperature = atoi(text->c_str());
    return 0;
}

int kiv_lib_led_relight_msg(void)
{
    if ((world.refused & REFUSED_RELIGHT) != 0) {
        return -1;
    }
    happened.relights++;
    return 0;
}

static int keep_callback(indication_callback callback)
{
    board_callback = callback;
    return 0;
}

// clang-format off
int kiv_send_msg(const char *, const void *, int) { return 0; }
int kiv_msg_send(const svc_msg *, int) { return 0; }
void kiv_mem_set(void *dest, int value, size_t size) { memset(dest, value, size); }
void kiv_mem_cpy(void *dest, const void *src, size_t size) { memcpy(dest, src, size); }
int kiv_reg_table_init(int) { return 0; }
int kiv_reg_proc(int, const uint32_t *) { return 1; }
int kiv_ipc_init(int, int) { return 0; }
int libkiv_tr181_Init(void) { return 0; }
int libkiv_tr181_set_tbl(int, void *, int, int) { return 0; }
int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *to) { return answer("bsp/charger", to); }
int kiv_bsp_get_battery_online_status_sync(bsp_query_result *to) { return answer("bsp/battery", to); }
int kiv_bsp_register_battery_online_ind(bsp_ind_callback callback) { return keep_callback(callback); }
int kiv_bsp_register_battery_offline_ind(bsp_ind_callback callback) { return keep_callback(callback); }
int kiv_bsp_register_charger_connect_ind(bsp_ind_callback callback) { return keep_callback(callback); }
int kiv_bsp_register_charger_disconnect_ind(bsp_ind_callback callback) { return keep_callback(callback); }

// The C library as the sealed daemon calls it: no file, no shell, no thread and no time but the world's.
extern "C" {
int explorer_open(const char *, int, ...) { return -1; }
int explorer_open64(const char *, int, ...) { return -1; }
long explorer_read(int, void *, size_t) { return -1; }
long explorer_read_chk(int, void *, size_t, size_t) { return -1; }
int explorer_close(int) { return 0; }
int explorer_system(const char *) { return 0; }
unsigned explorer_sleep(unsigned) { return 0; }
int explorer_usleep(unsigned) { return 0; }
int explorer_pthread_create(void *, const void *, void *(*)(void *), void *) { return 0; }
int explorer_printf(const char *, ...) { return 0; }
int explorer_printf_chk(int, const char *, ...) { return 0; }
int explorer_puts(const char *) { return 0; }
long explorer_time(long *) { return world.hour * 3600; }
int uloop_run_timeout(int) { return 0; }
}
// clang-format on
