// What each product asks the other modules for, and what it knows when it comes.
#include "harness.h"
#include "platform/trace/board_names.h"

#include <algorithm>
#include <set>

constexpr uint32_t NO_EVENT = 0x80000000;
constexpr uint32_t SECOND_WORD = 0x40000000; // beside the bits of mask2, there and in a notification

using event_set = std::set<std::pair<int, uint32_t>>;

static event_set registered_events()
{
    event_set events;
    for (const auto &[module, masks] : fake_platform().registrations) {
        for (uint32_t bit = 1; bit < SECOND_WORD; bit <<= 1) {
            if ((masks.mask1 & bit) != 0) {
                events.emplace(module, bit);
            }
            if ((masks.mask2 & bit) != 0) {
                events.emplace(module, SECOND_WORD | bit);
            }
        }
    }
    return events;
}

static size_t lines_after(int module, uint32_t event)
{
    fake_take_record();
    notify(module, event, "1");
    const std::string record = fake_take_record();
    return static_cast<size_t>(std::ranges::count(record, '\n'));
}

// Every bit of both mask words that does more than a notification without an event.
static event_set known_events()
{
    event_set events;
    for (const module_row &module : module_rows) {
        const size_t lines_of_none = lines_after(module.module_id, NO_EVENT);
        for (uint32_t bit = 1; bit < SECOND_WORD; bit <<= 1) {
            for (const uint32_t event : {bit, SECOND_WORD | bit}) {
                led_power_state = POWER_ON;
                cur_led_sleep_status = 0;
                if (lines_after(module.module_id, event) > lines_of_none) {
                    events.emplace(module.module_id, event);
                }
            }
        }
    }
    return events;
}

static event_set without(event_set events, const event_set &others)
{
    std::erase_if(events, [&others](const auto &event) { return others.contains(event); });
    return events;
}

static void compare(const std::string &product, const event_set &only_registered, const event_set &only_known)
{
    on_a_fresh_device(product, [product, only_registered, only_known] {
        start(product);
        const event_set registered = registered_events();
        const event_set known = known_events();
        EXPECT_EQ(without(registered, known), only_registered);
        EXPECT_EQ(without(known, registered), only_known);
    });
}

constexpr std::pair SLEEP = {KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT};
constexpr std::pair FLOW = {KIV_MODULE_DST, REG_DST_FLOW_STATUS};
constexpr std::pair WIFI = {KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS};
constexpr std::pair PAIRING = {KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE};
constexpr std::pair PAIRING_2 = {KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE_CHIP2};
constexpr std::pair UNREAD = {KIV_MODULE_SMS, REG_WMS_SMS_NV_UNREAD_SMS};
constexpr std::pair NEW = {KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS};
constexpr std::pair FULL = {KIV_MODULE_SMS, REG_WMS_SMS_MEMORY_FULL};
constexpr std::pair VOICEMAIL = {KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG};
constexpr std::pair PHONE = {KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE};
constexpr std::pair UNKNOWN = {KIV_MODULE_WLAN, 0x4}; // the handheld asks for it; nobody knows what it is

// Sleep comes without being asked for. What else is known but not registered is another product's.
TEST(dispatch, KnowsWhatEachProductRegisters)
{
    compare("DRIVER_UFI", {UNKNOWN}, {SLEEP, PAIRING, PAIRING_2, VOICEMAIL, PHONE});
    compare("ONLY_DATA_CARD", {}, {SLEEP, FLOW, WIFI, PAIRING, PAIRING_2, UNREAD, NEW, FULL, VOICEMAIL, PHONE});
    compare("PAPER_KITE", {}, {SLEEP, FLOW, UNREAD, NEW, FULL, VOICEMAIL, PHONE});
    compare("MODULE", {}, {SLEEP, FLOW, WIFI, PAIRING, PAIRING_2, UNREAD, NEW, FULL});
    compare("UNI_CORE_CPE", {}, {SLEEP, FLOW, UNREAD, NEW, FULL, VOICEMAIL});
}

TEST(dispatch, NamesEachModuleAndIgnoresItsOtherEvents)
{
    for (const module_row &module : module_rows) {
        if (module.module_id == KIV_MODULE_LED) {
            continue; // the daemon itself
        }
        on_a_fresh_device(module.name, [module] {
            switched_on(LED_PRODUCT_UFI);
            notify(module.module_id, NO_EVENT);
            expect_trace(R"(
                receive 0 1036
                info kiv_mirta_led "[info] enter messageParse fun\n"
                info kiv_mirta_led "recv_msg.us_source_module_id is )" +
                         std::to_string(module.module_id) + R"("
                info kiv_mirta_led "recv_msg.us_cmd is 12034"
                info kiv_mirta_led "[info] msg MSG_CMD_SERVICE_NOTIFY \n"
                info kiv_mirta_led "regDecodeMsg source_id )" +
                         std::to_string(module.module_id) + R"(, mask1 -2147483648"
                info kiv_mirta_led "[info] source msg KIV_MODULE_)" +
                         module.name + R"(\n")");
        });
    }
}

