#include "fake_platform.h"

#include "fake_words.h"
#include "kiv/cfg.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/log.h"
#include "kiv/mem.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "kiv/socket.h"
#include "kiv/tr181.h"

#include <algorithm>
#include <atomic>
#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <mutex>
#include <string_view>
#include <utility>

constexpr size_t LONGEST_RECORD = 5000;
constexpr size_t MOST_TIMERS = 64;
constexpr int IGNORED = -1;    // where the daemon does not look at the result
constexpr int LED_LOG_ID = 31; // of the daemon

static fake_device device;
static std::mutex device_mutex; // also guards the record; never held while a timer's procedure runs
static std::string record;
static size_t recorded_lines;
static std::atomic<bool> recording;
static std::atomic<unsigned long> led_requests;
static int last_timer;

// The thread sanitizer is not told of the fake's own locking: on a device no call of the platform orders the daemon's
// threads, so none may hide a race here.
#ifdef __SANITIZE_THREAD__
extern "C" {
void AnnotateIgnoreSyncBegin(const char *file, int line);
void AnnotateIgnoreSyncEnd(const char *file, int line);
void AnnotateIgnoreReadsBegin(const char *file, int line);
void AnnotateIgnoreReadsEnd(const char *file, int line);
void AnnotateIgnoreWritesBegin(const char *file, int line);
void AnnotateIgnoreWritesEnd(const char *file, int line);
}
#define SANITIZER_IGNORES(what)                                                                                        \
    AnnotateIgnoreSync##what(__FILE__, __LINE__), AnnotateIgnoreReads##what(__FILE__, __LINE__),                       \
        AnnotateIgnoreWrites##what(__FILE__, __LINE__)
#else
#define SANITIZER_IGNORES(what) static_cast<void>(0)
#endif

struct device_lock {
    device_lock()
    {
        SANITIZER_IGNORES(Begin);
        device_mutex.lock();
    }
    ~device_lock()
    {
        device_mutex.unlock();
        SANITIZER_IGNORES(End);
    }
    device_lock(const device_lock &) = delete;
};

__attribute__((format(printf, 1, 2))) static void say(const char *format, ...)
{
    if (!recording.load(std::memory_order_relaxed)) {
        return;
    }
    char line[2048];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(line, sizeof line, format, arguments);
    va_end(arguments);
    fake_note(line);
}

fake_device &fake_platform()
{
    return device;
}

void fake_record(bool on)
{
    recording = on;
}

void fake_note(const std::string &line)
{
    if (!recording.load(std::memory_order_relaxed)) {
        return;
    }
    {
        const device_lock lock;
        if (++recorded_lines <= LONGEST_RECORD) {
            record += line + "\n";
        }
    }
    if (device.meanwhile) {
        device.meanwhile(line);
    }
}

std::string fake_take_record()
{
    const device_lock lock;
    recorded_lines = 0;
    return std::exchange(record, {});
}

static std::optional<fake_timer> take_timer(int handle, bool for_good)
{
    const device_lock lock;
    const auto found = device.timers.find(handle);
    if (found == device.timers.end()) {
        return std::nullopt;
    }
    const fake_timer timer = found->second;
    if (for_good || !timer.repeats) {
        device.timers.erase(found);
    }
    return timer;
}

bool fake_fire(int handle)
{
    const std::optional<fake_timer> timer = take_timer(handle, false);
    if (timer) {
        timer->callback(timer->argument);
    }
    return timer.has_value();
}

void fake_set_nv(const std::string &key, const std::string &value)
{
    const device_lock lock;
    device.nv[key] = value;
}

void fake_deliver(std::string message)
{
    const device_lock lock;
    device.inbox.emplace_back(std::move(message));
}

std::map<int, fake_timer> fake_timers()
{
    const device_lock lock;
    return device.timers;
}

unsigned long fake_led_requests()
{
    return led_requests;
}

void kiv_syslog_append(int level, const char *file, int, int log_id, const char *format, ...)
{
    char text[1400]; // formatted also while nothing is recorded, so that a sanitizer sees what is read
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    if (!recording.load(std::memory_order_relaxed)) {
        return;
    }
    const char *name = level == KIV_LOG_ERROR ? "error" : level == KIV_LOG_INFO ? "info" : "unknown";
    const std::string foreign_id = log_id == LED_LOG_ID ? "" : "/" + std::to_string(log_id);
    say("%s%s %s %s", name, foreign_id.c_str(), file, quoted(text).c_str());
}

int kiv_init_msg(const char *queue_name, int *handle)
{
    say("open %s", queue_name);
    const device_lock lock;
    if (device.failing_queue_opens > 0) {
        --device.failing_queue_opens;
        return -2;
    }
    *handle = 7;
    return 0;
}

int kiv_send_msg(const char *queue_name, const void *data, int length)
{
    say("sent %s %d bytes%s", queue_name, length, words_of_bytes(data, static_cast<size_t>(length)).c_str());
    return device.send_result;
}

int kiv_recv_msg(int handle, void *buffer, int size)
{
    say("receive %d %d", handle, size);
    const device_lock lock;
    if (device.inbox.empty()) {
        return -1;
    }
    const std::optional<std::string> message = std::move(device.inbox.front());
    device.inbox.pop_front();
    if (!message) {
        return -1;
    }
    const size_t length = std::min(message->size(), static_cast<size_t>(size));
    std::memcpy(buffer, message->data(), length);
    return static_cast<int>(length);
}

int kiv_msg_send(const svc_msg *message, int data_len)
{
    say("sent %s %d", words_of_message(*message).c_str(), data_len);
    return device.send_result;
}

