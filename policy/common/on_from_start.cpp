#include "policy/common/on_from_start.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "painters/net_led.h"
#include "policy/common/network.h"
#include "policy/common/wifi.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

static void be_on_without_service()
{
    led_power_state = POWER_ON;
    cur_led_sleep_status = AWAKE;
    kiv_set_net_led_state(NET_NO_SERVICE, 0);
}

void kiv_led_datacard_init()
{
    be_on_without_service();
    recv_nwNetType();
    recv_nwSigStatus();
}

void kiv_led_paperkite_init()
{
    LED_INFO("paperkite init");
    be_on_without_service();
    recv_nwNetType();
    kiv_led_set_led_wifi_init();
}
