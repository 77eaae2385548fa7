#include "world.h"

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
#include <string>
#include <vector>

world_state world;
world_record happened;
device_clock timing;
indication_callback board_callback;

namespace
{
struct text_key {
    std::string path;
    std::vector<std::string> texts; // the first has number 1
};

constexpr int HANDLE_BASE = 0x4c454400; // no other word of the daemon looks like this

std::vector<text_key> keys;
std::vector<led_look> looks;
std::vector<timer_kind> kinds;

[[noreturn]] void give_up(const std::string &why)
{
    fprintf(stderr, "kiv_led_explore: %s\n", why.c_str());
    abort();
}

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

uint8_t look_number(const led_look &look)
{
    for (size_t i = 0; i < looks.size(); i++) {
        if (looks[i] == look) {
            return static_cast<uint8_t>(i);
        }
    }
    if (looks.size() == 256) {
        give_up("more than 256 looks of an LED");
    }
    looks.push_back(look);
    return static_cast<uint8_t>(looks.size() - 1);
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

// Night mode and the temperature alarm have a timer of the same period; each has just read its own settings.
uint8_t last_read;

timer_purpose purpose_of(int period_ms)
{
    switch (period_ms) {
    case 10000:
        return timer_purpose::NEW_MESSAGE;
    case 5000:
        return timer_purpose::LIMIT_CHECK;
    case 1000:
        return timer_purpose::REMINDER;
    case 20000:
        return keys[last_read].path == "nv/thermal_led_enable" ? timer_purpose::TEMPERATURE : timer_purpose::NIGHT;
    default:
        give_up("a timer of " + std::to_string(period_ms) + " ms, which no property knows");
    }
}

size_t kind_of(void (*procedure)(void *), void *argument, int period_ms, bool repeats)
{
    for (size_t kind = 0; kind < kinds.size(); kind++) {
        if (kinds[kind].procedure == procedure && kinds[kind].argument == argument) {
            return kind;
        }
    }
    if (kinds.size() == TIMER_KINDS) {
        give_up("more kinds of timers than the world has room for");
    }
    kinds.push_back({procedure, argument, period_ms, repeats, purpose_of(period_ms)});
    return kinds.size() - 1;
}

int handle_of(size_t kind, size_t instance)
{
    return HANDLE_BASE + static_cast<int>(kind * 16 + instance);
}

bool runs(size_t kind, size_t instance)
{
    return (world.timers[kind] >> instance & 1) != 0;
}
} // namespace

void open_world()
{
    looks = {led_look{}};
    world = {};
}

uint8_t key_number(std::string_view path)
{
    for (size_t key = 0; key < keys.size(); key++) {
        if (keys[key].path == path) {
            return static_cast<uint8_t>(key);
        }
    }
    if (keys.size() == TEXT_KEYS) {
        give_up("more keys than the world has room for: " + std::string(path));
    }
    keys.push_back({std::string(path), {}});
    return static_cast<uint8_t>(keys.size() - 1);
}

uint8_t text_number(uint8_t key, const std::optional<std::string> &text)
{
    if (!text) {
        return 0;
    }
    std::vector<std::string> &texts = keys[key].texts;
    for (size_t i = 0; i < texts.size(); i++) {
        if (texts[i] == *text) {
            return static_cast<uint8_t>(i + 1);
        }
    }
    if (texts.size() == 255) {
        give_up("more than 255 texts of " + keys[key].path);
    }
    texts.push_back(*text);
    return static_cast<uint8_t>(texts.size());
}

static const std::string *text_at(uint8_t key)
{
    const uint8_t text = world.texts[key];
    return text == 0 ? nullptr : &keys[key].texts[text - 1U];
}

const std::string *text_of(std::string_view path)
{
    return text_at(key_number(path));
}

const led_look &look_at(uint8_t index)
{
    return looks[index];
}

std::span<const timer_kind> known_timers()
{
    return kinds;
}

bool fire_instance(size_t kind, size_t instance)
{
    if (!runs(kind, instance)) {
        return false;
    }
    const timer_kind &timer = kinds[kind];
    if (!timer.repeats) {
        world.timers[kind] = static_cast<uint8_t>(world.timers[kind] & ~(1U << instance));
    }
    timing.due_ms[kind][instance] += timer.period_ms;
    timer.procedure(timer.argument);
    deliver_relights();
    return true;
}

bool fire_timer(size_t kind)
{
    return fire_instance(kind, 0) || fire_instance(kind, 1);
}

bool fire_timer_of(timer_purpose purpose)
{
    for (size_t kind = 0; kind < kinds.size(); kind++) {
        if (kinds[kind].purpose == purpose) {
            return fire_timer(kind);
        }
    }
    return false;
}

bool handle_is_kept(size_t kind, size_t instance)
{
    return daemon_holds(handle_of(kind, instance));
}

unsigned running_of(size_t kind)
{
    return static_cast<unsigned>(__builtin_popcount(world.timers[kind]));
}

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

// The contract. What the daemon ignores has a result that would hurt it if it looked.
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
    if (item == KIV_CFG_9X15_LED_ID) {
        *static_cast<uint8_t *>(buffer) = 1;
        return 0;
    }
    if (text == nullptr) {
        return -1;
    }
    snprintf(static_cast<char *>(buffer), static_cast<size_t>(size), "%s", text->c_str());
    return 0;
}

