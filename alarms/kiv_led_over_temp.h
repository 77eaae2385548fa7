// The over-temperature alarm: the signal LED blinks while a board sensor is above the limit.
#pragma once

// Reads the limit from NV "thermal_led_enable" (0 or less switches the alarm off), scans the sensors and keeps a 20 s
// poll. May be run again at any time. Main thread, and receive thread for message KIV_MSG_CMD_LED_OVER_TEMP_MSG.
void kiv_led_over_temp_init();

void kiv_led_over_temp_check(void *unused); // the poll, on the timer thread

// Applies a scan: over is 1 when a sensor is above the limit. Acts on a change only.
void kiv_led_set_over_temp_state(int over);

// The alarm's blink, also for the relight. Any thread.
void kiv_led_show_over_temp_blink();
