#include "policy/cpe/indicators.h"

#include "core/led_log.h"
#include "policy/cpe/setters.h"
#include "policy/cpe/state.h"

constexpr char led_log_source[] = "kiv_mirta_led_cpe";

struct cpe_indicator {
    const char *handler; // its name in the log
    int change_level;    // of the line that says what it changes to
    led_word &stored;
    void (*show)(int value);
};

static void show_net_type(int type)
{
    kiv_cpe_set_led_net_led_status(type, cur_cpe_roam_status);
    kiv_cpe_set_led_sig_led_status(type, cur_cpe_signal_state, cur_cpe_roam_status);
}

static void show_roaming(int roaming)
{
    kiv_cpe_set_led_net_led_status(cur_cpe_net_type, roaming);
    kiv_cpe_set_led_sig_led_status(cur_cpe_net_type, cur_cpe_signal_state, roaming);
}

static void show_ppp(int)
{
    kiv_cpe_set_led_net_led_status(cur_cpe_net_type, cur_cpe_roam_status);
}

static void show_signal(int bars)
{
    kiv_cpe_set_led_sig_led_status(cur_cpe_net_type, bars, cur_cpe_roam_status);
}

constexpr cpe_indicator net_type_indicator = {"kiv_cpe_led_handle_nwinfoStatus", KIV_LOG_INFO, cur_cpe_net_type,
                                              show_net_type};
constexpr cpe_indicator roaming_indicator = {"kiv_cpe_led_handle_nwRoamStatus", KIV_LOG_ERROR, cur_cpe_roam_status,
                                             show_roaming};
constexpr cpe_indicator ppp_indicator = {"kiv_cpe_led_handle_pppStatus", KIV_LOG_ERROR, cur_cpe_ppp_status, show_ppp};
constexpr cpe_indicator signal_indicator = {"kiv_cpe_led_handle_signal_state", KIV_LOG_INFO, cur_cpe_signal_state,
                                            show_signal};

static void handle_value(const cpe_indicator &indicator, int value)
{
    if (cur_cpe_power_state != POWER_ON) {
        LED_ERROR("%s, not power on!", indicator.handler);
        return;
    }
    const int stored = indicator.stored;
    LED_LOG(indicator.change_level, "%s:%d to %d", indicator.handler, stored, value);
    if (value != stored) {
        indicator.show(value);
    }
    indicator.stored = value;
}

void kiv_cpe_led_handle_nwinfoStatus(int net_type)
{
    handle_value(net_type_indicator, net_type);
}

void kiv_cpe_led_handle_nwRoamStatus(int roaming)
{
    handle_value(roaming_indicator, roaming);
}

void kiv_cpe_led_handle_pppStatus(int ppp)
{
    handle_value(ppp_indicator, ppp);
}

void kiv_cpe_led_handle_signal_state(int bars)
{
    handle_value(signal_indicator, bars);
}

void kiv_cpe_led_handle_voicemail_state(int state)
{
    if (cur_cpe_power_state == POWER_ON) {
        kiv_cpe_led_set_voicemail_status(state);
    } else {
        LED_ERROR("kiv_cpe_led_handle_voicemail_state, not power on!");
    }
    cur_cpe_voicemail_state = state;
}
