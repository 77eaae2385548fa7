// The LED groups: the LEDs of one indicator. Every LED request of the daemon is made here and nowhere else. A failed
// one is logged here and goes no further. Any thread; each function returns when the board is done.
#pragma once

// One LED step, in the argument order of the operation functions.
struct led_step {
    int led_id;        // LED_*, kiv/adabsp.h
    int led_operation; // LED_OP_ON, LED_OP_OFF, LED_OP_BLINK
    int blink_time1;   // ms; 0 unless it blinks
    int blink_time2;   // ms; 0 unless it blinks
    int brightness;    // 0 to 4; 0 when off
};

// Off functions: every LED of the group off, in the group's order. They do not pass the night-mode gate.
// sig switches LED_SIG_BLUE alone, net leaves LED_NET_14 and LED_NET_16 as they are.
void kiv_led_set_sig_led_off();
void kiv_led_set_net_led_off();
void kiv_led_set_rssi_led_off();
void kiv_led_set_power_led_off();
void kiv_led_set_bat_led_off();
void kiv_led_set_wifi_led_off();
void kiv_led_set_sms_led_off();
void kiv_led_set_flow_led_off();
void kiv_led_set_voicemail_led_off();
void kiv_led_set_voice_led_off();
void kiv_led_set_sigbar_led_off();

// Operation functions: one LED of the group. sig, net, power and wifi pass the night-mode gate: while is_night_mode is
// 1 the red, blue and white net LEDs are dimmed when night_mode_close_all_led is 0, and every other request becomes off
// with the blink times as they came. All but sig, power and wifi switch their group off first. power refuses every LED
// but LED_POWER_BLUE, voicemail every LED outside its group.
void kiv_led_set_sig_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_net_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_rssi_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_power_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_bat_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_wifi_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_sms_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_flow_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_voicemail_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2,
                                         int brightness);
void kiv_led_set_voice_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);
void kiv_led_set_sigbar_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);

// A single LED, whatever its group: no gate, no group off, no entry line.
void kiv_led_set_led_operation(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);

// The same for a step out of a table.
inline void kiv_led_set_sig_led_operation(const led_step &s)
{
    kiv_led_set_sig_led_operation(s.led_id, s.led_operation, s.blink_time1, s.blink_time2, s.brightness);
}
inline void kiv_led_set_net_led_operation(const led_step &s)
{
    kiv_led_set_net_led_operation(s.led_id, s.led_operation, s.blink_time1, s.blink_time2, s.brightness);
}
inline void kiv_led_set_bat_led_operation(const led_step &s)
{
    kiv_led_set_bat_led_operation(s.led_id, s.led_operation, s.blink_time1, s.blink_time2, s.brightness);
}
inline void kiv_led_set_sms_led_operation(const led_step &s)
{
    kiv_led_set_sms_led_operation(s.led_id, s.led_operation, s.blink_time1, s.blink_time2, s.brightness);
}
inline void kiv_led_set_voice_led_operation(const led_step &s)
{
    kiv_led_set_voice_led_operation(s.led_id, s.led_operation, s.blink_time1, s.blink_time2, s.brightness);
}
inline void kiv_led_set_led_operation(const led_step &s)
{
    kiv_led_set_led_operation(s.led_id, s.led_operation, s.blink_time1, s.blink_time2, s.brightness);
}
