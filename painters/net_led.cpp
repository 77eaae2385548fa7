#include "painters/net_led.h"

#include "ground/led_log.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"

#include <array>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

struct net_led_row {
    net_class net_type;
    led_step step;
};

constexpr auto net_led_rows = std::array{
    net_led_row{NET_NO_SERVICE, {LED_NET_RED, LED_OP_ON, 0, 0, 2}  },
    net_led_row{NET_2G,         {LED_NET_BLUE, LED_OP_ON, 0, 0, 2} },
    net_led_row{NET_3G,         {LED_NET_BLUE, LED_OP_ON, 0, 0, 2} },
    net_led_row{NET_4G,         {LED_NET_BLUE, LED_OP_ON, 0, 0, 2} },
    net_led_row{NET_5G,         {LED_NET_WHITE, LED_OP_ON, 0, 0, 2}},
};

void kiv_set_net_led_state(int net_type, int ppp)
{
    LED_INFO("enter kiv_set_net_led_state type=%d , ppp=%d\n", net_type, ppp);
    for (const net_led_row &row : net_led_rows) {
        if (row.net_type == net_type) {
            kiv_led_set_net_led_operation(row.step);
        }
    }
}
