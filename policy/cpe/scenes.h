// The module CPE's power transitions. All run on the receive thread; kiv_led_cpe_init on the main thread at start.
#pragma once

#include <cstdint>

// event: REG_MC_*; others are ignored. Shutting down is answered to the main-control module.
void kiv_cpe_led_handle_mc_event(uint32_t event);

// Sleep and wake-up change no LED on this product: only logged.
void kiv_cpe_led_set_led_when_sleep_status_change(int sleep_status);

// The initial scene: the charger's LED; the others wait for power-on.
void kiv_led_cpe_init();

void kiv_cpe_led_set_led_when_power_on();
void kiv_cpe_led_set_led_when_power_off();
void kiv_cpe_led_set_led_when_power_off_unreal();
void kiv_cpe_led_set_led_when_power_off_charge();
