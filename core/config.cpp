#include "core/config.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "kiv/cfg.h"

#include <array>
#include <cstdint>
#include <string_view>

constexpr char led_log_source[] = "kiv_mirta_led";
constexpr int cfg_failure = -1; // any other result is success

struct product_type_row {
    std::string_view text;
    led_product product;
};

// Any other text leaves the product as it is.
constexpr auto product_type_rows = std::array{
    product_type_row{"ONLY_DATA_CARD",      LED_PRODUCT_DATA_CARD   },
    product_type_row{"NO_DRIVER_DATA_CARD", LED_PRODUCT_DATA_CARD   },
    product_type_row{"DRIVER_DATA_CARD",    LED_PRODUCT_DATA_CARD   },
    product_type_row{"NO_DRIVER_UFI",       LED_PRODUCT_UFI         },
    product_type_row{"DRIVER_UFI",          LED_PRODUCT_UFI         },
    product_type_row{"MODULE",              LED_PRODUCT_MODULE      },
    product_type_row{"PAPER_KITE",          LED_PRODUCT_PAPER_KITE  },
    product_type_row{"UNI_CORE_CPE",        LED_PRODUCT_UNI_CORE_CPE},
};

static void read_led_enable()
{
    uint8_t enable = 0;

    if (kiv_cfg_get_item(KIV_CFG_9X15_LED_ID, &enable, sizeof enable) == cfg_failure) {
        LED_ERROR("get KIV_CFG_9X15_LED_ID error!!!\n");
        return;
    }
    led_enable = enable;
    LED_INFO("get led cfg success,led_enable: %d\n", enable);
    if (enable == 0) {
        LED_INFO("led function disable, return!!!\n");
    }
}

static void read_product_type()
{
    if (kiv_cfg_get_item(KIV_CFG_PRODUCT_TYPE_ID, product_type_str, sizeof product_type_str) == cfg_failure) {
        LED_ERROR("get KIV_CFG_PRODUCT_TYPE_ID error!!!\n");
        return;
    }
    product_type_str[sizeof product_type_str - 1] = '\0';
    LED_INFO("get modem type cfg success: %s\n", product_type_str);
    for (const product_type_row &row : product_type_rows) {
        if (row.text == product_type_str) {
            led_product_type = row.product;
            return;
        }
    }
}

void kiv_led_get_cfg()
{
    read_led_enable();
    read_product_type();
}
