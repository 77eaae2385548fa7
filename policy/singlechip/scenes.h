// The single-chip CPE's power-state machine: main-control events and sleep become whole-device scenes. Receive thread.
#pragma once

#include <cstdint>

// event: REG_MC_*; others are ignored. Shutting down and resetting are answered to the main-control module.
void kiv_singlechip_led_handle_mc_event(uint32_t event);

// sleep_status: 5 goes to sleep, any other value wakes up, in every power state.
void kiv_singlechip_led_handle_sleep_status_change(int sleep_status);

// Network type, signal and Wi-Fi from NV; the handlers keep dark what the power state forbids. Also the initial scene,
// on the main thread.
void kiv_led_singlechip_init();
