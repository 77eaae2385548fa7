// The module CPE's setters: indicator values to LEDs. No state; any thread.
//
// The signal indication and the phone LED are one group of LEDs, so each of them switches the other off.
#pragma once

void kiv_cpe_set_led_net_led_status(int type, int roam);          // type: net_class; roam: 0 home; 5G shows nothing
void kiv_cpe_set_led_sig_led_status(int type, int sig, int roam); // sig: bars, 0 to 5; roam is only logged
void kiv_cpe_led_set_bat_status(int status, int power_state);     // cpe_battery_status; dark unless POWER_ON
void kiv_cpe_led_set_power_status(int charger);                   // charger_state, policy/cpe/state.h
void kiv_cpe_led_set_voicemail_status(int voicemail);             // 1 voicemail waiting
void kiv_cpe_led_set_voice_status(int phone);                     // phone_state; others change nothing
void kiv_cpe_led_set_all_leds_off(); // battery, net, voice and voicemail; not the power LED

enum cpe_battery_status : int {
    CPE_BAT_NOTHING = 0,
    CPE_BAT_HIGH = 1,
    CPE_BAT_MIDDLE = 2,
    CPE_BAT_LOW = 3,
    CPE_BAT_CHARGING_HIGH = 4,
    CPE_BAT_CHARGING_MIDDLE = 5,
    CPE_BAT_CHARGING_LOW = 6,
    CPE_BAT_NONE = 7
};
