// What the module CPE remembers of its indicators. It keeps a power state of its own; led_power_state stays 0 on it.
#pragma once

#include "ground/led_ctx.h"

enum charger_state : int { CHARGER_DISCONNECTED = 0, CHARGER_CONNECTED = 1, CHARGER_UNKNOWN = 2 };

extern led_word cur_cpe_power_state;     // power_state; power scenes
extern led_word cur_cpe_net_type;        // net_class, NET_NO_SERVICE at first; network handler
extern led_word cur_cpe_charger_state;   // charger_state, CHARGER_UNKNOWN until the first answer; query and indications
extern led_word cur_cpe_ppp_status;      // 1 while a data call is up; PPP handler
extern led_word cur_cpe_roam_status;     // 0 home, 1 roaming; roaming handler
extern led_word cur_cpe_signal_state;    // bars; signal handler
extern led_word cur_cpe_voicemail_state; // 1 voicemail waiting; voicemail handler
extern led_word cur_cpe_battery_status;  // cpe_battery_status; battery handler, on two threads
