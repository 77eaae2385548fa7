// The LED groups: the LEDs of one indicator, of which at most one colour is lit. Policies reach the board only through
// these functions. A failed request is logged here and goes no further. Any thread; each returns when the board is
// done.
#pragma once

// One LED step, in the argument order of the operation functions.
struct led_step {
    int led_id;        // LED_*, kiv/adabsp.h
    int led_operation; // LED_OP_ON, LED_OP_OFF, LED_OP_BLINK
    int blink_time1;   // ms; 0 unless it blinks
    int blink_time2;   // ms; 0 unless it blinks
    int brightness;    // 0 to 4; 0 when off
};

using led_operation_function = void(int led_id, int led_operation, int blink_time1, int blink_time2, int brightness);

// Makes the step through a group's operation function.
inline void kiv_led_apply(led_operation_function *operation, const led_step &step)
{
    operation(step.led_id, step.led_operation, step.blink_time1, step.blink_time2, step.brightness);
}

// Off functions: every LED of the group off, in the group's order. They do not pass the night-mode gate.
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

// Operation functions: one LED of the group. sig, net, power and wifi pass the night-mode gate; all but sig, power and
// wifi switch their group off first. power refuses every LED but LED_POWER_BLUE, voicemail every LED outside its group.
led_operation_function kiv_led_set_sig_led_operation;
led_operation_function kiv_led_set_net_led_operation;
led_operation_function kiv_led_set_rssi_led_operation;
led_operation_function kiv_led_set_power_led_operation;
led_operation_function kiv_led_set_bat_led_operation;
led_operation_function kiv_led_set_wifi_led_operation;
led_operation_function kiv_led_set_sms_led_operation;
led_operation_function kiv_led_set_flow_led_operation;
led_operation_function kiv_led_set_voicemail_led_operation;
led_operation_function kiv_led_set_voice_led_operation;
led_operation_function kiv_led_set_sigbar_led_operation;

// A single LED, whatever its group: no gate, no group off, no entry line.
led_operation_function kiv_led_set_led_operation;
