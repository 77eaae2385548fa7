#include "policy/products.h"

#include "alarms/kiv_led_over_temp.h"
#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "policy/common/data_call.h"
#include "policy/common/network.h"
#include "policy/common/on_from_start.h"
#include "policy/common/relight.h"
#include "policy/common/sms.h"
#include "policy/common/wifi.h"
#include "policy/cpe/battery.h"
#include "policy/cpe/indicators.h"
#include "policy/cpe/scenes.h"
#include "policy/cpe/setters.h"
#include "policy/datacard/signal.h"
#include "policy/singlechip/scenes.h"
#include "policy/singlechip/setters.h"
#include "policy/singlechip/signal.h"
#include "policy/standard/battery.h"
#include "policy/standard/scenes.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

void kiv_led_init()
{
    LED_INFO("kiv_led_init!");
    switch (this_product()) {
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
    }
}

bool kiv_led_hears_bsp_ind()
{
    switch (this_product()) {
    case LED_PRODUCT_MODULE:
        return true;
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        break;
    }
    return false;
}

void kiv_led_mc_event_dispatch(uint32_t event)
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
        kiv_led_handle_mc_event(event);
        break;
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_mc_event(event);
        break;
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_singlechip_led_handle_mc_event(event);
        break;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
        break;
    }
}

void kiv_led_sleep_status_dispatch(int sleep_status)
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
        kiv_led_set_led_when_sleep_status_change(sleep_status);
        break;
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_set_led_when_sleep_status_change(sleep_status);
        break;
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_singlechip_led_handle_sleep_status_change(sleep_status);
        break;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
        break;
    }
}

void kiv_led_net_type_dispatch(int net_type)
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_led_handle_nwinfoStatus(net_type);
        break;
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_nwinfoStatus(net_type);
        break;
    }
}

void kiv_led_roaming_dispatch(int roaming)
{
    switch (this_product()) {
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_nwRoamStatus(roaming);
        break;
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        break;
    }
}

void kiv_led_signal_dispatch(int bars)
{
    switch (this_product()) {
    case LED_PRODUCT_DATA_CARD:
        kiv_led_handle_signal_state(bars);
        break;
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_signal_state(bars);
        break;
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_singlechip_led_handle_signal_state(bars);
        break;
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_PAPER_KITE:
        break;
    }
}

void kiv_led_ppp_status_dispatch(int ppp)
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_led_handle_pppStatus(ppp);
        break;
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_pppStatus(ppp);
        break;
    }
}

void kiv_led_wlan_status_dispatch(const char *p_data)
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_led_set_led_wifi_status(p_data);
        break;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_MODULE:
        break;
    }
}

void kiv_led_wps_status_dispatch(const char *p_data)
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_led_set_led_wps_status(p_data);
        break;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_MODULE:
        break;
    }
}

void kiv_led_sms_dispatch(uint32_t event)
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_MODULE:
    case LED_PRODUCT_UNI_CORE_CPE:
        recv_SMSstatus(event);
        break;
    }
}

void kiv_led_voicemail_dispatch(int flag)
{
    switch (this_product()) {
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_voicemail_state(flag);
        break;
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        break;
    }
}

void kiv_led_voice_status_dispatch(int state)
{
    switch (this_product()) {
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_set_voice_status(state);
        break;
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_singlechip_led_set_voice_status(state);
        break;
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
        break;
    }
}

void kiv_led_over_temp_dispatch()
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_MODULE:
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_led_over_temp_init();
        break;
    }
}

void kiv_led_relight_dispatch()
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_MODULE:
    case LED_PRODUCT_UNI_CORE_CPE:
        kiv_led_handle_relight_msg();
        break;
    }
}

void kiv_led_battery_query_dispatch()
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
        kiv_led_query_battery_state();
        break;
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_battery_state();
        break;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        break;
    }
}

void kiv_led_battery_ind_dispatch(int)
{
    switch (this_product()) {
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_battery_state();
        break;
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        break;
    }
}

void kiv_led_charger_ind_dispatch(int connected)
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
        kiv_led_query_battery_state();
        break;
    case LED_PRODUCT_MODULE:
        kiv_cpe_led_handle_charger_state(connected);
        break;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        break;
    }
}

bool kiv_led_has_data_limit_reminder()
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
    case LED_PRODUCT_PAPER_KITE:
    case LED_PRODUCT_UNI_CORE_CPE:
        return true;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_MODULE:
        break;
    }
    return false;
}
