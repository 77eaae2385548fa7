// The handheld's power-state machine: main-control events and sleep become whole-device scenes.
// All run on the receive thread; kiv_led_std_init also on the main thread at start.
#pragma once

#include <cstdint>

// event: REG_MC_*; others are ignored. Shutting down, resetting and power-off-quicken-ack are answered to the
// main-control module once their scene has run.
void kiv_led_handle_mc_event(uint32_t event);

// sleep_status: 1 goes to sleep, any other value wakes up; only while on.
void kiv_led_set_led_when_sleep_status_change(int sleep_status);

// Shows every indication afresh; while not yet on, only what shows then.
void kiv_led_std_init();

void kiv_led_set_all_leds_off(); // battery, net, Wi-Fi and SMS
void kiv_led_set_all_leds_on();
void kiv_led_set_led_when_initial();  // self-test flash; blocks for 200 ms
void kiv_led_set_led_when_power_on(); // may wait up to 5 s for the rolling LEDs to stop
void kiv_led_set_led_when_power_off();
void kiv_led_set_led_when_power_off_quicken();
void kiv_led_set_led_when_power_off_charge();
void kiv_led_set_led_when_power_off_charge_quicken();
void kiv_led_set_led_when_power_off_unreal();
void kiv_led_set_led_when_resetting();
void kiv_led_set_led_when_wakeup();
