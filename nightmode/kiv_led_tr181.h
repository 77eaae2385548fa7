// Publishes the device's LED table into the TR-181 data model, once, 40 s after start.
#pragma once

// Body of the TR-181 thread: waits, publishes and ends. The argument is ignored; returns null.
void *kiv_tr181_led_init(void *unused);

void kiv_tr181_leds_update();    // DEV.LEDS: the number of LEDs
void kiv_tr181_ledsled_update(); // DEV.LEDS.LED1 to LED10, one a second
