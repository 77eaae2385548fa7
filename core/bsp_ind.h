// The board's battery and charger indications, and the thread that hears them.
#pragma once

// Registers for all four indications on a product that hears them, else for none. Main thread, once, before the IPC
// listen thread starts.
void kiv_led_register_bsp_ind();

// Body of the IPC listen thread: runs the event loop. Returns null if the loop ever ends.
void *kiv_led_ipc_server_thread(void *unused);
