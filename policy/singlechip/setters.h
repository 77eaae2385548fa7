// The single-chip CPE's setters: one indicator value to one LED. No state. Receive thread.
#pragma once

void kiv_singlechip_led_set_sigal_status(int signal_state); // 0 dark, 1 blinking, 2 to 5 lit; others change nothing
void kiv_singlechip_led_set_voice_status(int state);        // phone_state; others change nothing
