#include "policy/initial_scenes.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "policy/cpe/scenes.h"
#include "policy/singlechip/scenes.h"
#include "policy/standard/net_led.h"
#include "policy/standard/network.h"
#include "policy/standard/scenes.h"
#include "policy/standard/wifi.h"

constexpr char led_log_source[] = "kiv_mirta_led";

static void be_on_without_service()
{
    led_power_state = POWER_ON;
    cur_led_sleep_status = 0;
    kiv_set_net_led_state(NET_NO_SERVICE, 0);
}

void kiv_led_init()
{
    LED_INFO("kiv_led_init!");
    switch (static_cast<led_product>(int{led_product_type})) {
    case LED_PRODUCT_UFI:
        kiv_led_std_init();
        break;
    case LED_PRODUCT_DATA_CARD:
        kiv_led_datacard_init();
        break;
    case LED_PRODUCT_PAPER_KITE:
        kiv_led_paperkite_init();
        break;
    case LED_PRODUCT_MODULE:
        kiv_led_cpe_init();
        break;
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_led_singlechip_init();
        break;
    case LED_PRODUCT_COUNT:
        break;
    }
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
