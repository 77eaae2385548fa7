// The data call's state, on every product but the module CPE.
#pragma once

// The PPP module's notifications. p_data: the state as decimal text, 1 connected; get_pppStatus reads NV
// "q6_ppp_status" instead. Both hand the state to the product's indication. Receive thread.
void recv_pppStatus(const char *p_data);
void get_pppStatus();

// ppp: 1 connected, 0 not. Remembered in every state; while on and awake it shows, and starts or stops the check of the
// allowance. Receive thread.
void kiv_led_handle_pppStatus(int ppp);
