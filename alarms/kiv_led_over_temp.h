// The over-temperature alarm: the signal LED blinks while a board sensor is above the limit.
#pragma once

// Reads the limit from NV "thermal_led_enable" (0 or less switches the alarm off), scans the sensors and keeps a 20 s
// poll. May be run again at any time. Main thread, and receive thread for message KIV_MSG_CMD_LED_OVER_TEMP_MSG.
void kiv_led_over_temp_init();

// The alarm's blink, which the board keeps running: requested when the alarm begins, and again by a relight. Any
// thread.
void kiv_led_show_over_temp_blink();
