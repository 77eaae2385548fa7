// The module CPE.
#include "harness.h"
#include "policy/cpe/setters.h"
#include "policy/cpe/state.h"
#include "policy/singlechip/setters.h"

static void switched_on_module()
{
    led_product_type = LED_PRODUCT_MODULE;
    led_enable = 1;
    fake_platform().charger = {0, 0};
    fake_platform().battery = {0, 1};
    nv("simcard_roam", "Home");
    nv("network_type", "LTE");
    nv("signalbar", "3");
    nv("battery_value", "60");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
    forget();
}

static void network(uint32_t event, const char *key, const char *value)
{
    nv(key, value);
    notify(KIV_MODULE_NWINFO, event);
}

static void battery(const char *charging, const char *percent)
{
    nv("battery_charging", charging);
    nv("battery_value", percent);
    notify(KIV_MODULE_MAIN, REG_MC_BATTERY_VALUE);
}

// Everything that is remembered is shown, then read again.
DEVICE_TEST(module, EveryCallOfAPowerOn)
{
    led_product_type = LED_PRODUCT_MODULE;
    led_enable = 1;
    cur_cpe_voicemail_state = 1;
    cur_cpe_battery_status = CPE_BAT_LOW;
    fake_platform().charger = {0, 1};
    fake_platform().battery = {0, 1};
    nv("simcard_roam", "Home");
    nv("signalbar", "3");
    nv("network_type", "LTE");
    nv("battery_value", "60");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
    expect_calls(R"(
        info kiv_mirta_led_cpe "recv REG_MC_EVENT_POWERON \n"
        info kiv_mirta_led_cpe "enter kiv_led_set_led_when_power_on\n"
        info kiv_mirta_led_cpe "[info] enter getChargerConnect"
        query charger
        info kiv_mirta_led_cpe "[info] isUsbCharged ret 0,data 1!!"
        info kiv_mirta_led_cpe "getChargerConnect: 1"
        info kiv_mirta_led_cpe "kiv_cpe_led_handle_charger_state: 1!"
        info kiv_mirta_led_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=0\n"
        error kiv_mirta_led_operation "led id error!\n"
        info kiv_mirta_led_set_status "enter kiv_cpe_led_set_bat_status cur_cpe_battery_status=3\n"
        info kiv_mirta_led_operation "enter kiv_led_set_bat_led_operation led_id=0,led_operation=0\n"
        info kiv_mirta_led_operation "kiv_led_set_bat_led_off"
        only bat_red on 1
        info kiv_mirta_led_cpe "[info] enter getBatteryExist"
        query battery
        info kiv_mirta_led_cpe "[info] isBattExist ret 0,data 1!!"
        nv battery_charging 64
        info kiv_mirta_led_cpe "kiv_cpe_led_handle_battery_state battery_charging = 0"
        nv battery_value 64
        info kiv_mirta_led_cpe "kiv_cpe_led_handle_battery_state buf_percent = 60"
        info kiv_mirta_led_set_status "enter kiv_cpe_led_set_bat_status cur_cpe_battery_status=1\n"
        info kiv_mirta_led_operation "enter kiv_led_set_bat_led_operation led_id=1,led_operation=0\n"
        info kiv_mirta_led_operation "kiv_led_set_bat_led_off"
        only bat_green on 1
        info kiv_mirta_led_set_status "kiv_cpe_set_led_sig_led_status: type = 1, sig = 0,roam = 0"
        info kiv_mirta_led_operation "kiv_led_set_voice_led_off"
        voice off
        info kiv_mirta_led_operation "kiv_led_set_voice_led_operation led_id=58,led_operation=0\n"
        voice_red on 1
        info kiv_mirta_led_set_status "kiv_cpe_set_led_net_led_status: type = 1, roam = 0"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_operation led_id=13,led_operation=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_off\n"
        only net_red on 1
        nv simcard_roam 64
        error kiv_mirta_led "recv roam state:Home...\n"
        error kiv_mirta_led_cpe "kiv_cpe_led_handle_nwRoamStatus:0 to 0"
        nv network_type 64
        error kiv_mirta_led "recv nettype LTE\n"
        info kiv_mirta_led_cpe "kiv_cpe_led_handle_nwinfoStatus:1 to 4"
        info kiv_mirta_led_set_status "kiv_cpe_set_led_net_led_status: type = 4, roam = 0"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_operation led_id=14,led_operation=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_off\n"
        only net_14 on 1
        info kiv_mirta_led_set_status "kiv_cpe_set_led_sig_led_status: type = 4, sig = 0,roam = 0"
        info kiv_mirta_led_operation "kiv_led_set_voice_led_off"
        voice off
        info kiv_mirta_led_operation "kiv_led_set_voice_led_operation led_id=61,led_operation=0\n"
        voice_yellow on 1
        nv signalbar 64
        info kiv_mirta_led "recv_nwSigStatus :3"
        info kiv_mirta_led_cpe "kiv_cpe_led_handle_signal_state:0 to 3"
        info kiv_mirta_led_set_status "kiv_cpe_set_led_sig_led_status: type = 4, sig = 3,roam = 0"
        info kiv_mirta_led_operation "kiv_led_set_voice_led_off"
        voice off
        info kiv_mirta_led_operation "kiv_led_set_voice_led_operation led_id=59,led_operation=0\n"
        voice_green on 1
        info kiv_mirta_led_operation "kiv_led_set_voicemail_led_off"
        voicemail off
        info kiv_mirta_led_operation "kiv_led_set_voicemail_led_operation led_id=63,led_operation=2\n"
        voicemail_green blink 1000/1000 1
        shell echo 1 > /sys/class/leds/led:wifi_power_ctrl/brightness)");
    EXPECT_EQ(int{led_power_state}, POWER_NOT_YET) << "it keeps a power state of its own";
}

