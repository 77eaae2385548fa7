#include "policy/common/data_call.h"

#include "alarms/kiv_led_data_limit.h"
#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "output/led_groups.h"
#include "painters/net_led.h"
#include "policy/products.h"

#include <string_view>

constexpr char LED_LOG_SOURCE[] = "kiv_led_data_limit";

void recv_pppStatus(const char *p_data)
{
    LED_ERROR("[info] enter the pppStatus fun p_data:%s\n", p_data);
    kiv_led_ppp_status_dispatch(kiv_led_text_to_int(p_data) == 1 ? 1 : 0);
}

void get_pppStatus()
{
    const nv_text status = kiv_led_read_nv_text("q6_ppp_status");

    LED_ERROR("q6_ppp_status %s\n", status.data());
    kiv_led_ppp_status_dispatch(std::string_view(status.data()) == "q6_ppp_connected" ? 1 : 0);
}

void kiv_led_handle_pppStatus(int ppp)
{
    LED_INFO("[info] enter the pppStatus fun p_data:%d\n", ppp);
    if (led_power_state != POWER_ON) {
        LED_INFO("enter kiv_led_handle_pppStatus, not power on \n ");
        led_ppp_state = ppp;
        return;
    }
    if (cur_led_sleep_status == ASLEEP) {
        LED_INFO("enter kiv_led_handle_pppStatus, sleep mode \n ");
        led_ppp_state = ppp;
        kiv_led_set_net_led_off();
        kiv_led_end_data_limit_check();
        return;
    }
    if (ppp != led_ppp_state) {
        kiv_set_net_led_state(led_net_type, ppp);
    }
    led_ppp_state = ppp;
    if (!kiv_led_has_data_limit_reminder()) {
        return;
    }
    if (ppp == 1) {
        LED_INFO("[info]PPP connect, start check data remind\n");
        kiv_led_start_remind_data_limit_check();
    } else if (ppp == 0) {
        LED_INFO("[info]PPP disconnect, stop data remind\n");
        kiv_led_stop_data_limit_remind();
        kiv_led_end_data_limit_check();
    }
}
