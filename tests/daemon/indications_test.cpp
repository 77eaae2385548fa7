// The indications that products share: network, signal, Wi-Fi, SMS, voicemail and phone.
#include "harness.h"
#include "policy/common/sms.h"

DEVICE_TEST(network, ClassOfEachName)
{
    const auto class_of = [](const char *name) {
        nv("network_type", name);
        led_net_type = 0;
        notify(KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE);
        return int{led_net_type};
    };
    switched_on(LED_PRODUCT_PAPER_KITE);
    for (const char *name : {"GSM", "GPRS", "EDGE", "CDMA"}) {
        EXPECT_EQ(class_of(name), 2) << name;
    }
    for (const char *name :
         {"HSDPA", "HSUPA", "UMTS", "HSPA", "HSPA+", "DC-HSPA+", "EVDO", "EVDO_EHRPD", "CDMA_EVDO", "TDSCDMA"}) {
        EXPECT_EQ(class_of(name), 3) << name;
    }
    EXPECT_EQ(class_of("LTE"), 4);
    for (const char *name : {"SA", "LTE-NSA", "ENDC"}) {
        EXPECT_EQ(class_of(name), 5) << name;
    }
    for (const char *name : {"", "lte", "LTE ", "LT", "LIMITED_SERVICE_GSM", "NO_SERVICE"}) {
        EXPECT_EQ(class_of(name), 1) << name;
    }
}

DEVICE_TEST(network, ClassesOnTheNetLed)
{
    switched_on(LED_PRODUCT_UFI);
    for (const char *name : {"GSM", "UMTS", "LTE", "SA", "none", ""}) { // the last two are one class
        nv("network_type", name);
        notify(KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE);
    }
    expect_effects(R"(
        only net_blue on 2
        only net_blue on 2
        only net_blue on 2
        only net_white on 2
        only net_red on 2)");

    notify(KIV_MODULE_NWINFO, REG_NWINFO_NETTYPE);
    expect_log("kiv_mirta_led", R"(
        info "recv  REG_NWINFO_NETTYPE \n"
        error "recv nettype \n"
        info "enter kiv_led_handle_nwinfoStatus : 1\n "
        info "kiv_set_net_led_state :state same!\n")");
}

// A text that does not fit is cut; the handheld shows no roaming and no bars.
DEVICE_TEST(network, RoamingAndBarsOfTheHandheld)
{
    switched_on(LED_PRODUCT_UFI);
    nv("simcard_roam", std::string(500, 'r'));
    nv("signalbar", "3");
    notify(KIV_MODULE_NWINFO, REG_NWINFO_ROAMING_STATUS);
    notify(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR);
    expect_effects("");
    expect_log("kiv_mirta_led", R"(
        info "recv  REG_NWINFO_ROAMING_STATUS \n"
        error "recv roam state:r{63}...\n"
        info "recv  REG_NWINFO_SIG_BAR \n"
        info "recv_nwSigStatus :3")");
}

// Neither power nor sleep is looked at.
DEVICE_TEST(signal_led, DataCard)
{
    switched_on(LED_PRODUCT_DATA_CARD);
    led_power_state = POWER_OFF;
    cur_led_sleep_status = 1;
    for (const char *bars : {"", "1", "2", "2", "5", "7", "5", "-1", "0", "99999999999", "3", "4"}) {
        nv("signalbar", bars);
        notify(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR);
    }
    expect_effects(R"(
        sig_6 blink 200/1400 4
        sig_6 on 4
        sig_6 on 4
        sig_6 on 4
        sig_6 off
        sig_6 on 4
        sig_6 on 4)");

    nv("signalbar", "1");
    notify(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR);
    expect_log("kiv_mirta_led", R"(
        info "recv  REG_NWINFO_SIG_BAR \n"
        info "recv_nwSigStatus :1"
        info "kiv_led_handle_signal_state :1"
        info "kiv_set_signal_led_state :6")");
}