void kiv_mem_set(void *dest, int value, size_t size)
{
    say("fill %d %zu", value, size);
    std::memset(dest, value, size);
}

void kiv_mem_cpy(void *dest, const void *src, size_t size)
{
    say("copy %zu", size);
    std::memcpy(dest, src, size);
}

int kiv_reg_proc(int source_module_id, const uint32_t *masks)
{
    say("registered %s 0x%x 0x%x 0x%x 0x%x", word_of_module(source_module_id).c_str(), masks[0], masks[1], masks[2],
        masks[3]);
    return device.reg_proc_result;
}

int kiv_reg_func(int source_module_id, int dest_module_id, const reg_masks *masks)
{
    say("register %s for %s 0x%x 0x%x 0x%x 0x%x", word_of_module(source_module_id).c_str(),
        word_of_module(dest_module_id).c_str(), masks->mask1, masks->mask2, masks->mask3, masks->mask4);
    device.registrations[source_module_id] = *masks;
    return IGNORED;
}

int kiv_cfg_get_item(int item, void *buffer, int size)
{
    say("cfg %d %d", item, size);
    const auto found = device.cfg.find(item);
    if (device.cfg_fails || found == device.cfg.end()) {
        return -1;
    }
    std::memcpy(buffer, found->second.data(), std::min(found->second.size(), static_cast<size_t>(size)));
    return 0;
}

int kiv_nvconfig_read(const char *key, char *buffer, int size)
{
    say("nv %s %d", key, size);
    const device_lock lock;
    const auto found = device.nv.find(key);
    if (found == device.nv.end()) {
        return -1;
    }
    std::snprintf(buffer, static_cast<size_t>(size), "%s", found->second.c_str());
    return 0;
}

int kiv_nvconfig_write(const char *key, const char *value, int length)
{
    const std::string text(value, static_cast<size_t>(length));
    fake_note(std::string("nv written ") + key + "=" + text);
    fake_set_nv(key, text);
    return IGNORED;
}

static int new_timer(const fake_timer &timer)
{
    const device_lock lock;
    if (device.failing_timers > 0) {
        --device.failing_timers;
        return 0;
    }
    device.timers[++last_timer] = timer;
    if (device.timers.size() > MOST_TIMERS) {
        device.timers.erase(device.timers.begin());
    }
    return last_timer;
}

int kiv_timer(void (*callback)(void *), void *argument, int period_ms, int repeat)
{
    const int handle = new_timer({callback, argument, period_ms, repeat != 0});
    say("timer %d %s%s", period_ms, repeat != 0 ? "repeat" : "once", handle == 0 ? " fails" : "");
    return handle;
}

int kiv_delete_timer(int handle)
{
    const std::optional<fake_timer> timer = take_timer(handle, true);
    const std::string period = timer ? std::to_string(timer->period_ms) : handle == 0 ? "none" : "gone";
    say("deleted timer %s", period.c_str());
    return IGNORED;
}

int kiv_bsp_set_leds_sync(led_request request, int *result)
{
    if (recording.load(std::memory_order_relaxed)) {
        fake_note(words_of(request));
    }
    led_requests.fetch_add(1, std::memory_order_relaxed);
    const auto found = device.led_results.find(request.led_id);
    if (found != device.led_results.end()) {
        *result = found->second;
    } else if (!device.writes_failures_only) {
        *result = 0;
    }
    return IGNORED;
}

static int answer(const char *query, const std::optional<bsp_query_result> &scripted, bsp_query_result *result)
{
    say("query %s%s", query, result->ret == 0 && result->data == 0 ? "" : " with an old answer");
    if (!scripted) {
        return -1;
    }
    *result = *scripted;
    return 0;
}

int kiv_bsp_get_sensor_temp_sync(int sensor_id, bsp_sensor_temp *temp)
{
    say("sensor %d", sensor_id);
    const std::optional<int> scripted = device.sensors.at(static_cast<size_t>(sensor_id));
    if (!scripted) {
        return -1;
    }
    temp->temperature = *scripted;
    return 0;
}

static int note_indication(const char *name, bsp_ind_callback callback)
{
    say("indications of %s", name);
    device.indication = callback;
    return IGNORED;
}

int libkiv_tr181_set_tbl(int table_id, void *data, int arg3, int arg4)
{
    say("tr181 %d %d %d %s", table_id, arg3, arg4, words_of_tr181(table_id, data).c_str());
    return device.tr181_result;
}

int kiv_reg_table_init(int module_id)
{
    say("registration table of %d", module_id);
    return 0;
}
int kiv_ipc_init(int log_id, int flag)
{
    say("ipc %d %d", log_id, flag);
    return 0;
}
int kiv_lib_led_relight_msg(void)
{
    say("relight");
    return IGNORED;
}
int libkiv_tr181_Init(void)
{
    say("tr181_init");
    return IGNORED;
}
int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *to)
{
    return answer("charger", device.charger, to);
}
int kiv_bsp_get_battery_online_status_sync(bsp_query_result *to)
{
    return answer("battery", device.battery, to);
}
int kiv_bsp_register_battery_online_ind(bsp_ind_callback call)
{
    return note_indication("battery_online", call);
}
int kiv_bsp_register_battery_offline_ind(bsp_ind_callback call)
{
    return note_indication("battery_offline", call);
}
int kiv_bsp_register_charger_connect_ind(bsp_ind_callback call)
{
    return note_indication("charger_connect", call);
}
int kiv_bsp_register_charger_disconnect_ind(bsp_ind_callback to)
{
    return note_indication("charger_disconnect", to);
}
