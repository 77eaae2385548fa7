// The one message that the daemon sends to another module: the common reverser message.
#pragma once

#include <cstdint>

// Tells a module (KIV_MODULE_MAIN) that an event's scene has run. value: a number of four digits, sent as text.
// Success or failure is logged; nothing is retried. Receive thread.
void kiv_led_send_common_reverser_msg(uint16_t dest_module_id, int value);

// The values that the main-control module waits for.
constexpr int REVERSER_SHUTTING_DOWN = 4096;
constexpr int REVERSER_RESETTING = 4097;
constexpr int REVERSER_POWER_OFF_QUICKEN = 4104;
