// The handheld's power-state machine: main-control events and sleep become whole-device scenes. Receive thread.
#pragma once

#include <cstdint>

// event: REG_MC_*; others are ignored. Shutting down, resetting and power-off-quicken-ack are answered to the
// main-control module once their scene has run. Powering on may wait up to 5 s for the rolling LEDs to stop.
void kiv_led_handle_mc_event(uint32_t event);

// sleep_status: 1 goes to sleep, any other value wakes up; only while on.
void kiv_led_set_led_when_sleep_status_change(int sleep_status);

// Shows every indication afresh. Before power-on, as the initial scene on the main thread, its handlers light nothing.
void kiv_led_std_init();
