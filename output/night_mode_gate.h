// The night-mode brightness gate: the one place where night mode changes an LED request on its way to the board.
#pragma once

// Rewrites operation and brightness in place while is_night_mode is 1: the red, blue and white net LEDs are dimmed
// when night_mode_close_all_led is 0, every other LED becomes off. Any thread.
void kiv_led_night_mode_check(int led_id, int *led_operation, int *brightness);
