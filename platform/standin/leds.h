// The board's LEDs as folders of files, as the kernel's LED class shows them.
#pragma once

#include "kiv/adabsp.h"

// Shows the request in the LED's files. Any thread. Returns 0, or a negative errno: -EINVAL for a request that the
// board does not know, else what failed.
int leds_set(const led_request &request);
