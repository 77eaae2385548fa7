#include "ground/led_ctx.h"

constinit led_word led_product_type{LED_PRODUCT_DATA_CARD};
char product_type_str[128];
constinit led_word led_enable;
int msg_handle;

constinit led_word led_bsp_ready;
constinit led_word led_power_state;
constinit led_word cur_led_sleep_status;

constinit led_word led_net_type;
constinit led_word led_signal_level;
constinit led_word led_sms_state;
constinit led_word led_ppp_state;

constinit led_word is_night_mode;
constinit led_word night_mode_close_all_led;
constinit led_word over_temp_enable;
constinit led_word is_over_temp;
