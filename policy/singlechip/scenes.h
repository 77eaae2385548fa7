// The single-chip CPE's power-state machine and whole-device scenes. All run on the receive thread;
// kiv_led_singlechip_init also on the main thread at start.
#pragma once

#include <cstdint>

// event: REG_MC_*; others are ignored. Shutting down and resetting are answered to the main-control module.
void kiv_singlechip_led_handle_mc_event(uint32_t event);

// sleep_status: 5 goes to sleep, any other value wakes up, in every power state.
void kiv_singlechip_led_handle_sleep_status_change(int sleep_status);

// Network type, signal and Wi-Fi from NV; the handlers keep dark what the power state forbids.
void kiv_led_singlechip_init();

void kiv_singelchip_led_set_led_when_power_on();
void kiv_singelchip_led_set_led_when_power_off();
void kiv_singelchip_led_set_led_when_resetting();
void kiv_singlechip_330x_led_set_all_leds_off(); // power, Wi-Fi, net and signal
void kiv_singlechip_led_set_all_white_leds_on();
void kiv_singlechip_led_set_led_when_wakeup();
void kiv_singlechip_led_set_all_leds_off_when_sleep(); // net and signal
