// What the module CPE remembers of its indicators. It keeps a power state of its own; led_power_state stays 0 on it.
#pragma once

#include "core/led_ctx.h"

extern led_word cur_cpe_power_state;     // power_state; power scenes
extern led_word cur_cpe_net_type;        // net_class, NET_NO_SERVICE at first; network handler
extern led_word cur_cpe_charger_state;   // 1 connected, 0 not, 2 until the first answer; charger handler
extern led_word cur_cpe_ppp_status;      // 1 while a data call is up; PPP handler
extern led_word cur_cpe_roam_status;     // 0 home, 1 roaming; roaming handler
extern led_word cur_cpe_signal_state;    // bars; signal handler
extern led_word cur_cpe_voicemail_state; // 1 voicemail waiting; voicemail handler
extern led_word cur_cpe_battery_status;  // cpe_battery_status; battery handler
