// Where a value of a shared notification goes, by product: written with the products' names, one a line.
#pragma once

#include "core/led_ctx.h"

struct product_route {
    void (*ufi)(int) = nullptr; // nullptr: the product shows nothing
    void (*data_card)(int) = nullptr;
    void (*paper_kite)(int) = nullptr;
    void (*module)(int) = nullptr;
    void (*uni_core_cpe)(int) = nullptr;
};

// Hands the value to the handler of the product that this device is.
void kiv_led_route(const product_route &route, int value);
