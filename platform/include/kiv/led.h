/* libkivled: requests to the LED daemon, for every process of the device. */
#ifndef KIV_LED_H
#define KIV_LED_H

#ifdef __cplusplus
extern "C" {
#endif

/* Asks the LED daemon to re-apply its LEDs (message KIV_MSG_CMD_LED_RELIGHT_MSG). Any thread, the daemon's own
 * included: it never blocks, and a request is never lost, also while the daemon's queue is full. Returns 0, or -1. */
int kiv_lib_led_relight_msg(void);

#ifdef __cplusplus
}
#endif
#endif