DEVICE_TEST(signal_led, SingleChip)
{
    const auto bars = [](const char *text) {
        nv("signalbar", text);
        notify(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR);
    };
    switched_on(LED_PRODUCT_UNI_CORE_CPE);
    for (const char *text : {"0", "3", "4", "1", "-1"}) {
        bars(text);
    }
    expect_effects(R"(
        sig_blue on 3
        sig_blue on 1
        sig_blue on 3)");
    bars("2");
    expect_log("kiv_mirta_led", R"(
        info "recv  REG_NWINFO_SIG_BAR \n"
        info "recv_nwSigStatus :2"
        info "kiv_led_handle_signal_state :2"
        info "kiv_qt330x_set_led_signal_state: sig = 2")");

    over_temp_enable = 1;
    is_over_temp = 1;
    bars("1"); // for later
    expect_effects("");
    expect_log("kiv_mirta_led", R"(
        info "recv  REG_NWINFO_SIG_BAR \n"
        info "recv_nwSigStatus :1"
        error "kiv_cpe_led_handle_signal_state, OVER TEMP!")");
    EXPECT_EQ(int{led_signal_level}, 1);

    cur_led_sleep_status = 5;
    bars("2");
    expect_log("kiv_mirta_led", R"(
        info "recv  REG_NWINFO_SIG_BAR \n"
        info "recv_nwSigStatus :2"
        error "kiv_singlechip_led_handle_signal_state, sleep mode!")");
    led_power_state = POWER_RESETTING;
    bars("2");
    expect_log("kiv_mirta_led", R"(
        info "recv  REG_NWINFO_SIG_BAR \n"
        info "recv_nwSigStatus :2"
        error "kiv_singlechip_led_handle_signal_state, not power on!")");
    EXPECT_EQ(int{led_signal_level}, 1);
}

DEVICE_TEST(wifi, StatusAndPairing)
{
    switched_on(LED_PRODUCT_UFI);
    notify(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, "1");
    notify(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, "2");
    notify(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, "0");
    notify(KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE, "1");
    notify(KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE_CHIP2, "0");
    expect_effects(R"(
        wifi_blue on 2
        wifi_blue off
        wifi_blue blink 400/1600 2
        wifi_blue on 2)");
    expect_log("kiv_mirta_led", R"(
        info " recv REG_WLAN_CURRENT_STATUS wifi status= p_data=1\n"
        info "enter kiv_led_set_led_wifi_status wifi_status=1, cur_led_sleep_status=0\n"
        info "wifi blue on\n"
        info " recv REG_WLAN_CURRENT_STATUS wifi status= p_data=2\n"
        info "enter kiv_led_set_led_wifi_status wifi_status=2, cur_led_sleep_status=0\n"
        info " recv REG_WLAN_CURRENT_STATUS wifi status= p_data=0\n"
        info "enter kiv_led_set_led_wifi_status wifi_status=0, cur_led_sleep_status=0\n"
        info "wifi led off\n"
        info "recv REG_WLAN_AP_WPS_STATE p_data=1\n"
        info "enter kiv_led_set_led_wps_status wps_status=1, cur_led_sleep_status=0\n"
        info "WPS active, wifi blue blink 2 mins\n"
        info "recv REG_WLAN_AP_WPS_STATE p_data=0\n"
        info "enter kiv_led_set_led_wps_status wps_status=0, cur_led_sleep_status=0\n"
        info "WPS disactive,wifi blue on\n")");
}

TEST(wifi, WhichProductsShowIt)
{
    const auto shows = [](led_product product, const std::string &status, const std::string &pairing) {
        on_a_fresh_device("product " + std::to_string(product), [product, status, pairing] {
            switched_on(product);
            notify(KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS, "1");
            expect_effects(status);
            notify(KIV_MODULE_WLAN, REG_WLAN_AP_WPS_STATE, "1");
            expect_effects(pairing);
        });
    };
    shows(LED_PRODUCT_UFI, "wifi_blue on 2", "wifi_blue blink 400/1600 2");
    shows(LED_PRODUCT_DATA_CARD, "", "");
    shows(LED_PRODUCT_PAPER_KITE, "wifi_blue on 2", "wifi_blue blink 400/1600 2");
    shows(LED_PRODUCT_MODULE, "", "");
    shows(LED_PRODUCT_UNI_CORE_CPE, "wifi_blue on 2", "wifi_blue blink 400/1600 2");
}

