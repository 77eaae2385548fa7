// Start-up: brings the daemon up in a fixed order.
#pragma once

// Handshake, configuration, registration, initial scene, threads, report, alarms and night mode, on the main thread.
// Returns 0 once everything runs, -1 when the receive thread or the IPC listen thread could not be created.
int kiv_led_start();
