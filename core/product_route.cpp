#include "core/product_route.h"

static auto handler_of_this_product(const product_route &route)
{
    switch (static_cast<led_product>(int{led_product_type})) {
    case LED_PRODUCT_UFI:
        return route.ufi;
    case LED_PRODUCT_DATA_CARD:
        return route.data_card;
    case LED_PRODUCT_PAPER_KITE:
        return route.paper_kite;
    case LED_PRODUCT_MODULE:
        return route.module;
    case LED_PRODUCT_UNI_CORE_CPE:
        return route.uni_core_cpe;
    case LED_PRODUCT_COUNT:
        break;
    }
    return static_cast<void (*)(int)>(nullptr);
}

void kiv_led_route(const product_route &route, int value)
{
    const auto handler = handler_of_this_product(route);

    if (handler != nullptr) {
        handler(value);
    }
}
