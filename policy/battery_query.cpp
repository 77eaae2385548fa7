#include "policy/battery_query.h"

#include "core/led_ctx.h"
#include "policy/cpe/battery.h"
#include "policy/standard/battery.h"

void kiv_led_battery_query_dispatch()
{
    if (led_product_type == LED_PRODUCT_UFI) {
        kiv_led_query_battery_state();
    } else if (led_product_type == LED_PRODUCT_MODULE) {
        kiv_cpe_led_handle_battery_state();
    }
}