// A relight reads Wi-Fi and both chips' pairing from NV.
DEVICE_TEST(wifi, Relit)
{
    const auto relit = [](const char *status, const char *chip1, const char *chip2, const std::string &lines,
                          const std::string &led) {
        nv("wifi_onoff_state", status);
        nv("wifi_chip1_wps_state", chip1);
        nv("wifi_chip2_wps_state", chip2);
        command(KIV_MSG_CMD_LED_RELIGHT_MSG);
        expect_log("kiv_mirta_led", R"(
            error "Enter kiv_led_handle_relight_msg"
            error "kiv_cpe_led_relight_signal_state, NOT OVER TEMP!"
            info "kiv_qt330x_set_led_signal_state: sig = 0")" +
                                        lines + R"(
            info "enter kiv_set_net_led_state type=0 , ppp=0\n"
            error "Exit kiv_led_handle_relight_msg")");
        expect_effects("sig_blue on 0\npower_blue on 2\n" + led);
    };
    switched_on(LED_PRODUCT_UFI);
    relit("1", "", "1", R"(
        info "WIFI status: 1  WPS status: ,1\n"
        info "WPS active, wifi blue blink 2 mins\n")",
          "wifi_blue blink 400/1600 2");
    relit("0", "1", "", R"(
        info "WIFI status: 0  WPS status: 1,\n"
        info "wifi_wps_state: wifi led off\n"
        info "wifi led off\n")",
          "wifi_blue off");
    relit("1", "2", "0", R"(
        info "WIFI status: 1  WPS status: 2,0\n"
        info "WPS disactive,wifi blue on\n")",
          "wifi_blue on 2");
    relit("3", "1", "1", R"(
        info "WIFI status: 3  WPS status: 1,1\n")",
          "");
    cur_led_sleep_status = 2;
    relit("1", "1", "", R"(
        info "WIFI status: 1  WPS status: 1,\n"
        info "wifi_wps_state: sleep so wifi led off\n"
        info "wifi led off\n")",
          "wifi_blue off");
}

DEVICE_TEST(sms, NewMessageBlinksForTenSeconds)
{
    switched_on(LED_PRODUCT_UFI);
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS);
    expect_effects(R"(
        only sms_blue blink 800/1200 4
        timer 10000 once)");
    expect_log("kiv_mirta_led", R"(
        info "recv_SMSstatus"
        info "recv recv_SMSstatus status from 0 to 2 \n"
        info "kiv_led_handle_sms_state:sms_state=: 2 \n "
        info "enter kiv_led_set_new_sms_timer")");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS); // ten seconds from now
    expect_effects(R"(
        deleted timer 10000
        timer 10000 once)");
    expect_log("kiv_mirta_led", R"(
        info "recv_SMSstatus"
        info "recv recv_SMSstatus status from 2 to 2 \n"
        info "enter kiv_led_del_new_sms_timer"
        info "enter kiv_led_set_new_sms_timer")");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NV_UNREAD_SMS); // the blink goes on
    expect_effects("");
    expect_log("kiv_mirta_led", R"(
        info "recv_SMSstatus"
        info "recv REG_WMS_SMS_NV_UNREAD_SMS p_data=\n"
        info "recv recv_SMSstatus status from 2 to 1 \n"
        info "kiv_led_handle_sms_state:sms_state=: 1 \n ")");
    fire_timers(10000);
    expect_effects("only sms_blue on 4");
    expect_log("kiv_mirta_led", R"(
        info "enter kiv_led_new_sms_timeout_proc")");
    EXPECT_EQ(int{led_sms_state}, SMS_UNREAD);
    nv("sms_nvunread_count", "0");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NV_UNREAD_SMS);
    expect_effects("only sms_blue off");
    EXPECT_EQ(int{led_sms_state}, SMS_NONE);
}

DEVICE_TEST(sms, ReadWhileItBlinks)
{
    switched_on(LED_PRODUCT_UFI);
    nv("sms_nvunread_count", "0");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS);
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NV_UNREAD_SMS);
    expect_effects(R"(
        only sms_blue blink 800/1200 4
        timer 10000 once
        deleted timer 10000
        only sms_blue off)");
}

DEVICE_TEST(sms, NoTimerToBeHad)
{
    switched_on(LED_PRODUCT_UFI);
    fake_platform().failing_timers = 1;
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS);
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS);
    expect_effects(R"(
        only sms_blue blink 800/1200 4
        timer 10000 once fails
        timer 10000 once)");
}

// Full stays full until there is room, and ends the blink of a new message.
DEVICE_TEST(sms, StoreFull)
{
    switched_on(LED_PRODUCT_UFI);
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS);
    expect_effects(R"(
        only sms_blue blink 800/1200 4
        timer 10000 once)");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_MEMORY_FULL);
    expect_effects(R"(
        deleted timer 10000
        only sms_blue blink 800/1200 4)");
    expect_log("kiv_mirta_led", R"(
        info "recv_SMSstatus"
        info "recv recv_SMSstatus status from 2 to 3 \n"
        info "kiv_led_handle_sms_state:sms_state=: 3 \n "
        info "enter kiv_led_del_new_sms_timer")");
    nv("sms_nv_capability", "100");
    nv("sms_nvtotal_count", "100");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS);
    expect_effects("");
    expect_log("kiv_mirta_led", R"(
        info "recv_SMSstatus"
        info "recv recv_SMSstatus status from 3 to 2 \n"
        info "sms_nv_capability= 100 ,sms_nvtotal_count= 100 \n")");
    EXPECT_EQ(int{led_sms_state}, SMS_STORE_FULL);
    nv("sms_nvtotal_count", "99");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NV_UNREAD_SMS);
    expect_effects("only sms_blue on 4");
}