DEVICE_TEST(module, ShuttingDown)
{
    switched_on_module();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_SHUTTING_DOWN);
    expect_effects(R"(
        bat off
        net off
        voice off
        voicemail off
        sent MAIN cmd 12034 source 38 len 8 event 0x20000000 "4096" 8)");
    expect_log("kiv_mirta_led_cpe", R"(
        info "recv REG_MC_EVENT_SHUTTING_DOWN \n"
        info "enter kiv_led_set_led_when_power_off\n")");
    EXPECT_EQ(int{cur_cpe_power_state}, POWER_OFF);
}

DEVICE_TEST(module, RestartingKeepsTheState)
{
    switched_on_module();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_RESTARTING);
    expect_effects(R"(
        bat off
        net off
        voice off
        voicemail off)");
    expect_log("kiv_mirta_led_cpe", R"(
        info "recv REG_MC_EVENT_RESTARTING \n")");
    EXPECT_EQ(int{cur_cpe_power_state}, POWER_ON);
}

// What comes while it is not on is dropped, but for a voicemail.
DEVICE_TEST(module, OffForTheEye)
{
    switched_on_module();
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_UNREADL);
    expect_effects(R"(
        bat off
        net off
        voice off
        voicemail off)");
    expect_log("kiv_mirta_led_cpe", R"(
        info "recv REG_MC_EVENT_POWER_OFF_UNREADL \n"
        info "enter kiv_cpe_led_set_led_when_power_off_unreal\n")");
    EXPECT_EQ(int{cur_cpe_power_state}, POWER_OFF_UNREAL);

    network(REG_NWINFO_NETTYPE, "network_type", "GSM");
    network(REG_NWINFO_ROAMING_STATUS, "simcard_roam", "Away");
    network(REG_NWINFO_SIG_BAR, "signalbar", "0");
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG, "1");
    expect_effects("");
    expect_log("kiv_mirta_led_cpe", R"(
        error "kiv_cpe_led_handle_nwinfoStatus, not power on!"
        error "kiv_cpe_led_handle_nwRoamStatus, not power on!"
        error "kiv_cpe_led_handle_signal_state, not power on!"
        error "kiv_cpe_led_handle_pppStatus, not power on!"
        error "kiv_cpe_led_handle_voicemail_state, not power on!")");
    EXPECT_EQ(int{cur_cpe_signal_state}, 3);
    EXPECT_EQ(int{cur_cpe_voicemail_state}, 1);
}

