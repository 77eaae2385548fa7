// The daily night-mode window: inside it the LEDs are dark, or the net LED alone is dimmed.
#pragma once

// Reads the settings from NV ("night_mode_start_time", "night_mode_end_time", "night_mode_switch",
// "night_mode_close_all_led"), checks at once, and keeps a 20 s timer while the switch is 1 or 2. May be run again at
// any time. Main thread, and receive thread for message KIV_MSG_CMD_LED_NIGHT_MODE_MSG.
void kiv_led_night_mode_init();
