// A folder that behaves as the kernel's LED class: what a program writes is judged, and changes other files.
#pragma once

#include <string>
#include <vector>

struct class_led {
    std::string name;
    unsigned max_brightness;
    unsigned brightness = 0;
    bool blinks = false; // the trigger is "timer"
    unsigned delay_on = 0;
    unsigned delay_off = 0;
};

// One at a time. False for who may not mount a file system: root may.
bool mount_led_class(const std::string &folder, const std::vector<class_led> &leds);
void unmount_led_class();

std::string class_led_shows(const std::string &name); // "off", "on 64" or "blink 64 800/1200"
