// The monthly data-volume reminder: while a data call is up and the configured share of the allowance is used, the net
// LED plays a pattern of seven seconds. From NV "data_volume_limit_switch", "data_volume_limit_unit",
// "data_volume_limit_size", "data_volume_alert_percent" and the monthly counters.
#pragma once

// The check of usage against the limit, every 5 s. Ending accepts that none runs. Receive thread.
void kiv_led_start_remind_data_limit_check();
void kiv_led_end_data_limit_check();

// Ends the reminder, if it plays, and gives the net LED back. Receive thread, and timer thread from the check.
void kiv_led_stop_data_limit_remind();

// Ends both, for a scene that takes the net LED over. Receive thread.
void kiv_led_end_data_limit();
