// Which modules notify this product of what.
#pragma once

// Asks the modules for their notifications. Main thread, once, after the start handshake. Results are ignored.
void kiv_led_regNotifyMsg();
