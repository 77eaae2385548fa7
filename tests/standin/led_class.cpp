#include "led_class.h"

#define FUSE_USE_VERSION 31
#include <fuse.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <cstring>
#include <mutex>
#include <sys/mount.h>
#include <thread>
#include <unistd.h>

constexpr size_t SYSFS_PAGE = 4096;
constexpr unsigned DEFAULT_DELAY_MS = 500;

static std::mutex class_lock;
static std::vector<class_led> class_leds;
static fuse *mounted;
static std::string mounted_at;
static std::thread server;

struct attribute_of {
    class_led *led;
    std::string attribute; // empty: the LED's folder
};

static bool exists(const attribute_of &file)
{
    if (file.led == nullptr) {
        return false;
    }
    if (file.attribute == "delay_on" || file.attribute == "delay_off") {
        return file.led->blinks;
    }
    return file.attribute.empty() || file.attribute == "brightness" || file.attribute == "max_brightness" ||
           file.attribute == "trigger";
}

static attribute_of look_up(const std::string &path)
{
    const size_t slash = path.find('/', 1);
    const std::string name = path.substr(1, slash - 1);
    for (class_led &led : class_leds) {
        if (led.name == name) {
            return {&led, slash == std::string::npos ? "" : path.substr(slash + 1)};
        }
    }
    return {nullptr, ""};
}

static std::string text_of(const attribute_of &file)
{
    const class_led &led = *file.led;
    if (file.attribute == "trigger") {
        return led.blinks ? "none [timer]\n" : "[none] timer\n";
    }
    const unsigned value = file.attribute == "brightness"       ? led.brightness
                           : file.attribute == "max_brightness" ? led.max_brightness
                           : file.attribute == "delay_on"       ? led.delay_on
                                                                : led.delay_off;
    return std::to_string(value) + "\n";
}

static int set_trigger(class_led &led, const std::string &text)
{
    if (text != "none" && text != "timer") {
        return -EINVAL;
    }
    if (led.blinks) {
        led.brightness = 0; // the old trigger leaves the LED dark
    }
    led.blinks = text == "timer";
    if (led.blinks) {
        led.brightness = led.brightness == 0 ? led.max_brightness : led.brightness;
        led.delay_on = DEFAULT_DELAY_MS;
        led.delay_off = DEFAULT_DELAY_MS;
    }
    return 0;
}

static int set_value(const attribute_of &file, const std::string &text)
{
    unsigned value = 0;
    const auto [end, failure] = std::from_chars(text.data(), text.data() + text.size(), value);
    if (failure != std::errc() || end != text.data() + text.size()) {
        return -EINVAL;
    }
    class_led &led = *file.led;
    if (file.attribute == "delay_on") {
        led.delay_on = value;
    } else if (file.attribute == "delay_off") {
        led.delay_off = value;
    } else {
        led.brightness = std::min(value, led.max_brightness);
        led.blinks = led.blinks && value != 0; // 0 takes the trigger away
    }
    return 0;
}

static int class_getattr(const char *path, struct stat *info, fuse_file_info *)
{
    const std::lock_guard guard(class_lock);
    const attribute_of file = look_up(path);
    if (strcmp(path, "/") != 0 && !exists(file)) {
        return -ENOENT;
    }
    const bool is_folder = strcmp(path, "/") == 0 || file.attribute.empty();
    info->st_mode = is_folder ? S_IFDIR | 0755 : file.attribute == "max_brightness" ? S_IFREG | 0444 : S_IFREG | 0644;
    info->st_size = SYSFS_PAGE;
    return 0;
}

static int class_open(const char *path, fuse_file_info *how)
{
    const std::lock_guard guard(class_lock);
    how->direct_io = 1;
    if ((how->flags & O_ACCMODE) != O_RDONLY && look_up(path).attribute == "max_brightness") {
        return -EACCES;
    }
    return 0;
}

static int class_read(const char *path, char *buffer, size_t size, off_t offset, fuse_file_info *)
{
    const std::lock_guard guard(class_lock);
    const attribute_of file = look_up(path);
    if (!exists(file)) {
        return -ENODEV;
    }
    const std::string text = text_of(file);
    const size_t from = std::min(static_cast<size_t>(offset), text.size());
    return static_cast<int>(text.copy(buffer, size, from));
}

static int class_write(const char *path, const char *bytes, size_t size, off_t, fuse_file_info *)
{
    const std::lock_guard guard(class_lock);
    const attribute_of file = look_up(path);
    if (!exists(file)) {
        return -ENODEV;
    }
    std::string text(bytes, size);
    if (text.ends_with('\n')) {
        text.pop_back();
    }
    const int result = file.attribute == "trigger" ? set_trigger(*file.led, text) : set_value(file, text);
    return result < 0 ? result : static_cast<int>(size);
}

static int class_truncate(const char *, off_t, fuse_file_info *)
{
    return 0; // attributes have no length
}

// What the library itself never frees.
extern "C" const char *__lsan_default_suppressions();
extern "C" const char *__lsan_default_suppressions()
{
    return "leak:libfuse3";
}

bool mount_led_class(const std::string &folder, const std::vector<class_led> &leds)
{
    fuse_operations operations = {};
    operations.getattr = class_getattr;
    operations.open = class_open;
    operations.read = class_read;
    operations.write = class_write;
    operations.truncate = class_truncate;
    char name[] = "led_class";
    char *arguments[] = {name, nullptr};
    fuse_args args = FUSE_ARGS_INIT(1, arguments);

    class_leds = leds;
    mounted_at = folder;
    mounted = fuse_new(&args, &operations, sizeof operations, nullptr);
    fuse_opt_free_args(&args);
    if (geteuid() != 0 || mounted == nullptr || fuse_mount(mounted, folder.c_str()) != 0) {
        return false;
    }
    server = std::thread([] { fuse_loop(mounted); });
    return true;
}

void unmount_led_class()
{
    umount2(mounted_at.c_str(), MNT_FORCE | MNT_DETACH); // ends the server
    server.join();
    fuse_unmount(mounted);
    fuse_destroy(mounted);
    mounted = nullptr;
}

std::string class_led_shows(const std::string &name)
{
    const std::lock_guard guard(class_lock);
    const auto led =
        std::find_if(class_leds.begin(), class_leds.end(), [&](const class_led &one) { return one.name == name; });
    if (led->brightness == 0) {
        return "off";
    }
    const std::string level = std::to_string(led->brightness);
    return led->blinks ? "blink " + level + " " + std::to_string(led->delay_on) + "/" + std::to_string(led->delay_off)
                       : "on " + level;
}
