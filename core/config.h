// The device configuration that decides whether the LED logic runs and as which product.
#pragma once

// Fills led_enable (item 531), product_type_str and led_product_type (item 6000). Main thread, once.
void kiv_led_get_cfg();
