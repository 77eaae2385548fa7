// The module CPE's battery and charger. Receive thread and, from the board's indications, the IPC listen thread; the
// main thread at start.
#pragma once

// Recomputes the battery status from the board's query and NV "battery_charging" and "battery_value", and shows a
// change.
void kiv_cpe_led_handle_battery_state();

// state: charger_state. Remembered and shown in every power state.
void kiv_cpe_led_handle_charger_state(int state);

// Asks the board for the charger and handles the answer; without a valid one the remembered state is handled again.
void getChargerConnect();
