// The handheld's battery LEDs: charge while on battery, charging state on the charger. No state of its own.
#pragma once

// Shows what NV "battery_charging", "battery_exist" and "battery_value" say, while on or charging in a power-off mode,
// and awake. Main (initial scene) and receive thread.
void kiv_led_query_battery_state();
