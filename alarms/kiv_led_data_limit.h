// The data call's state and the monthly data-volume reminder: while a call is up and the configured share of the
// allowance is used, the net LED plays a pattern of seven seconds.
#pragma once

// The PPP module's notifications. p_data: the state as decimal text, 1 connected; get_pppStatus reads NV
// "q6_ppp_status" instead. Receive thread.
void recv_pppStatus(const char *p_data);
void get_pppStatus();

// ppp: 1 connected, 0 not. Remembered in every state; while on and awake it shows, and starts or stops the check.
// Receive thread.
void kiv_led_handle_pppStatus(int ppp);

// The check of usage against the limit, every 5 s. Stopping accepts that none runs. Receive thread.
void kiv_led_start_remind_data_limit_check();
void kiv_led_stop_remind_data_limit_check();

// The reminder on the net LED; stopping gives the LED back and accepts that none plays. Receive and timer thread.
void kiv_led_start_data_limit_remind();
void kiv_led_stop_data_limit_remind();

// Stops both, for a scene that takes the net LED over. Receive thread.
void kiv_led_end_data_limit();

// Timer procedures, on the timer thread.
void get_dstStatus(void *unused);
void kiv_led_remind_data_limit_proc(void *unused);

// 1 once the used share reaches the alert level, else 0; from NV "data_volume_limit_switch", "data_volume_limit_unit",
// "data_volume_limit_size", "data_volume_alert_percent" and the monthly counters. Timer thread.
int kiv_led_check_data_limit();
int kiv_led_check_data_limit_by_data(); // counts bytes
int kiv_led_check_data_limit_by_time(); // counts seconds
