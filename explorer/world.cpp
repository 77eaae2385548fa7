#include "world.h"

#include <cstdio>
#include <cstdlib>
#include <vector>

world_state world;
world_record happened;

namespace
{
struct text_key {
    std::string path;
    std::vector<std::string> texts; // the first has number 1
    bool is_read;                   // by the daemon
};

std::vector<text_key> keys;
std::vector<led_look> looks;
} // namespace

void give_up(const std::string &why)
{
    fprintf(stderr, "kiv_led_explore: %s\n", why.c_str());
    abort();
}

void open_world()
{
    looks = {led_look{}};
    world = {};
    for (text_key &key : keys) {
        key.is_read = false;
    }
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
    keys.push_back({std::string(path), {}, false});
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

bool was_read(std::string_view path)
{
    return keys[key_number(path)].is_read;
}

const std::string *read_text(uint8_t key)
{
    keys[key].is_read = true;
    return text_at(key);
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

const led_look &look_at(uint8_t index)
{
    return looks[index];
}
