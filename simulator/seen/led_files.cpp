#include "seen/led_files.h"

#include "language/words.h"
#include "world/device.h"

#include <filesystem>

namespace
{
constexpr int LEVEL_MAX = 4;

int read_int(const std::string &device, const std::string &file)
{
    std::string text;
    read_device_text(device, file, text);
    return static_cast<int>(parse_number(text, 0, INT32_MAX).value_or(0));
}

// An LED that is on, however weakly, is so at level 1 at least.
int level_of(int brightness, int highest)
{
    if (brightness <= 0 || highest <= 0) {
        return 0;
    }
    return std::max(1, static_cast<int>((int64_t{brightness} * LEVEL_MAX + highest / 2) / highest));
}

led_look read_look(const std::string &device, const std::string &folder)
{
    std::string trigger;
    led_look look;
    read_device_text(device, folder + "/trigger", trigger);
    look.brightness = level_of(read_int(device, folder + "/brightness"), read_int(device, folder + "/max_brightness"));
    if (look.brightness == 0) {
        return {};
    }
    look.mode = trigger == "timer" ? led_mode::BLINK : led_mode::ON;
    if (look.mode == led_mode::BLINK) {
        look.blink_time1 = read_int(device, folder + "/delay_on");
        look.blink_time2 = read_int(device, folder + "/delay_off");
    }
    return look;
}

// As the stand-in would have traced it.
trace_entry request_for(const std::string &name, const led_look &look)
{
    trace_entry entry;
    const std::string level = std::to_string(look.brightness);
    entry.call = "kiv_bsp_set_leds_sync";
    entry.arguments = name + (look.mode == led_mode::OFF ? " off 0" : " on " + level);
    if (look.mode == led_mode::BLINK) {
        entry.arguments =
            name + " blink " + level + " " + std::to_string(look.blink_time1) + "/" + std::to_string(look.blink_time2);
    }
    entry.result = "0";
    entry.line = entry.call + "(" + entry.arguments + ") = 0";
    return entry;
}
} // namespace

std::vector<trace_entry> read_led_files(const std::string &device, const observed &state)
{
    std::vector<trace_entry> entries;
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const std::string name(led_name(led));
        const led_look look = name.empty() ? led_look{} : read_look(device, "leds/led:" + name);
        if (!(look == state.leds[static_cast<size_t>(led)])) {
            entries.push_back(request_for(name, look));
        }
    }
    return entries;
}
