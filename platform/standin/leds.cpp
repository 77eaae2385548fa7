#include "leds.h"

#include "standin.h"
#include "trace/board_names.h"

#include <array>
#include <cerrno>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <fcntl.h>
#include <mutex>
#include <sys/stat.h>
#include <unistd.h>

enum { LED_LEVEL_MAX = 4, FOLDER_NAME_SIZE = 64 };

enum { BRIGHTNESS, DELAY_ON, DELAY_OFF, TRIGGER, ATTRIBUTE_COUNT };
enum trigger { TRIGGER_NONE, TRIGGER_TIMER };

constexpr std::array<const char *, ATTRIBUTE_COUNT> attribute_names = {"brightness", "delay_on", "delay_off",
                                                                       "trigger"};
constexpr std::array trigger_names = {"none", "timer"};

enum { UNKNOWN = -1 };

// A file that nobody but us writes stays open, and its value is written when it changes. The kernel's files, which come
// and go with the trigger and are there for others too, are opened for every value.
struct attribute {
    int fd = -1;
    int value = UNKNOWN; // as last written
    size_t length = 0;   // of that text
};

struct led {
    char folder[FOLDER_NAME_SIZE]; // "": the board has no such LED
    int highest;                   // max_brightness; 0 until the folder has been seen
    int held = -1;                 // the folder that the attributes were opened in, when it is ours
    timespec changed;
    std::array<attribute, ATTRIBUTE_COUNT> attributes;
};

static std::mutex led_lock; // one LED request at a time, as on the board
static int led_dir = -1;
static bool led_dir_is_ours; // folders are made on first use
static unsigned led_generation = ~0U;
static std::array<led, LED_ID_COUNT> leds;

// An LED's name in traces and scenarios, or its number. -1 for neither.
static int parse_led(const char *text)
{
    int id = find_led_id(text);
    if (id < 0 && (standin_parse_ints(text, &id, 1) != 1 || id >= LED_ID_COUNT)) {
        return -1;
    }
    return id;
}

static void read_map_line(const char *path, int number, const char *line)
{
    char led_text[32] = "";
    char folder[FOLDER_NAME_SIZE] = "";
    char rest[2] = "";
    const int words = sscanf(line, "%31s %63s %1s", led_text, folder, rest);
    if (words <= 0 || led_text[0] == '#') {
        return;
    }
    const int id = parse_led(led_text);
    if (words != 2 || id < 0 || !standin_is_plain_name(folder)) {
        standin_error("%s:%d: not a line of LED FOLDER", path, number);
        return;
    }
    memcpy(leds[static_cast<size_t>(id)].folder, folder, sizeof folder);
}

static void read_map(const char *path)
{
    char line[256];
    FILE *map = fopen(path, "re");
    if (map == nullptr) {
        standin_error("KIV_LED_MAP=%s: %s", path, strerror(errno));
        return;
    }
    for (int number = 1; fgets(line, sizeof line, map) != nullptr; number++) {
        read_map_line(path, number, line);
    }
    fclose(map);
}

static void forget_led(led &one)
{
    for (attribute &file : one.attributes) {
        if (file.fd >= 0) {
            close(file.fd);
        }
        file = {};
    }
    if (one.held >= 0) {
        close(one.held);
    }
    one.held = -1;
    one.highest = 0;
}

