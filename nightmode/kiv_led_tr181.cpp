#include "nightmode/kiv_led_tr181.h"

#include "ground/led_log.h"
#include "kiv/tr181.h"

#include <array>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <span>
#include <unistd.h>

constexpr char LED_LOG_SOURCE[] = "kiv_led_tr181";

constexpr unsigned WAIT_S = 40;
constexpr unsigned PAUSE_S = 1;
constexpr uint16_t PARAM_IS_SET = 1;

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

static void put(tr181_record &record, int offset, const void *value, size_t size)
{
    std::memcpy(record.data() + offset, value, size);
}

static void put_path(tr181_record &record, int32_t instance, const char *path)
{
    put(record, KIV_TR181_INSTANCE, &instance, sizeof instance);
    put(record, KIV_TR181_PATH, path, std::strlen(path) + 1);
}

// The text may fill its own length; what is behind it in the field terminates it.
static void put_text(tr181_record &record, int offset, int field_size, std::span<const char> text)
{
    std::memset(record.data() + offset, 0, static_cast<size_t>(field_size));
    put(record, offset, text.data(), text.size());
}

static void set_flag(tr181_record &record, int offset)
{
    put(record, offset, &PARAM_IS_SET, sizeof PARAM_IS_SET);
}

// DEV.LEDS: the number of LEDs.
static void kiv_tr181_leds_update()
{
    LED_ERROR("kiv_tr181_leds_update\n");

    tr181_record record = {};
    const int32_t entries = tr181_leds.size();
    put_path(record, 1, "DEV.LEDS");
    set_flag(record, KIV_TR181_PARAM1_FLAG);
    put(record, KIV_TR181_PARAM1, &entries, sizeof entries);

    const int ret = libkiv_tr181_set_tbl(KIV_TR181_TBL_LEDS, record.data(), 1, 0);
    LED_ERROR("kiv_tr181_leds_update ret:%d", ret);
}

// DEV.LEDS.LED1 to LED10, one a second.
static void kiv_tr181_ledsled_update()
{
    LED_ERROR("kiv_tr181_ledsled_update\n");

    tr181_record record = {};
    unsigned n = 0;
    for (const tr181_led &led : tr181_leds) {
        ++n;
        char path[32];
        std::snprintf(path, sizeof path, "%s%u", "DEV.LEDS.LED", n);
        put_path(record, static_cast<int32_t>(n), path);
        set_flag(record, KIV_TR181_PARAM1_FLAG);
        put_text(record, KIV_TR181_PARAM1, KIV_TR181_PARAM1_SIZE, led.name);
        set_flag(record, KIV_TR181_PARAM2_FLAG);
        put_text(record, KIV_TR181_PARAM2, KIV_TR181_PARAM2_SIZE, led.status);
        set_flag(record, KIV_TR181_PARAM3_FLAG);
        put_text(record, KIV_TR181_PARAM3, KIV_TR181_PARAM3_SIZE, led.location);

        const int ret = libkiv_tr181_set_tbl(KIV_TR181_TBL_LEDS_LED, record.data(), 1, 0);
        LED_ERROR("kiv_tr181_ledsled_update:set LED%d ret:%d", static_cast<int>(n) - 1, ret);
        sleep(PAUSE_S);
    }
}

void *kiv_tr181_led_init(void *)
{
    LED_ERROR("[kiv_tr181_led_init] start !");
    sleep(WAIT_S);
    libkiv_tr181_Init();
    kiv_tr181_leds_update();
    kiv_tr181_ledsled_update();
    return nullptr;
}
