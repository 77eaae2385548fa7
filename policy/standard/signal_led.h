// The signal LED of the data card (dark, blinking, lit) and of the single-chip CPE (signal level as brightness).
#pragma once

// Data card: bars from NV "signalbar". No power or sleep guard. Main (initial scene) and receive thread.
void kiv_led_handle_signal_state(int bars);

// Data card: 0 dark, 6 blinking, 7 lit; other states change nothing.
void kiv_set_signal_led_state(int state);

// Single-chip CPE: bars from NV "signalbar", shown as level 0 to 3 while on and awake; during an over-temperature alarm
// the level is only stored. Main (initial scene) and receive thread.
void kiv_singlechip_led_handle_signal_state(int bars);

// Single-chip CPE: shows a level, 0 to 3, also to give the LED back after an alarm. Any thread.
void kiv_qt330x_set_led_signal_state(int level);
