// The initial scenes of the data card and the paper-kite. They hear no power events: from here on they count as on and
// awake. Main thread, once, before any other thread exists.
#pragma once

void kiv_led_datacard_init();
void kiv_led_paperkite_init();
