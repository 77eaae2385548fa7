#include "core/dispatch.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "kiv/reg.h"
#include "nightmode/kiv_led_night_mode.h"
#include "policy/common/data_call.h"
#include "policy/common/network.h"
#include "policy/common/voice.h"
#include "policy/products.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

// The events of each module. An event is compared whole, so that two events in one notification are none that is known.

static void take_modem_event(uint32_t event)
{
    switch (event) {
    case REG_SIM_STATUS:
        LED_INFO("recv REG_SIM_STATUS\n");
        recv_simStatus();
        break;
    default:
        break;
    }
}

static void take_network_event(uint32_t event)
{
    switch (event) {
    case REG_NWINFO_ROAMING_STATUS:
        LED_INFO("recv  REG_NWINFO_ROAMING_STATUS \n");
        recv_nwRoamStatus();
        break;
    case REG_NWINFO_NETTYPE:
        LED_INFO("recv  REG_NWINFO_NETTYPE \n");
        recv_nwNetType();
        break;
    case REG_NWINFO_SIG_BAR:
        LED_INFO("recv  REG_NWINFO_SIG_BAR \n");
        recv_nwSigStatus();
        break;
    default:
        break;
    }
}

static void take_data_call_event(uint32_t event, const char *p_data)
{
    switch (event) {
    case REG_PPP_STATUS:
        LED_INFO("recv REG_PPP_STATUS p_data=%s\n", p_data);
        recv_pppStatus(p_data);
        break;
    case REG_Q6_PPP_STATUS:
        LED_INFO("recv REG_Q6_PPP_STATUS p_data=%s\n", p_data);
        get_pppStatus();
        break;
    default:
        break;
    }
}

static bool passes_wifi_guard(const char *subject)
{
    if (led_power_state == POWER_ON && cur_led_sleep_status == AWAKE) {
        return true;
    }
    LED_INFO("not power on or wakeup, ignore %s message\n", subject);
    return false;
}

static void take_wifi_event(uint32_t event, const char *p_data)
{
    switch (event) {
    case REG_WLAN_AP_WPS_STATE:
    case REG_WLAN_AP_WPS_STATE_CHIP2:
        if (passes_wifi_guard("WPS")) {
            LED_INFO("recv REG_WLAN_AP_WPS_STATE p_data=%s\n", p_data);
            kiv_led_wps_status_dispatch(p_data);
        }
        break;
    case REG_WLAN_CURRENT_STATUS:
        if (passes_wifi_guard("WLAN")) {
            LED_INFO(" recv REG_WLAN_CURRENT_STATUS wifi status= p_data=%s\n", p_data);
            kiv_led_wlan_status_dispatch(p_data);
        }
        break;
    default:
        break;
    }
}

static void take_sms_event(uint32_t event, const char *p_data)
{
    switch (event) {
    case REG_WMS_SMS_NV_UNREAD_SMS:
    case REG_WMS_SMS_NEW_SMS:
    case REG_WMS_SMS_MEMORY_FULL:
        kiv_led_sms_dispatch(event);
        break;
    case REG_WMS_SMS_VOCEMAIL_SET_FLAG:
        LED_INFO("recv REG_WMS_SMS_VOCEMAIL_SET_FLAG: %s\n", p_data);
        recv_VoiceMailStatus(p_data);
        break;
    default:
        break;
    }
}

// The product's sleep handler settles what is stored here.
static void take_sleep_status(int sleep_status)
{
    cur_led_sleep_status = sleep_status;
    kiv_led_sleep_status_dispatch(sleep_status);
}

static void take_sleep_event(uint32_t event, const char *p_data)
{
    switch (event) {
    case REG_SLEEP_STATUS_EVENT:
        LED_INFO("recv REG_SLEEP_STATUS_EVENT p_data=%s\n", p_data);
        take_sleep_status(kiv_led_text_to_int(p_data));
        break;
    default:
        break;
    }
}

static void take_usage_event(uint32_t event, const char *p_data)
{
    switch (event) {
    case REG_DST_FLOW_STATUS: // the reminder looks at the counters by itself
        LED_INFO("recv REG_DST_FLOW_STATUS p_data=%s\n", p_data);
        break;
    default:
        break;
    }
}