DEVICE_TEST(module, OffAndChargingLeavesTheBatteryDark)
{
    switched_on_module();
    nv("battery_charging", "1");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_CHARGE);
    expect_effects(R"(
        bat off
        net off
        voice off
        voicemail off
        power_blue off
        bat off
        bat off)");
    expect_log("kiv_mirta_led_set_status", R"(
        info "enter kiv_led_set_all_leds_off\n"
        info "enter kiv_cpe_led_set_bat_status cur_cpe_battery_status=4\n"
        info "enter kiv_cpe_led_set_bat_status cur_cpe_battery_status=4\n")");
    EXPECT_EQ(int{cur_cpe_power_state}, POWER_OFF_CHARGE);
}

DEVICE_TEST(module, WhatItIgnores)
{
    switched_on_module();
    for (const uint32_t event : {REG_MC_EVENT_RESETTING, REG_MC_EVENT_INITAL, REG_MC_EVENT_POWER_OFF_QUICKEN,
                                 REG_MC_EVENT_POWER_OFF_QUICKEN_ACK}) {
        notify(KIV_MODULE_MAIN, event);
    }
    notify(KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT, "1");
    expect_effects("");
    expect_log("kiv_mirta_led_cpe", R"(
        info "enter kiv_led_set_led_when_sleep_status_change sleep_status=1\n")");
}

DEVICE_TEST(module, NetworkAndSignal)
{
    switched_on_module();
    network(REG_NWINFO_ROAMING_STATUS, "simcard_roam", "Away");
    expect_effects(R"(
        only net_14 blink 1000/1000 1
        only voice_green on 1)");
    expect_log("kiv_mirta_led_cpe", R"(
        error "kiv_cpe_led_handle_nwRoamStatus:0 to 1")");
    expect_log("kiv_mirta_led_set_status", R"(
        info "kiv_cpe_set_led_net_led_status: type = 4, roam = 1"
        info "kiv_cpe_set_led_sig_led_status: type = 4, sig = 3,roam = 1")");
    network(REG_NWINFO_ROAMING_STATUS, "simcard_roam", ""); // still roaming
    expect_effects("");
    network(REG_NWINFO_NETTYPE, "network_type", "GSM");
    expect_effects(R"(
        only net_16 blink 1000/1000 1
        only voice_green on 1)");
    expect_log("kiv_mirta_led_cpe", R"(
        info "kiv_cpe_led_handle_nwinfoStatus:4 to 2")");
    network(REG_NWINFO_NETTYPE, "network_type", "none");
    expect_effects(R"(
        only net_red on 1
        only voice_red on 1)");
    network(REG_NWINFO_NETTYPE, "network_type", "SA"); // 5G has no colour
    expect_effects("only voice_green on 1");
    network(REG_NWINFO_ROAMING_STATUS, "simcard_roam", "Home");
    expect_effects("only voice_green on 1");
    network(REG_NWINFO_NETTYPE, "network_type", "UMTS");
    expect_effects(R"(
        only net_16 on 1
        only voice_green on 1)");
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    expect_effects("only net_16 on 1");
    expect_log("kiv_mirta_led_cpe", R"(
        error "kiv_cpe_led_handle_pppStatus:0 to 1")");
    expect_log("kiv_mirta_led_set_status", R"(
        info "kiv_cpe_set_led_net_led_status: type = 3, roam = 0")");
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    expect_effects("");
    network(REG_NWINFO_SIG_BAR, "signalbar", "9"); // no such bars
    expect_effects("");
    expect_log("kiv_mirta_led_cpe", R"(
        info "kiv_cpe_led_handle_signal_state:3 to 9")");
    expect_log("kiv_mirta_led_set_status", R"(
        info "kiv_cpe_set_led_sig_led_status: type = 3, sig = 9,roam = 0")");
}

// The steps of the tables: each class at home and roaming, each number of bars, each state of the phone.
DEVICE_TEST(module, StepsOfEachValue)
{
    step([] {
        for (int type = 0; type <= 5; ++type) {
            kiv_cpe_set_led_net_led_status(type, 0);
            kiv_cpe_set_led_net_led_status(type, 1);
        }
    });
    expect_effects(R"(
        only net_red on 1
        only net_red on 1
        only net_16 on 1
        only net_16 blink 1000/1000 1
        only net_16 on 1
        only net_16 blink 1000/1000 1
        only net_14 on 1
        only net_14 blink 1000/1000 1)");
    step([] {
        for (int bars = -1; bars <= 6; ++bars) {
            kiv_cpe_set_led_sig_led_status(4, bars, 0);
        }
    });
    expect_effects(R"(
        only voice_yellow on 1
        only voice_yellow on 1
        only voice_yellow on 1
        only voice_green on 1
        only voice_green on 1
        only voice_green on 1)");
}