DEVICE_TEST(dispatch, StrangersAndTwoEventsAtOnce)
{
    switched_on(LED_PRODUCT_UFI);
    notify(99, REG_SIM_STATUS);
    expect_trace(R"(
        receive 0 1036
        info kiv_mirta_led "[info] enter messageParse fun\n"
        info kiv_mirta_led "recv_msg.us_source_module_id is 99"
        info kiv_mirta_led "recv_msg.us_cmd is 12034"
        info kiv_mirta_led "[info] msg MSG_CMD_SERVICE_NOTIFY \n"
        info kiv_mirta_led "regDecodeMsg source_id 99, mask1 1")");
    notify(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR | REG_NWINFO_ROAMING_STATUS);
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON | REG_MC_EVENT_SHUTTING_DOWN);
    notify(KIV_MODULE_MAIN, REG_MC_BATTERY_VALUE & ~SECOND_WORD);
    expect_effects("");
    expect_log("kiv_mirta_led", "");
}

// On a card that shows none of it: each receipt line and the handler's guard.
DEVICE_TEST(dispatch, ReceiptLines)
{
    switched_on(LED_PRODUCT_DATA_CARD);
    led_power_state = POWER_OFF;
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
    notify(KIV_MODULE_MDM, REG_SIM_STATUS);
    notify(KIV_MODULE_NWINFO, REG_NWINFO_ROAMING_STATUS);
    notify(KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE);
    notify(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR);
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    notify(KIV_MODULE_PPP, REG_Q6_PPP_STATUS, "1");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_MEMORY_FULL);
    notify(KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG, "1");
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "1");
    notify(KIV_MODULE_DST, REG_DST_FLOW_STATUS, "9");
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "PHONE BLINK");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_SIM_STATUS\n"
        info "[NVinfo]sim_states: \n"
        info "recv  REG_NWINFO_ROAMING_STATUS \n"
        error "recv roam state:...\n"
        info "recv  REG_NWINFO_NETTYPE \n"
        error "recv nettype \n"
        info "enter kiv_led_handle_nwinfoStatus : 1\n "
        info "enter kiv_led_handle_nwinfoStatus, not power on \n "
        info "recv  REG_NWINFO_SIG_BAR \n"
        info "recv_nwSigStatus :0"
        info "kiv_led_handle_signal_state :0"
        info "recv REG_PPP_STATUS p_data=1\n"
        info "recv REG_Q6_PPP_STATUS p_data=1\n"
        info "recv_SMSstatus"
        info "recv recv_SMSstatus status from 0 to 3 \n"
        info "recv recv_SMSstatus not power on \n"
        info "recv REG_WMS_SMS_VOCEMAIL_SET_FLAG: 1\n"
        info "recv_VoiceMailStatus:1\n"
        info "recv REG_SLEEP_STATUS_EVENT p_data=1\n"
        info "recv REG_DST_FLOW_STATUS p_data=9\n"
        info "recv REG_VOICE_PHONE_LED_STATE p_data=PHONE BLINK\n"
        info "recv_voicePhoneStatus, not power on \n "
        info "set voice phone led from 0 to 2\n")");
    expect_log("kiv_led_data_limit", R"(
        error "[info] enter the pppStatus fun p_data:1\n"
        info "[info] enter the pppStatus fun p_data:1\n"
        info "enter kiv_led_handle_pppStatus, not power on \n "
        error "q6_ppp_status \n"
        info "[info] enter the pppStatus fun p_data:0\n"
        info "enter kiv_led_handle_pppStatus, not power on \n ")");
}

DEVICE_TEST(dispatch, WifiAndPairingOnlyWhileOnAndAwake)
{
    switched_on(LED_PRODUCT_PAPER_KITE);
    led_power_state = POWER_OFF;
    notify(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, "1");
    notify(KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE, "1");
    expect_log("kiv_mirta_led", R"(
        info "not power on or wakeup, ignore WLAN message\n"
        info "not power on or wakeup, ignore WPS message\n")");
    led_power_state = POWER_ON;
    cur_led_sleep_status = 5;
    notify(KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE_CHIP2, "1");
    expect_log("kiv_mirta_led", R"(
        info "not power on or wakeup, ignore WPS message\n")");
    cur_led_sleep_status = 0;
    notify(KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE_CHIP2, "1");
    notify(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, "0");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_WLAN_AP_WPS_STATE p_data=1\n"
        info "enter kiv_led_set_led_wps_status wps_status=1, cur_led_sleep_status=0\n"
        info "WPS active, wifi blue blink 2 mins\n"
        info " recv REG_WLAN_CURRENT_STATUS wifi status= p_data=0\n"
        info "enter kiv_led_set_led_wifi_status wifi_status=0, cur_led_sleep_status=0\n"
        info "wifi led off\n")");
}
