// The module CPE's power transitions. Receive thread.
#pragma once

#include <cstdint>

// event: REG_MC_*; others are ignored. Shutting down is answered to the main-control module.
void kiv_cpe_led_handle_mc_event(uint32_t event);

// Sleep and wake-up change no LED on this product: only logged.
void kiv_cpe_led_set_led_when_sleep_status_change(int sleep_status);

// The initial scene: the charger's LED; the others wait for power-on. Main thread.
void kiv_led_cpe_init();
