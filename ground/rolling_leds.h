// The board's start-up animation of rolling LEDs: whether it is over, and asking for its end.
#pragma once

// 1 when the daemon may drive the LEDs: the animation file begins with 2, or there is none; 0 while it still runs.
// Reads /sys/class/leds/led:rolling_leds/brightness. Main and receive thread.
int kiv_led_bsp_ready();

// Asks the kernel to end the animation; it is over once kiv_led_bsp_ready says so. Receive thread.
void kiv_led_stop_rolling_leds();
