#include "policy/cpe/indicators.h"

#include "ground/led_log.h"
#include "policy/cpe/setters.h"
#include "policy/cpe/state.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led_cpe";

static bool is_on(const char *handler)
{
    if (cur_cpe_power_state == POWER_ON) {
        return true;
    }
    LED_ERROR("%s, not power on!", handler);
    return false;
}

void kiv_cpe_led_handle_nwinfoStatus(int net_type)
{
    if (!is_on(__func__)) {
        return;
    }
    LED_INFO("%s:%d to %d", __func__, int{cur_cpe_net_type}, net_type);
    if (net_type != cur_cpe_net_type) {
        kiv_cpe_set_led_net_led_status(net_type, cur_cpe_roam_status);
        kiv_cpe_set_led_sig_led_status(net_type, cur_cpe_signal_state, cur_cpe_roam_status);
    }
    cur_cpe_net_type = net_type;
}

void kiv_cpe_led_handle_nwRoamStatus(int roaming)
{
    if (!is_on(__func__)) {
        return;
    }
    LED_ERROR("%s:%d to %d", __func__, int{cur_cpe_roam_status}, roaming);
    if (roaming != cur_cpe_roam_status) {
        kiv_cpe_set_led_net_led_status(cur_cpe_net_type, roaming);
        kiv_cpe_set_led_sig_led_status(cur_cpe_net_type, cur_cpe_signal_state, roaming);
    }
    cur_cpe_roam_status = roaming;
}

// The net LED is shown afresh, although it does not depend on the data call.
void kiv_cpe_led_handle_pppStatus(int ppp)
{
    if (!is_on(__func__)) {
        return;
    }
    LED_ERROR("%s:%d to %d", __func__, int{cur_cpe_ppp_status}, ppp);
    if (ppp != cur_cpe_ppp_status) {
        kiv_cpe_set_led_net_led_status(cur_cpe_net_type, cur_cpe_roam_status);
    }
    cur_cpe_ppp_status = ppp;
}

void kiv_cpe_led_handle_signal_state(int bars)
{
    if (!is_on(__func__)) {
        return;
    }
    LED_INFO("%s:%d to %d", __func__, int{cur_cpe_signal_state}, bars);
    if (bars != cur_cpe_signal_state) {
        kiv_cpe_set_led_sig_led_status(cur_cpe_net_type, bars, cur_cpe_roam_status);
    }
    cur_cpe_signal_state = bars;
}

void kiv_cpe_led_handle_voicemail_state(int state)
{
    if (is_on(__func__)) {
        kiv_cpe_led_set_voicemail_status(state);
    }
    cur_cpe_voicemail_state = state;
}