TEST(voice, PhoneStatesThatNobodySends)
{
    on_a_fresh_device("phone", [] {
        for (const int state : {-1, 3, 7}) {
            step([state] {
                kiv_cpe_led_set_voice_status(state);
                kiv_singlechip_led_set_voice_status(state);
            });
            expect_effects("");
        }
    });
}

DEVICE_TEST(module, VoicemailAndPhone)
{
    switched_on_module();
    notify(KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG, "1");
    notify(KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG, "0"); // its own colour alone
    expect_effects(R"(
        only voicemail_green blink 1000/1000 1
        voicemail_green off)");
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "PHONE LED ON");
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "PHONE BLINK");
    notify(KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "");
    expect_effects(R"(
        only voice_blue on 4
        only voice_blue blink 1000/1000 4
        only voice_blue off)");
}

DEVICE_TEST(module, BatteryLevels)
{
    switched_on_module();
    battery("1", "20");
    battery("1", "21");
    battery("1", "50"); // the same status
    battery("1", "51");
    battery("3", "51"); // no battery
    battery("0", "20");
    battery("0", "50");
    battery("2", "51");
    battery("", "x");
    expect_effects(R"(
        only bat_red blink 1000/1000 1
        only bat_yellow blink 1000/1000 1
        only bat_green blink 1000/1000 1
        bat off
        only bat_red on 1
        only bat_yellow on 1
        only bat_green on 1
        only bat_red on 1)");
    battery("0", "60");
    expect_log("kiv_mirta_led_cpe", R"(
        info "recv REG_MC_BATTERY_VALUE\n"
        info "[info] enter getBatteryExist"
        info "[info] isBattExist ret 0,data 1!!"
        info "kiv_cpe_led_handle_battery_state battery_charging = 0"
        info "kiv_cpe_led_handle_battery_state buf_percent = 60")");
    expect_log("kiv_mirta_led_set_status", R"(
        info "enter kiv_cpe_led_set_bat_status cur_cpe_battery_status=1\n")");
}

DEVICE_TEST(module, BatteryThatIsNotThere)
{
    switched_on_module();
    fake_platform().battery = {0, 2};
    notify(KIV_MODULE_MAIN, REG_MC_CHARGIN_STATUS);
    expect_effects("bat off");
    expect_log("kiv_mirta_led_cpe", R"(
        info "recv REG_MC_CHARGIN_STATUS\n"
        info "[info] enter getBatteryExist"
        info "[info] isBattExist ret 0,data 2!!")");
    fake_platform().battery.reset();
    notify(KIV_MODULE_MAIN, REG_MC_CHARGIN_STATUS);
    expect_log("kiv_mirta_led_cpe", R"(
        info "recv REG_MC_CHARGIN_STATUS\n"
        info "[info] enter getBatteryExist")");
    fake_platform().battery = {-3, 1};
    notify(KIV_MODULE_MAIN, REG_MC_CHARGIN_STATUS);
    expect_log("kiv_mirta_led_cpe", R"(
        info "recv REG_MC_CHARGIN_STATUS\n"
        info "[info] enter getBatteryExist"
        info "[info] isBattExist ret -3,data 1!!"
        error "getBatteryExist error = -3")");
    EXPECT_EQ(int{cur_cpe_battery_status}, CPE_BAT_NONE);
}

// The charger's answer is remembered; one that is missing or not valid shows what is remembered.
DEVICE_TEST(module, ChargerAnswers)
{
    const auto answer = [](std::optional<bsp_query_result> charger) {
        fake_platform().charger = charger;
        notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWER_OFF_CHARGE);
        return int{cur_cpe_charger_state};
    };
    led_product_type = LED_PRODUCT_MODULE;
    led_enable = 1;
    EXPECT_EQ(answer(bsp_query_result{0, 5}), 2) << "not known yet";
    expect_log("kiv_mirta_led_cpe", R"(
        info "recv REG_MC_EVENT_POWER_OFF_CHARGE \n"
        info "enter kiv_led_set_led_when_power_off_charge\n"
        info "[info] enter getChargerConnect"
        info "[info] isUsbCharged ret 0,data 5!!"
        info "getChargerConnect: 2"
        info "kiv_cpe_led_handle_charger_state: 2!"
        info "[info] enter getBatteryExist")");
    EXPECT_EQ(answer(bsp_query_result{0, 0}), 0);
    EXPECT_EQ(answer(bsp_query_result{0, 1}), 1);
    EXPECT_EQ(answer(bsp_query_result{1, 0}), 1);
    EXPECT_EQ(answer(std::nullopt), 1);
    EXPECT_EQ(answer(bsp_query_result{0, -1}), 1);
}

