#include "policy/cpe/state.h"

#include "painters/net_led.h"

constinit led_word cur_cpe_power_state;
constinit led_word cur_cpe_net_type{NET_NO_SERVICE};
constinit led_word cur_cpe_charger_state{CHARGER_UNKNOWN};
constinit led_word cur_cpe_ppp_status;
constinit led_word cur_cpe_roam_status;
constinit led_word cur_cpe_signal_state;
constinit led_word cur_cpe_voicemail_state;
constinit led_word cur_cpe_battery_status;
