// The Wi-Fi LED: whether the access point is on and whether WPS pairing runs. It shows the last thing applied.
#pragma once

// From the Wi-Fi module's notifications, as decimal text: Wi-Fi 0 off, 1 on, others change nothing; WPS 1 pairing, any
// other lights the LED. Receive thread; the Wi-Fi status also on the main thread, from the initial scene.
void kiv_led_set_led_wifi_status(const char *wifi_status_text);
void kiv_led_set_led_wps_status(const char *wps_status_text);

void kiv_led_set_led_wifi_init();   // from NV "wifi_onoff_state", once on; main and receive thread
void kiv_led_set_led_wakeup_wlan(); // from NV "RadioOff", at wake-up; receive thread
void kiv_led_set_wifi_wps_state();  // from NV "wifi_onoff_state" and both chips' WPS states, at relight; receive thread
