#include "core/dispatch.h"

#include "alarms/kiv_led_data_limit.h"
#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/nv_read.h"
#include "kiv/reg.h"
#include "policy/cpe/scenes.h"
#include "policy/singlechip/scenes.h"
#include "policy/standard/network.h"
#include "policy/standard/scenes.h"
#include "policy/standard/sms.h"
#include "policy/standard/voice.h"
#include "policy/standard/wifi.h"

#include <array>

constexpr char led_log_source[] = "kiv_mirta_led";

struct product_policy {
    void (*mc_event)(uint32_t) = nullptr; // nullptr: the product does not hear it
    void (*sleep_status)(int) = nullptr;
    void (*wlan_status)(const char *) = nullptr;
    void (*wps_status)(const char *) = nullptr;
};

constexpr product_policy ufi_policy = {
    .mc_event = kiv_led_handle_mc_event,
    .sleep_status = kiv_led_set_led_when_sleep_status_change,
    .wlan_status = kiv_led_set_led_wifi_status,
    .wps_status = kiv_led_set_led_wps_status,
};
constexpr product_policy paper_kite_policy = {
    .wlan_status = kiv_led_set_led_wifi_status,
    .wps_status = kiv_led_set_led_wps_status,
};
constexpr product_policy module_policy = {
    .mc_event = kiv_cpe_led_handle_mc_event,
    .sleep_status = kiv_cpe_led_set_led_when_sleep_status_change,
};
constexpr product_policy uni_core_cpe_policy = {
    .mc_event = kiv_singlechip_led_handle_mc_event,
    .sleep_status = kiv_singlechip_led_handle_sleep_status_change,
    .wlan_status = kiv_led_set_led_wifi_status,
    .wps_status = kiv_led_set_led_wps_status,
};
constexpr product_policy data_card_policy = {};

static const product_policy &policy_of_this_product()
{
    switch (static_cast<led_product>(int{led_product_type})) {
    case LED_PRODUCT_UFI:
        return ufi_policy;
    case LED_PRODUCT_PAPER_KITE:
        return paper_kite_policy;
    case LED_PRODUCT_MODULE:
        return module_policy;
    case LED_PRODUCT_UNI_CORE_CPE:
        return uni_core_cpe_policy;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_COUNT:
        break;
    }
    return data_card_policy;
}

static bool passes_wifi_guard(const char *subject)
{
    if (led_power_state == POWER_ON && cur_led_sleep_status == 0) {
        return true;
    }
    LED_INFO("not power on or wakeup, ignore %s message\n", subject);
    return false;
}

static void on_sim(const char *)
{
    recv_simStatus();
}

static void on_roaming(const char *)
{
    recv_nwRoamStatus();
}

static void on_net_type(const char *)
{
    recv_nwNetType();
}

static void on_signal(const char *)
{
    recv_nwSigStatus();
}

static void on_q6_ppp(const char *)
{
    get_pppStatus();
}

static void on_unread_sms(const char *)
{
    recv_SMSstatus(REG_WMS_SMS_NV_UNREAD_SMS);
}

static void on_new_sms(const char *)
{
    recv_SMSstatus(REG_WMS_SMS_NEW_SMS);
}

static void on_sms_store_full(const char *)
{
    recv_SMSstatus(REG_WMS_SMS_MEMORY_FULL);
}

// The sleep handler settles what is stored here.
static void on_sleep(const char *p_data)
{
    const int sleep_status = kiv_led_text_to_int(p_data);

    cur_led_sleep_status = sleep_status;
    kiv_led_sleep_status_dispatch(sleep_status);
}

struct source_row {
    uint16_t module;
    const char *line;
    void (*any_event)(uint32_t); // nullptr: the events are in notification_rows
};

constexpr auto source_rows = std::array{
    source_row{KIV_MODULE_MAIN,   "[info] source msg KIV_MODULE_MAIN\n",   kiv_led_mc_event_dispatch},
    source_row{KIV_MODULE_MDM,    "[info] source msg KIV_MODULE_MDM\n",    nullptr                  },
    source_row{KIV_MODULE_NWINFO, "[info] source msg KIV_MODULE_NWINFO\n", nullptr                  },
    source_row{KIV_MODULE_PPP,    "[info] source msg KIV_MODULE_PPP\n",    nullptr                  },
    source_row{KIV_MODULE_WLAN,   "[info] source msg KIV_MODULE_WLAN\n",   nullptr                  },
    source_row{KIV_MODULE_SMS,    "[info] source msg KIV_MODULE_SMS\n",    nullptr                  },
    source_row{KIV_MODULE_SLEEP,  "[info] source msg KIV_MODULE_SLEEP\n",  nullptr                  },
    source_row{KIV_MODULE_DST,    "[info] source msg KIV_MODULE_DST\n",    nullptr                  },
    source_row{KIV_MODULE_VOICE,  "[info] source msg KIV_MODULE_VOICE\n",  nullptr                  },
};