DEVICE_TEST(sms, AStateThatIsNoneIsForgotten)
{
    switched_on(LED_PRODUCT_UFI);
    led_sms_state = SMS_STORE_FULL;
    step([] { kiv_led_handle_sms_state(9); });
    expect_effects("");
    EXPECT_EQ(int{led_sms_state}, SMS_STORE_FULL);
}

DEVICE_TEST(sms, OffAndAsleepItIsOnlyRemembered)
{
    switched_on(LED_PRODUCT_UFI);
    led_power_state = POWER_OFF;
    notify(KIV_MODULE_SMS, REG_WMS_SMS_MEMORY_FULL);
    expect_effects("");
    EXPECT_EQ(int{led_sms_state}, SMS_STORE_FULL);
    led_power_state = POWER_ON;
    cur_led_sleep_status = 1;
    notify(KIV_MODULE_SMS, REG_WMS_SMS_NEW_SMS);
    expect_effects("");
    expect_log("kiv_mirta_led", R"(
        info "recv_SMSstatus"
        info "recv recv_SMSstatus status from 3 to 2 \n"
        info "recv recv_SMSstatus : sleep mode \n")");
    EXPECT_EQ(int{led_sms_state}, SMS_NEW);
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "0");
    expect_effects(R"(
        bat off
        only net_red on 2
        wifi_blue off
        only sms_blue blink 800/1200 4
        timer 10000 once)");
}

DEVICE_TEST(voice, PhoneOfTheSingleChip)
{
    switched_on(LED_PRODUCT_UNI_CORE_CPE);
    cur_led_sleep_status = 1; // rings all the same
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "PHONE BLINK");
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "PHONE BLINK");
    expect_effects("only voice_blue blink 400/1600 4");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_VOICE_PHONE_LED_STATE p_data=PHONE BLINK\n"
        info "recv_voicePhoneStatus, sleep mode \n "
        info "set voice phone led from 0 to 2\n"
        info "recv REG_VOICE_PHONE_LED_STATE p_data=PHONE BLINK\n"
        info "recv_voicePhoneStatus, sleep mode \n ")");
    led_power_state = POWER_OFF;
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "PHONE LED ON");
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "phone led on");
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "PHONE LED ON" + std::string(1008, '!'));
    expect_effects(R"(
        only voice_blue on 4
        only voice_blue off)");
    expect_log("kiv_mirta_led", R"(
        info "recv REG_VOICE_PHONE_LED_STATE p_data=PHONE LED ON\n"
        info "recv_voicePhoneStatus, not power on \n "
        info "set voice phone led from 2 to 1\n"
        info "recv REG_VOICE_PHONE_LED_STATE p_data=phone led on\n"
        info "recv_voicePhoneStatus, not power on \n "
        info "set voice phone led from 1 to 0\n"
        info "recv REG_VOICE_PHONE_LED_STATE p_data=PHONE LED ON!{1008}\n"
        info "recv_voicePhoneStatus, not power on \n ")");
}

TEST(voice, WhichProductsShowPhoneAndVoicemail)
{
    const auto shows = [](led_product product, const std::string &phone, const std::string &voicemail) {
        on_a_fresh_device("product " + std::to_string(product), [product, phone, voicemail] {
            switched_on(product);
            if (product == LED_PRODUCT_MODULE) {
                notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
            }
            forget();
            notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "PHONE BLINK");
            expect_effects(phone);
            notify(KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG, "1");
            expect_effects(voicemail);
        });
    };
    shows(LED_PRODUCT_UFI, "", "");
    shows(LED_PRODUCT_DATA_CARD, "", "");
    shows(LED_PRODUCT_PAPER_KITE, "", "");
    shows(LED_PRODUCT_MODULE, "only voice_blue blink 1000/1000 4", "only voicemail_green blink 1000/1000 1");
    shows(LED_PRODUCT_UNI_CORE_CPE, "only voice_blue blink 400/1600 4", "");
}
