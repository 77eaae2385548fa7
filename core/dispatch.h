// Notifications of the other modules: decoding them, and which product hears what.
#pragma once

#include "kiv/socket.h"

#include <cstdint>

// Handles one notification (MSG_CMD_SERVICE_NOTIFY). p_data is terminated, at the latest by the byte behind the
// message. Receive thread.
void regDecodeMsg(const svc_msg *msg);

// Variant selectors: hand the value to the product's handler, or drop it. Receive thread.
void kiv_led_mc_event_dispatch(uint32_t event);
void kiv_led_sleep_status_dispatch(int sleep_status);
void kiv_led_wlan_status_dispatch(const char *p_data);
void kiv_led_wps_status_dispatch(const char *p_data);
