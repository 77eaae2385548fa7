#include "policy/standard/net_led.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"

#include <array>

constexpr char led_log_source[] = "kiv_mirta_led";

struct net_led_row {
    int net_type;
    led_step step;
};

constexpr auto net_led_rows = std::array{
    net_led_row{NET_NO_SERVICE, {LED_NET_RED, LED_OP_ON, 0, 0, 2}  },
    net_led_row{NET_2G,         {LED_NET_BLUE, LED_OP_ON, 0, 0, 2} },
    net_led_row{NET_3G,         {LED_NET_BLUE, LED_OP_ON, 0, 0, 2} },
    net_led_row{NET_4G,         {LED_NET_BLUE, LED_OP_ON, 0, 0, 2} },
    net_led_row{NET_5G,         {LED_NET_WHITE, LED_OP_ON, 0, 0, 2}},
};

void kiv_led_handle_nwinfoStatus(int net_type)
{
    LED_INFO("enter kiv_led_handle_nwinfoStatus : %d\n ", net_type);
    if (led_power_state != POWER_ON) {
        LED_INFO("enter kiv_led_handle_nwinfoStatus, not power on \n ");
        return;
    }
    if (cur_led_sleep_status == 1) {
        LED_INFO("enter kiv_led_handle_nwinfoStatus, sleep mode \n ");
        kiv_led_set_net_led_off();
        return;
    }
    if (net_type != led_net_type) {
        LED_INFO("kiv_set_net_led_state :state changed!\n");
        kiv_set_net_led_state(net_type, led_ppp_state);
    } else {
        LED_INFO("kiv_set_net_led_state :state same!\n");
    }
    led_net_type = net_type;
}

void kiv_set_net_led_state(int net_type, int ppp)
{
    LED_INFO("enter kiv_set_net_led_state type=%d , ppp=%d\n", net_type, ppp);
    for (const net_led_row &row : net_led_rows) {
        if (row.net_type == net_type) {
            kiv_led_apply(kiv_led_set_net_led_operation, row.step);
        }
    }
}
