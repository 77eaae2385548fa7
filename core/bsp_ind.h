// The board's battery and charger indications, and the thread that hears them. Only the module CPE registers for them.
#pragma once

// Main thread, once, before the IPC listen thread starts.
void kiv_led_register_bsp_ind();

// Called by the board-support library on the IPC listen thread. ind_msg_struct: its record, only checked for null.
// Returns 0, or -1 for a null record.
int kiv_led_bspIpcCallBack(int event_id, int arg2, void *ind_msg_struct);

// Selectors: hand an indication to the product's handler, or drop it. IPC listen thread.
void kiv_led_battery_ind_dispatch(int present);
void kiv_led_charger_ind_dispatch(int connected);

// Body of the IPC listen thread: runs the event loop. Returns null if the loop ever ends.
void *kiv_led_ipc_server_thread(void *unused);
