// Main-control events as a table: what is logged on receipt, the scene, and the answer.
#pragma once

#include <cstdint>
#include <span>

struct mc_event_row {
    uint32_t event;   // REG_MC_*
    const char *line; // logged on receipt; nullptr: none
    void (*scene)();  // nullptr: the product shows nothing
    int reverser = 0; // sent to the main-control module once the scene has run; 0: none
};

// Runs the row of the event; an event without one is ignored. led_log_source: the product's log name. Receive thread.
void kiv_led_run_mc_event(std::span<const mc_event_row> rows, uint32_t event, const char *led_log_source);