static void take_voice_event(uint32_t event, const char *p_data)
{
    switch (event) {
    case REG_VOICE_PHONE_LED_STATE:
        LED_INFO("recv REG_VOICE_PHONE_LED_STATE p_data=%s\n", p_data);
        recv_voicePhoneStatus(p_data);
        break;
    default:
        break;
    }
}

static void regDecodeMsg(const svc_msg *msg)
{
    const uint32_t event = msg->ul_event_mask;
    const char *p_data = msg->p_data;

    LED_INFO("regDecodeMsg source_id %d, mask1 %d", msg->us_source_module_id, static_cast<int>(event));
    switch (msg->us_source_module_id) {
    case KIV_MODULE_MAIN:
        LED_INFO("[info] source msg KIV_MODULE_MAIN\n");
        kiv_led_mc_event_dispatch(event);
        break;
    case KIV_MODULE_MDM:
        LED_INFO("[info] source msg KIV_MODULE_MDM\n");
        take_modem_event(event);
        break;
    case KIV_MODULE_NWINFO:
        LED_INFO("[info] source msg KIV_MODULE_NWINFO\n");
        take_network_event(event);
        break;
    case KIV_MODULE_PPP:
        LED_INFO("[info] source msg KIV_MODULE_PPP\n");
        take_data_call_event(event, p_data);
        break;
    case KIV_MODULE_WLAN:
        LED_INFO("[info] source msg KIV_MODULE_WLAN\n");
        take_wifi_event(event, p_data);
        break;
    case KIV_MODULE_SMS:
        LED_INFO("[info] source msg KIV_MODULE_SMS\n");
        take_sms_event(event, p_data);
        break;
    case KIV_MODULE_SLEEP:
        LED_INFO("[info] source msg KIV_MODULE_SLEEP\n");
        take_sleep_event(event, p_data);
        break;
    case KIV_MODULE_DST:
        LED_INFO("[info] source msg KIV_MODULE_DST\n");
        take_usage_event(event, p_data);
        break;
    case KIV_MODULE_VOICE:
        LED_INFO("[info] source msg KIV_MODULE_VOICE\n");
        take_voice_event(event, p_data);
        break;
    default:
        break;
    }
}

void messageParse(const svc_msg *msg)
{
    LED_INFO("[info] enter messageParse fun\n");
    if (msg == nullptr) {
        LED_ERROR("messageParse pointer NULL");
        return;
    }
    if (msg->us_dest_module_id != KIV_MODULE_LED) {
        LED_ERROR("messageParse us_dest_module_id is not KIV_MODULE_LED");
        return;
    }
    LED_INFO("recv_msg.us_source_module_id is %d", msg->us_source_module_id);
    LED_INFO("recv_msg.us_cmd is %d", msg->us_cmd);
    switch (msg->us_cmd) {
    case KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL:
        LED_INFO("[info] msg KIV_MSG_CMD_LED_CPE_CIRCLE_LED_CTRL \n");
        break;
    case KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG:
        LED_INFO("[info] msg KIV_MSG_CMD_LED_CPE_DATA_LIMIT_MSG \n");
        break;
    case KIV_MSG_CMD_LED_CPE_RESET_MSG:
        LED_INFO("[info] msg KIV_MSG_CMD_LED_CPE_RESET_MSG \n");
        break;
    case KIV_MSG_CMD_LED_OVER_TEMP_MSG:
        kiv_led_over_temp_dispatch();
        break;
    case KIV_MSG_CMD_LED_NIGHT_MODE_MSG:
        kiv_led_night_mode_init();
        break;
    case KIV_MSG_CMD_LED_RELIGHT_MSG:
        kiv_led_relight_dispatch();
        break;
    case MSG_CMD_SERVICE_NOTIFY:
        LED_INFO("[info] msg MSG_CMD_SERVICE_NOTIFY \n");
        regDecodeMsg(msg);
        break;
    default: // also a registration request that comes too late
        break;
    }
}
