#include "core/config.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "kiv/cfg.h"

#include <cstdint>
#include <string_view>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";
constexpr int CFG_FAILURE = -1; // any other result is success

// Whether configuration item 6000 names the product by this text.
static bool is_named(led_product product, std::string_view text)
{
    switch (product) {
    case LED_PRODUCT_UFI:
        return text == "NO_DRIVER_UFI" || text == "DRIVER_UFI";
    case LED_PRODUCT_DATA_CARD:
        return text == "ONLY_DATA_CARD" || text == "NO_DRIVER_DATA_CARD" || text == "DRIVER_DATA_CARD";
    case LED_PRODUCT_PAPER_KITE:
        return text == "PAPER_KITE";
    case LED_PRODUCT_MODULE:
        return text == "MODULE";
    case LED_PRODUCT_UNI_CORE_CPE:
        return text == "UNI_CORE_CPE";
    }
    return false;
}

static void read_led_enable()
{
    uint8_t enable = 0;

    if (kiv_cfg_get_item(KIV_CFG_9X15_LED_ID, &enable, sizeof enable) == CFG_FAILURE) {
        LED_ERROR("get KIV_CFG_9X15_LED_ID error!!!\n");
        return;
    }
    led_enable = enable;
    LED_INFO("get led cfg success,led_enable: %d\n", enable);
    if (enable == 0) {
        LED_INFO("led function disable, return!!!\n");
    }
}

// A text that names none leaves the product as it is.
static void read_product_type()
{
    if (kiv_cfg_get_item(KIV_CFG_PRODUCT_TYPE_ID, product_type_str, sizeof product_type_str) == CFG_FAILURE) {
        LED_ERROR("get KIV_CFG_PRODUCT_TYPE_ID error!!!\n");
        return;
    }
    product_type_str[sizeof product_type_str - 1] = '\0';
    LED_INFO("get modem type cfg success: %s\n", product_type_str);
    for (int product = 0; product < LED_PRODUCT_COUNT; ++product) {
        if (is_named(static_cast<led_product>(product), product_type_str)) {
            led_product_type = product;
        }
    }
}

void kiv_led_get_cfg()
{
    read_led_enable();
    read_product_type();
}
