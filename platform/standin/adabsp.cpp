#include "kiv/adabsp.h"

#include "indications.h"
#include "led_names.h"
#include "standin.h"

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <mutex>
#include <sys/stat.h>
#include <unistd.h>

enum { LED_LEVEL_MAX = 4, LED_ID_COUNT = LED_SIGBAR_15 + 1, FOLDER_NAME_SIZE = 64 };

enum {
    BSP_IND_BATTERY_ONLINE = 1350,
    BSP_IND_BATTERY_OFFLINE = 1351,
    BSP_IND_CHARGER_CONNECT = 1356,
    BSP_IND_CHARGER_DISCONNECT = 1357,
};

static std::mutex led_lock; // one LED request at a time, as on the board
static int led_dir = -1;
static bool led_dir_is_ours; // folders are made on first use
static unsigned led_generation = ~0U;
static char led_folders[LED_ID_COUNT][FOLDER_NAME_SIZE]; // "": the board has no such LED
static int led_max[LED_ID_COUNT];                        // max_brightness; 0 until the folder has been seen

static void read_map(const char *path)
{
    char line[256];
    FILE *map = fopen(path, "re");
    if (map == nullptr) {
        standin_error("KIV_LED_MAP=%s: %s", path, strerror(errno));
        return;
    }
    for (int number = 1; fgets(line, sizeof line, map) != nullptr; number++) {
        int id = -1;
        char name[FOLDER_NAME_SIZE] = "";
        const int words = sscanf(line, "%d %63s", &id, name);
        if (words <= 0 && (line[strspn(line, " \t\r\n")] == '\0' || line[0] == '#'))
            continue;
        if (words != 2 || id < 0 || id >= LED_ID_COUNT || !standin_is_plain_name(name))
            standin_error("%s:%d: not a line of LED-ID NAME", path, number);
        else
            memcpy(led_folders[id], name, sizeof name);
    }
    fclose(map);
}

