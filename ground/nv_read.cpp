#include "ground/nv_read.h"

#include "kiv/nv.h"

#include <algorithm>
#include <climits>
#include <cstdlib>

int kiv_led_text_to_int(const char *text)
{
    const long number = std::strtol(text, nullptr, 10);

    return static_cast<int>(std::clamp<long>(number, INT_MIN, INT_MAX));
}

void kiv_led_read_nv(const char *key, std::span<char> buffer)
{
    std::fill(buffer.begin(), buffer.end(), '\0');
    kiv_nvconfig_read(key, buffer.data(), static_cast<int>(buffer.size()));
    buffer.back() = '\0';
}

nv_text kiv_led_read_nv_text(const char *key)
{
    nv_text text;

    kiv_led_read_nv(key, text);
    return text;
}

int kiv_led_read_nv_int(const char *key)
{
    return kiv_led_text_to_int(kiv_led_read_nv_text(key).data());
}
