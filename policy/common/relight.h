// Relight: re-issues the LEDs of a device that is on, so that they pass the night-mode gate again.
#pragma once

// Message KIV_MSG_CMD_LED_RELIGHT_MSG: signal, power, Wi-Fi and net LED. Asleep, only the Wi-Fi LED
// stays dark. Receive thread.
void kiv_led_handle_relight_msg();