int kiv_nvconfig_read(const char *key, char *buffer, int size)
{
    last_read = key_of_nv(key);
    const std::string *text = text_at(last_read);
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
    const uint8_t number = key_of_nv(key);
    world.texts[number] = text_number(number, std::string(value, static_cast<size_t>(length)));
    return 0;
}

// A number is given out again only when the daemon has forgotten it, so that a stale handle never stops another timer.
int kiv_timer(void (*callback)(void *), void *argument, int period_ms, int repeat)
{
    const size_t kind = kind_of(callback, argument, period_ms, repeat != 0);
    if ((world.refused & REFUSED_TIMERS) != 0 || running_of(kind) == TIMERS_OF_A_KIND) {
        return 0;
    }
    size_t instance = runs(kind, 0) ? 1 : 0;
    if (handle_is_kept(kind, instance) && !runs(kind, 1)) {
        instance = 1;
    }
    world.timers[kind] = static_cast<uint8_t>(world.timers[kind] | 1U << instance);
    timing.due_ms[kind][instance] = timing.now_ms + period_ms;
    return handle_of(kind, instance);
}

int kiv_delete_timer(int handle)
{
    const int number = handle - HANDLE_BASE;
    if (number >= 0 && number < static_cast<int>(TIMER_KINDS) * 16) {
        const size_t kind = static_cast<size_t>(number) / 16;
        world.timers[kind] = static_cast<uint8_t>(world.timers[kind] & ~(1U << number % 16));
    }
    return 0;
}

int kiv_bsp_set_leds_sync(led_request request, int *result)
{
    happened.led_requests++;
    if ((world.refused & REFUSED_LEDS) != 0) {
        *result = -1;
        return 0;
    }
    if (request.led_id < 0 || request.led_id >= LED_ID_COUNT) {
        give_up("a request for LED " + std::to_string(request.led_id));
    }
    world.leds[static_cast<size_t>(request.led_id)] = look_of(request);
    *result = 0;
    return 0;
}

static int answer(const char *path, uint8_t refused, bsp_query_result *result)
{
    const std::string *text = text_of(path);
    if (text == nullptr || (world.refused & refused) != 0) {
        return -1;
    }
    result->data = atoi(text->c_str());
    return 0;
}

// All seven sensors stand at the temperature of the first.
int kiv_bsp_get_sensor_temp_sync(int, bsp_sensor_temp *temp)
{
    static const uint8_t key = key_number("bsp/sensor_0");
    const std::string *text = text_at(key);
    if (text == nullptr) {
        return -1;
    }
    temp->temperature = atoi(text->c_str());
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
int kiv_lib_led_relight_msg(void) { happened.relights++; return 0; }
int libkiv_tr181_Init(void) { return 0; }
int libkiv_tr181_set_tbl(int, void *, int, int) { return 0; }
int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *to) { return answer("bsp/charger", 0, to); }
int kiv_bsp_get_battery_online_status_sync(bsp_query_result *to) { return answer("bsp/battery", REFUSED_BATTERY, to); }
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
