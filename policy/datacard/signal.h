// The data card's signal LED: dark, blinking or lit by the number of bars. No power or sleep guard.
#pragma once

// bars: from NV "signalbar"; a count outside 0 to 5 changes no LED. Main (initial scene) and receive thread.
void kiv_led_handle_signal_state(int bars);