struct notification_row {
    uint16_t module;
    uint32_t event;                // compared whole: two events in one notification match no row
    const char *line;              // nullptr: none
    bool logs_payload;             // the payload and a newline follow the line
    void (*handle)(const char *);  // gets the payload; nullptr: only logged
    const char *guarded = nullptr; // dropped under this name unless on and awake
};

// clang-format off
constexpr auto notification_rows = std::array{
    notification_row{KIV_MODULE_MDM, REG_SIM_STATUS, "recv REG_SIM_STATUS\n", false, on_sim},
    notification_row{KIV_MODULE_NWINFO, REG_NWINFO_ROAMING_STATUS, "recv  REG_NWINFO_ROAMING_STATUS \n", false,
                     on_roaming},
    notification_row{KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE, "recv  REG_NWINFO_NETTYPE \n", false, on_net_type},
    notification_row{KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR, "recv  REG_NWINFO_SIG_BAR \n", false, on_signal},
    notification_row{KIV_MODULE_PPP, REG_PPP_STATUS, "recv REG_PPP_STATUS p_data=", true, recv_pppStatus},
    notification_row{KIV_MODULE_PPP, REG_Q6_PPP_STATUS, "recv REG_Q6_PPP_STATUS p_data=", true, on_q6_ppp},
    notification_row{KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE, "recv REG_WLAN_AP_WPS_STATE p_data=", true,
                     kiv_led_wps_status_dispatch, "WPS"},
    notification_row{KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE_CHIP2, "recv REG_WLAN_AP_WPS_STATE p_data=", true,
                     kiv_led_wps_status_dispatch, "WPS"},
    notification_row{KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, " recv REG_WLAN_CURRENT_STATUS wifi status= p_data=",
                     true, kiv_led_wlan_status_dispatch, "WLAN"},
    notification_row{KIV_MODULE_SMS, REG_WMS_SMS_NV_UNREAD_SMS, nullptr, false, on_unread_sms},
    notification_row{KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS, nullptr, false, on_new_sms},
    notification_row{KIV_MODULE_SMS, REG_WMS_SMS_MEMORY_FULL, nullptr, false, on_sms_store_full},
    notification_row{KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG, "recv REG_WMS_SMS_VOCEMAIL_SET_FLAG: ", true,
                     recv_VoiceMailStatus},
    notification_row{KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "recv REG_SLEEP_STATUS_EVENT p_data=", true, on_sleep},
    notification_row{KIV_MODULE_DST, REG_DST_FLOW_STATUS, "recv REG_DST_FLOW_STATUS p_data=", true, nullptr},
    notification_row{KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "recv REG_VOICE_PHONE_LED_STATE p_data=", true,
                     recv_voicePhoneStatus},
};
// clang-format on

static const source_row *find_source(uint16_t module)
{
    for (const source_row &row : source_rows) {
        if (row.module == module) {
            return &row;
        }
    }
    return nullptr;
}

static const notification_row *find_notification(uint16_t module, uint32_t event)
{
    for (const notification_row &row : notification_rows) {
        if (row.module == module && row.event == event) {
            return &row;
        }
    }
    return nullptr;
}

static void take_notification(const notification_row &row, const char *p_data)
{
    if (row.guarded != nullptr && !passes_wifi_guard(row.guarded)) {
        return;
    }
    if (row.logs_payload) {
        LED_INFO("%s%s\n", row.line, p_data);
    } else if (row.line != nullptr) {
        LED_INFO("%s", row.line);
    }
    if (row.handle != nullptr) {
        row.handle(p_data);
    }
}

void regDecodeMsg(const svc_msg *msg)
{
    const uint32_t event = msg->ul_event_mask;

    LED_INFO("regDecodeMsg source_id %d, mask1 %d", msg->us_source_module_id, static_cast<int>(event));

    const source_row *source = find_source(msg->us_source_module_id);
    if (source == nullptr) {
        return;
    }
    LED_INFO("%s", source->line);
    if (source->any_event != nullptr) {
        source->any_event(event);
        return;
    }
    const notification_row *notification = find_notification(source->module, event);
    if (notification != nullptr) {
        take_notification(*notification, msg->p_data);
    }
}

void kiv_led_mc_event_dispatch(uint32_t event)
{
    const product_policy &policy = policy_of_this_product();

    if (policy.mc_event != nullptr) {
        policy.mc_event(event);
    }
}

void kiv_led_sleep_status_dispatch(int sleep_status)
{
    const product_policy &policy = policy_of_this_product();

    if (policy.sleep_status != nullptr) {
        policy.sleep_status(sleep_status);
    }
}

void kiv_led_wlan_status_dispatch(const char *p_data)
{
    const product_policy &policy = policy_of_this_product();

    if (policy.wlan_status != nullptr) {
        policy.wlan_status(p_data);
    }
}

void kiv_led_wps_status_dispatch(const char *p_data)
{
    const product_policy &policy = policy_of_this_product();

    if (policy.wps_status != nullptr) {
        policy.wps_status(p_data);
    }
}
