// How the blue signal LED shows a signal level: as its brightness. Whoever borrows the LED gives it back with this
// call.
#pragma once

// level: 0 to 3 on the single-chip CPE; on a data card whatever led_signal_level holds, its bar count. Any thread.
void kiv_qt330x_set_led_signal_state(int level);
