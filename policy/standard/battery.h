// The handheld's battery LEDs: charge while on battery, charging state on the charger. No state of its own.
#pragma once

// Shows what NV "battery_charging", "battery_exist" and "battery_value" say, while on or charging in a power-off mode,
// and awake. Main (initial scene) and receive thread.
void kiv_led_query_battery_state();

// 0 not charging, 1 charging, 2 charged, 3 no battery; other values change nothing.
void kiv_led_set_led_when_charging_status_change(int charging_status);

// Shows the charge in percent, from NV "battery_value".
void kiv_led_set_led_when_power_percent_change();
