// Publishes the device's LED table into the TR-181 data model, once, 40 s after start.
#pragma once

// Body of the TR-181 thread: waits, publishes and ends. The argument is ignored; returns null.
void *kiv_tr181_led_init(void *unused);
