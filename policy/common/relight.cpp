#include "policy/common/relight.h"

#include "alarms/kiv_led_over_temp.h"
#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"
#include "painters/net_led.h"
#include "painters/signal_led.h"
#include "policy/common/wifi.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

static void relight_signal()
{
    if (over_temp_enable == 1 && is_over_temp == 1) {
        LED_ERROR("kiv_cpe_led_relight_signal_state, OVER TEMP!");
        kiv_led_show_over_temp_blink();
        return;
    }
    LED_ERROR("kiv_cpe_led_relight_signal_state, NOT OVER TEMP!");
    kiv_qt330x_set_led_signal_state(led_signal_level);
}

void kiv_led_handle_relight_msg()
{
    LED_ERROR("Enter kiv_led_handle_relight_msg");
    if (led_power_state != POWER_ON) {
        LED_ERROR("Power OFF, Ignore relight msg!!");
        return;
    }
    relight_signal();
    kiv_led_set_power_led_operation(LED_POWER_BLUE, LED_OP_ON, 0, 0, 2);
    kiv_led_set_wifi_wps_state();
    kiv_set_net_led_state(led_net_type, led_ppp_state);
    LED_ERROR("Exit kiv_led_handle_relight_msg");
}
