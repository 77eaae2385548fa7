#include "nightmode/kiv_led_tr181.h"

#include "core/led_log.h"
#include "kiv/tr181.h"

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <unistd.h>

constexpr char led_log_source[] = "kiv_led_tr181";

constexpr unsigned wait_s = 40;
constexpr unsigned pause_s = 1;
constexpr uint16_t param_is_set = 1;

struct tr181_led {
    char name[64]; // NUL-padded, like the others
    char status[32];
    char location[32];
};

constexpr auto tr181_leds = std::array{
    tr181_led{"cpe-power",    "InUse",      "Front"},
    tr181_led{"cpe-wifi",     "InUse",      "Front"},
    tr181_led{"cpe-phone",    "InUse",      "Front"},
    tr181_led{"cpe-network",  "InUse",      "Front"},
    tr181_led{"cpe-battery",  "InUse",      "Front"},
    tr181_led{"cpe-signal",   "InUse",      "Front"},
    tr181_led{"cpe-WAN/LAN1", "Controlled", "Back" },
    tr181_led{"cpe-LAN2",     "Controlled", "Back" },
    tr181_led{"cpe-LAN3",     "Controlled", "Back" },
    tr181_led{"cpe-LAN4",     "Controlled", "Back" },
};

using tr181_record = std::array<unsigned char, KIV_TR181_RECORD_SIZE>;

// The records are zero at first and every text is copied whole with its padding, so each one is terminated by the
// rest of its field.
static void put(tr181_record &record, int offset, const void *value, size_t size)
{
    std::memcpy(record.data() + offset, value, size);
}

static void put_path(tr181_record &record, int32_t instance, const char *path)
{
    put(record, KIV_TR181_INSTANCE, &instance, sizeof instance);
    put(record, KIV_TR181_PATH, path, std::strlen(path) + 1);
}

static void put_param(tr181_record &record, int flag_offset, int offset, const void *value, size_t size)
{
    put(record, flag_offset, &param_is_set, sizeof param_is_set);
    put(record, offset, value, size);
}

void *kiv_tr181_led_init(void *)
{
    LED_ERROR("[kiv_tr181_led_init] start !");
    sleep(wait_s);
    libkiv_tr181_Init();
    kiv_tr181_leds_update();
    kiv_tr181_ledsled_update();
    return nullptr;
}

void kiv_tr181_leds_update()
{
    LED_ERROR("kiv_tr181_leds_update\n");

    tr181_record record = {};
    const int32_t entries = tr181_leds.size();
    put_path(record, 1, "DEV.LEDS");
    put_param(record, KIV_TR181_PARAM1_FLAG, KIV_TR181_PARAM1, &entries, sizeof entries);

    const int ret = libkiv_tr181_set_tbl(KIV_TR181_TBL_LEDS, record.data(), 1, 0);
    LED_ERROR("kiv_tr181_leds_update ret:%d", ret);
}

void kiv_tr181_ledsled_update()
{
    LED_ERROR("kiv_tr181_ledsled_update\n");

    tr181_record record = {};
    unsigned n = 0;
    for (const tr181_led &led : tr181_leds) {
        ++n;
        char path[32];
        std::snprintf(path, sizeof path, "%s%u", "DEV.LEDS.LED", n);
        put_path(record, static_cast<int32_t>(n), path);
        put_param(record, KIV_TR181_PARAM1_FLAG, KIV_TR181_PARAM1, led.name, sizeof led.name);
        put_param(record, KIV_TR181_PARAM2_FLAG, KIV_TR181_PARAM2, led.status, sizeof led.status);
        put_param(record, KIV_TR181_PARAM3_FLAG, KIV_TR181_PARAM3, led.location, sizeof led.location);

        const int ret = libkiv_tr181_set_tbl(KIV_TR181_TBL_LEDS_LED, record.data(), 1, 0);
        LED_ERROR("kiv_tr181_ledsled_update:set LED%d ret:%d", static_cast<int>(n) - 1, ret);
        sleep(pause_s);
    }
}