DEVICE_TEST(board_indications, ModuleShowsBatteryAndCharger)
{
    fake_platform().battery = {0, 1};
    start("MODULE");
    notify(KIV_MODULE_MAIN, REG_MC_EVENT_POWERON);
    forget();
    nv("battery_charging", "1");
    indicate(1350);
    expect_calls(R"(
        info kiv_mirta_led "[info] kiv_led_bspIpcCallBack : event id = 1350  \n"
        info kiv_mirta_led_cpe "[info] enter getBatteryExist"
        query battery
        info kiv_mirta_led_cpe "[info] isBattExist ret 0,data 1!!"
        nv battery_charging 64
        info kiv_mirta_led_cpe "kiv_cpe_led_handle_battery_state battery_charging = 1"
        nv battery_value 64
        info kiv_mirta_led_cpe "kiv_cpe_led_handle_battery_state buf_percent = "
        info kiv_mirta_led_set_status "enter kiv_cpe_led_set_bat_status cur_cpe_battery_status=6\n"
        info kiv_mirta_led_operation "enter kiv_led_set_bat_led_operation led_id=0,led_operation=2\n"
        info kiv_mirta_led_operation "kiv_led_set_bat_led_off"
        only bat_red blink 1000/1000 1)");
    nv("battery_charging", "0");
    indicate(1351);
    expect_effects("only bat_red on 1");
    indicate(1356);
    expect_calls(R"(
        info kiv_mirta_led "[info] kiv_led_bspIpcCallBack : event id = 1356  \n"
        info kiv_mirta_led_cpe "kiv_cpe_led_handle_charger_state: 1!"
        info kiv_mirta_led_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=0\n"
        error kiv_mirta_led_operation "led id error!\n")");
    EXPECT_EQ(int{cur_cpe_charger_state}, 1);
    indicate(1357);
    expect_effects("power_blue off");
    EXPECT_EQ(int{cur_cpe_charger_state}, 0);
    for (const int stranger : {1349, 1352, 1353, 1354, 1355, 1358}) {
        indicate(stranger);
        expect_effects("");
    }
    expect_calls(R"(
        info kiv_mirta_led "[info] kiv_led_bspIpcCallBack : event id = 1358  \n")");
    step([] { EXPECT_EQ(fake_platform().indication(1350, 0, nullptr), -1); });
    expect_calls(R"(
        error/14 kiv_mirta_led "[info] current bspIpcCallBack ind_msg_struct is null.....\n")");
    char board_record[1] = {};
    EXPECT_EQ(fake_platform().indication(1350, 0, board_record), 0);
}

// Registered on the module CPE only; what would come on another product is routed all the same.
TEST(board_indications, OtherProducts)
{
    for (const led_product product :
         {LED_PRODUCT_UFI, LED_PRODUCT_DATA_CARD, LED_PRODUCT_PAPER_KITE, LED_PRODUCT_UNI_CORE_CPE}) {
        on_a_fresh_device("product " + std::to_string(product), [product] {
            start("MODULE");
            switched_on(product);
            nv("battery_exist", "1");
            nv("battery_charging", "2");
            forget();
            for (const int event : {1350, 1351, 1356, 1357}) {
                indicate(event);
                const bool asks = product == LED_PRODUCT_UFI && event >= 1356;
                expect_effects(asks ? "only bat_green on 4" : "");
            }
        });
    }
    for (const char *text : {"DRIVER_UFI", "ONLY_DATA_CARD", "PAPER_KITE", "UNI_CORE_CPE"}) {
        on_a_fresh_device(text, [text] {
            start(text);
            EXPECT_EQ(fake_platform().indication, nullptr);
        });
    }
}
