// The SMS LED: dark, steady while messages are unread, blinking for ten seconds after a new one, blinking while the
// store is full.
#pragma once

#include <cstdint>

// Event REG_WMS_SMS_NV_UNREAD_SMS (count from NV "sms_nvunread_count"), REG_WMS_SMS_NEW_SMS or
// REG_WMS_SMS_MEMORY_FULL. While off or asleep the state is only recorded. Receive thread.
void recv_SMSstatus(uint32_t event);

// Shows and records an sms_state; the power-on and wake-up scenes pass the recorded one. Receive thread.
void kiv_led_handle_sms_state(int state);

// Ends a new message's blink before the LEDs go dark: the message counts as unread from now on. Receive thread.
void kiv_led_settle_new_sms();
