// The single-chip CPE's signal LED: the signal level as brightness.
#pragma once

// bars: from NV "signalbar", shown as level 0 to 3 while on and awake; during an over-temperature alarm the level is
// only stored. Main (initial scene) and receive thread.
void kiv_singlechip_led_handle_signal_state(int bars);