static void open_led_dir()
{
    const char *chosen = getenv("KIV_LED_DIR");
    const char *map = getenv("KIV_LED_MAP");
    if (led_dir >= 0) {
        close(led_dir);
    }
    for (led &one : leds) {
        forget_led(one);
        one.folder[0] = '\0';
    }
    for (const led_row &row : led_rows) {
        snprintf(leds[static_cast<size_t>(row.led_id)].folder, FOLDER_NAME_SIZE, "led:%s", row.name);
    }
    if (map != nullptr && map[0] != '\0') {
        read_map(map);
    }
    led_dir_is_ours = chosen == nullptr || chosen[0] == '\0';
    led_dir = led_dir_is_ours ? openat(standin_device_dir(), "leds", O_RDONLY | O_DIRECTORY | O_CLOEXEC | O_NOFOLLOW)
                              : open(chosen, O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (led_dir < 0) {
        standin_error("the folder of LEDs %s: %s", led_dir_is_ours ? "leds" : chosen, strerror(errno));
    } else {
        led_generation = standin_generation;
    }
}

static int open_file(const led &one, const char *name)
{
    char path[FOLDER_NAME_SIZE + 32];
    snprintf(path, sizeof path, "%s/%s", one.folder, name);
    const int flags = O_WRONLY | O_CLOEXEC | (led_dir_is_ours ? O_CREAT | O_NOFOLLOW : 0);
    return openat(led_dir, path, flags, 0600);
}

// Written without truncating first, so that a reader never finds an empty file; the kernel's files have no length.
static int write_text(int fd, const char *text, size_t length, size_t old_length)
{
    const ssize_t written = pwrite(fd, text, length, 0);
    if (written != static_cast<ssize_t>(length)) {
        return written < 0 ? -errno : -EIO;
    }
    if (length < old_length && ftruncate(fd, static_cast<off_t>(length)) != 0 && led_dir_is_ours) {
        return -errno;
    }
    return 0;
}

// A file that is not known to be short is cut behind the text.
static int write_file(const led &one, const char *name, const char *text)
{
    const int fd = open_file(one, name);
    if (fd < 0) {
        return -errno;
    }
    const int result = write_text(fd, text, strlen(text), SIZE_MAX);
    close(fd);
    return result;
}

static size_t format_value(size_t which, int value, char *text, size_t size)
{
    const int length = which == TRIGGER ? snprintf(text, size, "%s\n", trigger_names[static_cast<size_t>(value)])
                                        : snprintf(text, size, "%d\n", value);
    return static_cast<size_t>(length);
}

static int set_attribute(led &one, size_t which, int value)
{
    attribute &file = one.attributes[which];
    char text[16];
    if (file.value == value) {
        return 0;
    }
    const size_t length = format_value(which, value, text, sizeof text);
    if (!led_dir_is_ours) {
        return write_file(one, attribute_names[which], text);
    }
    if (file.fd < 0) {
        file.fd = open_file(one, attribute_names[which]);
        file.length = SIZE_MAX;
    }
    if (file.fd < 0) {
        return -errno;
    }
    const int result = write_text(file.fd, text, length, file.length);
    file.value = result == 0 ? value : UNKNOWN;
    file.length = length;
    return result;
}

static int read_highest(const led &one)
{
    char path[FOLDER_NAME_SIZE + 32];
    char text[16] = "";
    int value = 0;
    snprintf(path, sizeof path, "%s/max_brightness", one.folder);
    const int fd = openat(led_dir, path, O_RDONLY | O_CLOEXEC | O_NONBLOCK);
    if (fd < 0) {
        return -errno;
    }
    const ssize_t length = read(fd, text, sizeof text - 1);
    close(fd);
    if (length == 0) {
        return -ENOENT; // its disk was full when it was made
    }
    if (length < 0 || standin_parse_ints(text, &value, 1) != 1 || value <= 0) {
        return -EIO;
    }
    return value;
}

static int make_led(const led &one)
{
    if (mkdirat(led_dir, one.folder, 0700) != 0 && errno != EEXIST) {
        return -errno;
    }
    for (const char *name : {"brightness", "delay_on", "delay_off"}) {
        write_file(one, name, "0\n");
    }
    write_file(one, "trigger", "none\n");
    const int result = write_file(one, "max_brightness", "4\n");
    return result == 0 ? LED_LEVEL_MAX : result;
}

// A folder that is removed has no name any more; one that is put aside, or in which something is replaced, has changed.
static bool is_same_folder(const led &one)
{
    struct stat folder {
    };
    return fstat(one.held, &folder) == 0 && folder.st_nlink > 0 && folder.st_ctim.tv_sec == one.changed.tv_sec &&
           folder.st_ctim.tv_nsec == one.changed.tv_nsec;
}

// Finds the LED's folder and its highest brightness, again when the folder is another one. Returns 0 or a negative
// errno.
static int find_led(led &one)
{
    struct stat folder {
    };
    if (led_dir_is_ours && one.highest > 0 && !is_same_folder(one)) {
        forget_led(one);
    }
    if (one.highest > 0) {
        return 0;
    }
    one.highest = read_highest(one);
    if (one.highest == -ENOENT && led_dir_is_ours) {
        one.highest = make_led(one);
    }
    if (one.highest < 0) {
        return one.highest;
    }
    if (led_dir_is_ours) {
        one.held = openat(led_dir, one.folder, O_RDONLY | O_DIRECTORY | O_CLOEXEC | O_NOFOLLOW);
    }
    if (one.held >= 0 && fstat(one.held, &folder) == 0) {
        one.changed = folder.st_ctim;
    }
    return 0;
}

static int scale(int level, int highest)
{
    const int value = static_cast<int>((static_cast<int64_t>(level) * highest + LED_LEVEL_MAX / 2) / LED_LEVEL_MAX);
    return level > 0 && value == 0 ? 1 : value;
}

static int show(led &one, const led_request &request)
{
    const bool blinks = request.led_operation == LED_OP_BLINK;
    int result = set_attribute(one, TRIGGER, blinks ? TRIGGER_TIMER : TRIGGER_NONE);
    if (result == -ENOENT && !blinks) {
        result = 0; // a kernel without triggers
    }
    // The kernel shows the two delays while the trigger is "timer".
    if (result == 0 && blinks) {
        result = set_attribute(one, DELAY_ON, request.blink_time1);
    }
    if (result == 0 && blinks) {
        result = set_attribute(one, DELAY_OFF, request.blink_time2);
    }
    if (result == 0) {
        const bool is_off = request.led_operation == LED_OP_OFF;
        result = set_attribute(one, BRIGHTNESS, is_off ? 0 : scale(request.brightness, one.highest));
    }
    return result;
}

static bool is_sane(const led_request &request)
{
    return request.led_id >= 0 && request.led_id < LED_ID_COUNT && request.led_operation >= LED_OP_ON &&
           request.led_operation <= LED_OP_BLINK && request.brightness >= 0 && request.brightness <= LED_LEVEL_MAX &&
           request.blink_time1 >= 0 && request.blink_time2 >= 0;
}

static void complain(int led_id, int result)
{
    const char *name = find_led_name(led_id);
    standin_error("the LED %s, %s/%s, cannot be set: %s", name == nullptr ? "without a name" : name,
                  led_dir_is_ours ? "leds" : "KIV_LED_DIR", leds[static_cast<size_t>(led_id)].folder,
                  strerror(-result));
}

int leds_set(const led_request &request)
{
    if (!is_sane(request)) {
        return -EINVAL;
    }
    const std::lock_guard guard(led_lock);
    if (led_generation != standin_generation) {
        open_led_dir();
    }
    if (led_dir < 0) {
        return -ENODEV;
    }
    led &one = leds[static_cast<size_t>(request.led_id)];
    if (one.folder[0] == '\0') {
        return -EINVAL;
    }
    int result = find_led(one);
    if (result == 0) {
        result = show(one, request);
    }
    if (result < 0) {
        complain(request.led_id, result);
        forget_led(one); // the folder may be another one next time
    }
    return result;
}