static void open_led_dir()
{
    const char *chosen = getenv("KIV_LED_DIR");
    const char *map = getenv("KIV_LED_MAP");
    if (led_dir >= 0)
        close(led_dir);
    memset(led_folders, 0, sizeof led_folders);
    memset(led_max, 0, sizeof led_max);
    for (const led_name &row : led_names)
        snprintf(led_folders[row.led_id], FOLDER_NAME_SIZE, "led:%s", row.name);
    if (map != nullptr && map[0] != '\0')
        read_map(map);
    led_dir_is_ours = chosen == nullptr || chosen[0] == '\0';
    led_dir = led_dir_is_ours ? openat(standin_device_dir(), "leds", O_RDONLY | O_DIRECTORY | O_CLOEXEC)
                              : open(chosen, O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (led_dir < 0)
        standin_error("the folder of LEDs %s: %s", led_dir_is_ours ? "leds" : chosen, strerror(errno));
    else
        led_generation = standin_generation;
}

// Written without truncating first, so that a reader never finds an empty file; the kernel's files have no length.
static int write_attribute(const char *folder, const char *attribute, const char *text)
{
    char path[FOLDER_NAME_SIZE + 32];
    snprintf(path, sizeof path, "%s/%s", folder, attribute);
    const int flags = O_WRONLY | O_CLOEXEC | (led_dir_is_ours ? O_CREAT : 0);
    const int fd = openat(led_dir, path, flags, 0600);
    if (fd < 0)
        return -errno;
    const auto length = static_cast<ssize_t>(strlen(text));
    const ssize_t written = write(fd, text, static_cast<size_t>(length));
    int result = written == length ? 0 : written < 0 ? -errno : -EIO;
    if (result == 0 && ftruncate(fd, length) != 0 && led_dir_is_ours)
        result = -errno;
    close(fd);
    return result;
}

static int write_number(const char *folder, const char *attribute, int value)
{
    char text[16];
    snprintf(text, sizeof text, "%d\n", value);
    return write_attribute(folder, attribute, text);
}

static int read_max(const char *folder)
{
    char path[FOLDER_NAME_SIZE + 32];
    char text[16] = "";
    int value = 0;
    snprintf(path, sizeof path, "%s/max_brightness", folder);
    const int fd = openat(led_dir, path, O_RDONLY | O_CLOEXEC);
    if (fd < 0)
        return -errno;
    const ssize_t length = read(fd, text, sizeof text - 1);
    close(fd);
    if (length == 0)
        return -ENOENT; // its disk was full when it was made
    if (length < 0 || standin_parse_ints(text, &value, 1) != 1 || value <= 0)
        return -EIO;
    return value;
}

static int make_led(const char *folder)
{
    if (mkdirat(led_dir, folder, 0700) != 0 && errno != EEXIST)
        return -errno;
    for (const char *attribute : {"brightness", "delay_on", "delay_off"})
        write_number(folder, attribute, 0);
    write_attribute(folder, "trigger", "none\n");
    return write_number(folder, "max_brightness", LED_LEVEL_MAX);
}

// Finds the LED's folder and its highest brightness. Returns 0 or a negative errno.
static int find_led(int led_id)
{
    if (led_max[led_id] > 0)
        return 0;
    int highest = read_max(led_folders[led_id]);
    if (highest == -ENOENT && led_dir_is_ours) {
        const int made = make_led(led_folders[led_id]);
        highest = made == 0 ? LED_LEVEL_MAX : made;
    }
    if (highest < 0)
        return highest;
    led_max[led_id] = highest;
    return 0;
}

static int scale(int level, int highest)
{
    const int value = static_cast<int>((static_cast<int64_t>(level) * highest + LED_LEVEL_MAX / 2) / LED_LEVEL_MAX);
    return level > 0 && value == 0 ? 1 : value;
}

static int show(const led_request &request)
{
    const char *folder = led_folders[request.led_id];
    const int brightness = scale(request.brightness, led_max[request.led_id]);
    int result = write_attribute(folder, "trigger", request.led_operation == LED_OP_BLINK ? "timer\n" : "none\n");
    // The kernel shows the two delays while the trigger is "timer".
    if (result == 0 && request.led_operation == LED_OP_BLINK)
        result = write_number(folder, "delay_on", request.blink_time1);
    if (result == 0 && request.led_operation == LED_OP_BLINK)
        result = write_number(folder, "delay_off", request.blink_time2);
    if (result == 0)
        result = write_number(folder, "brightness", request.led_operation == LED_OP_OFF ? 0 : brightness);
    return result;
}

static bool is_sane(const led_request &request)
{
    return request.led_id >= 0 && request.led_id < LED_ID_COUNT && request.led_operation >= LED_OP_ON &&
           request.led_operation <= LED_OP_BLINK && request.brightness >= 0 && request.brightness <= LED_LEVEL_MAX &&
           request.blink_time1 >= 0 && request.blink_time2 >= 0;
}

static int set_led(const led_request &request)
{
    if (!is_sane(request))
        return -EINVAL;
    const std::lock_guard guard(led_lock);
    if (led_generation != standin_generation)
        open_led_dir();
    if (led_dir < 0)
        return -ENODEV;
    if (led_folders[request.led_id][0] == '\0')
        return -EINVAL;
    int result = find_led(request.led_id);
    if (result == 0)
        result = show(request);
    if (result < 0)
        led_max[request.led_id] = 0; // the folder may be another one next time
    return result;
}

static void trace_request(trace_line &line, const led_request &request)
{
    const char *name = find_led_name(request.led_id);
    if (name != nullptr)
        trace_add(line, "%s", name);
    else
        trace_add(line, "%d", request.led_id);
    switch (request.led_operation) {
    case LED_OP_ON:
        trace_add(line, " on %d", request.brightness);
        break;
    case LED_OP_OFF:
        trace_add(line, " off %d", request.brightness);
        break;
    case LED_OP_BLINK:
        trace_add(line, " blink %d", request.brightness);
        break;
    default:
        trace_add(line, " operation %d %d", request.led_operation, request.brightness);
        break;
    }
    if (request.led_operation == LED_OP_BLINK || request.blink_time1 != 0 || request.blink_time2 != 0)
        trace_add(line, " %d/%d", request.blink_time1, request.blink_time2);
}

static int set_led_traced(const led_request &request)
{
    trace_line line;
    int result = 0;
    trace_begin(line, "kiv_bsp_set_leds_sync");
    trace_request(line, request);
    if (trace_fault(line, &result))
        return result;
    result = set_led(request);
    trace_result(line, result);
    trace_end(line);
    return result;
}

int kiv_bsp_set_leds_sync(led_request request, int *result)
{
    const int code = standin_watched == 0 ? set_led(request) : set_led_traced(request);
    if (result != nullptr)
        *result = code;
    return code == 0 ? 0 : -1;
}

static int query(const char *name, bsp_query_result *result)
{
    char text[32];
    int values[2] = {};
    if (result == nullptr || standin_read_text("bsp", name, text, sizeof text) < 0)
        return -1;
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

static int query_traced(const char *call, const char *name, bsp_query_result *answer)
{
    trace_line line;
    int result = 0;
    trace_begin(line, call);
    if (trace_fault(line, &result))
        return result;
    result = query(name, answer);
    trace_result(line, result);
    if (result == 0)
        trace_add(line, ", %d %d", answer->ret, answer->data);
    trace_end(line);
    return result;
}

int kiv_bsp_get_charger_connect_status_sync(bsp_query_result *result)
{
    return standin_watched == 0 ? query("charger", result)
                                : query_traced("kiv_bsp_get_charger_connect_status_sync", "charger", result);
}

int kiv_bsp_get_battery_online_status_sync(bsp_query_result *result)
{
    return standin_watched == 0 ? query("battery", result)
                                : query_traced("kiv_bsp_get_battery_online_status_sync", "battery", result);
}

static int read_sensor(int sensor_id, bsp_sensor_temp *temp)
{
    char name[16];
    char text[16];
    int value = 0;
    if (sensor_id < 0 || sensor_id >= BSP_SENSOR_COUNT || temp == nullptr)
        return -1;
    snprintf(name, sizeof name, "sensor_%d", sensor_id);
    if (standin_read_text("bsp", name, text, sizeof text) < 0)
        return -1;
    if (standin_parse_ints(text, &value, 1) != 1) {
        standin_error("bsp/%s: not a number", name);
        return -1;
    }
    *temp = {0, value};
    return 0;
}

int kiv_bsp_get_sensor_temp_sync(int sensor_id, bsp_sensor_temp *temp)
{
    if (standin_watched == 0)
        return read_sensor(sensor_id, temp);
    trace_line line;
    int result = 0;
    trace_begin(line, "kiv_bsp_get_sensor_temp_sync");
    trace_add(line, "%d", sensor_id);
    if (trace_fault(line, &result))
        return result;
    result = read_sensor(sensor_id, temp);
    trace_result(line, result);
    if (result == 0)
        trace_add(line, ", %d", temp->temperature);
    trace_end(line);
    return result;
}

struct ind_row {
    int event_id;
    const char *call;
    std::atomic<bsp_ind_callback> callback;
};

static std::array<ind_row, 4> ind_rows = {
    {
     {BSP_IND_BATTERY_ONLINE, "kiv_bsp_register_battery_online_ind", nullptr},
     {BSP_IND_BATTERY_OFFLINE, "kiv_bsp_register_battery_offline_ind", nullptr},
     {BSP_IND_CHARGER_CONNECT, "kiv_bsp_register_charger_connect_ind", nullptr},
     {BSP_IND_CHARGER_DISCONNECT, "kiv_bsp_register_charger_disconnect_ind", nullptr},
     }
};

static int register_ind(int event_id, bsp_ind_callback callback)
{
    for (ind_row &row : ind_rows) {
        if (row.event_id != event_id)
            continue;
        trace_line line;
        int result = callback == nullptr ? -1 : 0;
        trace_begin(line, row.call);
        if (standin_watched != 0 && trace_fault(line, &result))
            return result;
        if (callback != nullptr)
            row.callback = callback;
        trace_result(line, result);
        trace_end(line);
        return result;
    }
    return -1;
}

int kiv_bsp_register_battery_online_ind(bsp_ind_callback callback)
{
    return register_ind(BSP_IND_BATTERY_ONLINE, callback);
}

int kiv_bsp_register_battery_offline_ind(bsp_ind_callback callback)
{
    return register_ind(BSP_IND_BATTERY_OFFLINE, callback);
}

int kiv_bsp_register_charger_connect_ind(bsp_ind_callback callback)
{
    return register_ind(BSP_IND_CHARGER_CONNECT, callback);
}

int kiv_bsp_register_charger_disconnect_ind(bsp_ind_callback callback)
{
    return register_ind(BSP_IND_CHARGER_DISCONNECT, callback);
}

static bool is_own_row(int event_id)
{
    for (const ind_row &row : ind_rows) {
        if (row.event_id == event_id)
            return true;
    }
    return false;
}

static bool is_repeated(size_t index, bsp_ind_callback callback)
{
    for (size_t earlier = 0; earlier < index; earlier++) {
        if (ind_rows[earlier].callback == callback)
            return true;
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
        if (callback == nullptr || (for_all ? is_repeated(index, callback) : ind_rows[index].event_id != event_id))
            continue;
        callback(event_id, 0, has_record ? record.data() : nullptr);
    }
}
