// What each product shows when the daemon starts.
#pragma once

// Runs the initial scene of the product that this device is. Main thread, once, before any other thread exists.
void kiv_led_init();

// The data card and the paper-kite hear no power events: they are on from here on.
void kiv_led_datacard_init();
void kiv_led_paperkite_init();
