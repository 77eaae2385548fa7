// The module CPE's indicator values: remembered while on, and shown when they change. Receive thread; the network and
// signal handlers also on the main thread at start.
#pragma once

// While not on, these four drop the value: power-on reads roaming, network type and signal again.
void kiv_cpe_led_handle_nwinfoStatus(int net_type); // net_class
void kiv_cpe_led_handle_nwRoamStatus(int roaming);  // 0 home, 1 roaming
void kiv_cpe_led_handle_pppStatus(int ppp);         // 1 while a data call is up
void kiv_cpe_led_handle_signal_state(int bars);     // 0 to 5

// Remembered also while not on, so that power-on shows a voicemail that came before.
void kiv_cpe_led_handle_voicemail_state(int state); // 1 voicemail waiting
