// The battery indication of whichever product this device is.
#pragma once

// Recomputes the battery LEDs of the handheld or of the module CPE; other products have none. Any thread.
void kiv_led_battery_query_dispatch();
