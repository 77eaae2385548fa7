// The indications that products share: network, signal, Wi-Fi, SMS, voicemail and phone.
#include "harness.h"
#include "policy/standard/signal_led.h"
#include "policy/standard/sms.h"
#include "policy/standard/wifi.h"

#include <gtest/gtest.h>

static void net_types(std::initializer_list<const char *> texts)
{
    for (const char *text : texts) {
        nv("network_type", text), notify(23, 0x40);
        fake_note(text + std::string(" is ") + std::to_string(led_net_type));
        led_net_type = 0;
    }
}

static void bars(std::initializer_list<const char *> counts)
{
    for (const char *count : counts) {
        nv("signalbar", count), notify(23, 1);
    }
}

static void wifi_and_wps(const char *wifi, const char *chip1, const char *chip2)
{
    nv("wifi_onoff_state", wifi), nv("wifi_chip1_wps_state", chip1), nv("wifi_chip2_wps_state", chip2);
    kiv_led_set_wifi_wps_state();
}

static void note_sms()
{
    fake_note("sms " + std::to_string(led_sms_state));
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(network, TypeShowsOnTheNetLed)
{
    expect_effects("classes by exact text", R"(
        net off | led 15 on 2 | GSM is 2 | net off | led 15 on 2 | CDMA is 2 | net off | led 15 on 2 | HSPA+ is 3
        net off | led 15 on 2 | CDMA_EVDO is 3 | net off | led 15 on 2 | LTE is 4 | net off | led 17 on 2 | SA is 5
        net off | led 17 on 2 | LTE-NSA is 5 | net off | led 17 on 2 | ENDC is 5 | net off | led 13 on 2 | lte is 1
        net off | led 13 on 2 | LIMITED_SERVICE_GSM is 1 | net off | led 13 on 2 | is 1)",
        [] { product_on(LED_PRODUCT_PAPER_KITE);
             net_types({"GSM", "CDMA", "HSPA+", "CDMA_EVDO", "LTE", "SA", "LTE-NSA", "ENDC", "lte",
                        "LIMITED_SERVICE_GSM", ""}); });
    expect_effects("the same class again, off, asleep", "net off | led 15 on 2 | net off",
        [] { product_on(LED_PRODUCT_UFI); nv("network_type", "UMTS"); notify(23, 0x40); notify(23, 0x40);
             nv("network_type", "SA"); led_power_state = POWER_OFF; notify(23, 0x40); led_power_state = POWER_ON;
             cur_led_sleep_status = 1; notify(23, 0x40); });
    expect_calls("a text that does not fit is cut", R"(
        recv 0 1036 | 6 "[info] enter messageParse fun\n" | 6 "recv_msg.us_source_module_id is 23"
        6 "recv_msg.us_cmd is 12034" | 6 "[info] msg MSG_CMD_SERVICE_NOTIFY \n"
        6 "regDecodeMsg source_id 23, mask1 2" | 6 "[info] source msg KIV_MODULE_NWINFO\n"
        6 "recv  REG_NWINFO_ROAMING_STATUS \n" | nv simcard_roam 64 | 0 "recv roam state:r{63}...\n")",
        [] { product_on(LED_PRODUCT_UFI); nv("simcard_roam", std::string(500, 'r').c_str()); notify(23, 2); });
}

TEST(network, SignalBars)
{
    expect_effects("data card, asleep and off too", R"(
        led 6 blink 200/1400 4 | led 6 on 4 | led 6 on 4 | led 6 on 4 | led 6 off | led 6 on 4)",
        [] { product_on(LED_PRODUCT_DATA_CARD); led_power_state = POWER_OFF; cur_led_sleep_status = 1;
             bars({"", "1", "2", "2", "5", "7", "5", "-1", "0", "99999999999", "3"}); });
    expect_effects("single chip", "led 8 on 3 | led 8 on 1 | led 8 on 3",
        [] { product_on(LED_PRODUCT_UNI_CORE_CPE); bars({"0", "3", "4", "1", "-1"}); led_power_state = POWER_RESETTING;
             bars({"2"}); led_power_state = POWER_ON; cur_led_sleep_status = 5; bars({"2"}); });
    expect_effects("single chip, too hot: stored for later", "level 2",
        [] { product_on(LED_PRODUCT_UNI_CORE_CPE); over_temp_enable = 1; is_over_temp = 1; bars({"2"});
             fake_note("level " + std::to_string(led_signal_level)); });
    expect_errors("single chip's lines", R"(
        0 "kiv_singlechip_led_handle_signal_state, not power on!"
        0 "kiv_singlechip_led_handle_signal_state, sleep mode!" | 0 "kiv_cpe_led_handle_signal_state, OVER TEMP!")",
        [] { kiv_singlechip_led_handle_signal_state(1); led_power_state = POWER_ON; cur_led_sleep_status = 1;
             kiv_singlechip_led_handle_signal_state(1); cur_led_sleep_status = 0; over_temp_enable = 1;
             is_over_temp = 1; kiv_singlechip_led_handle_signal_state(1); });
}

TEST(wifi, StatusAndPairing)
{
    expect_effects("notifications", R"(led 43 on 2 | led 43 off | led 43 blink 400/1600 2 | led 43 on 2)",
        [] { product_on(LED_PRODUCT_UFI); notify(10, 0x10, "1"); notify(10, 0x10, "2"); notify(10, 0x10, "0");
             notify(10, 0x80, "1"); notify(10, 0x100, "0"); led_product_type = LED_PRODUCT_MODULE;
             notify(10, 0x10, "1"); });
    expect_logs("relight, wake-up and their lines", R"(
        6 "WIFI status: 1  WPS status: ,1\n" | 6 "WPS active, wifi blue blink 2 mins\n"
        6_operation "enter kiv_led_set_wifi_led_operation led_id=43,led_operation=2\n"
        6 "WIFI status: 0  WPS status: 1,\n" | 6 "wifi_wps_state: wifi led off\n" | 6 "wifi led off\n"
        6_operation "kiv_led_set_wifi_led_off" | 6 "WIFI status: 1  WPS status: 2,0\n"
        6 "WPS disactive,wifi blue on\n"
        6_operation "enter kiv_led_set_wifi_led_operation led_id=43,led_operation=0\n"
        6 "WIFI status: 3  WPS status: 1,1\n" | 6 "WIFI status: 1  WPS status: ,\n"
        6 "wifi_wps_state: sleep so wifi led off\n" | 6 "wifi led off\n" | 6_operation "kiv_led_set_wifi_led_off"
        6 "enter kiv_led_set_led_wakeup_wlan\n" | 6 "WIFI status: 1\n" | 6 "WPS status: 0\n"
        6 "enter kiv_led_set_led_wifi_status wifi_status=1, cur_led_sleep_status=2\n" | 6 "wifi led off\n"
        6_operation "kiv_led_set_wifi_led_off" | 6 "enter kiv_led_set_led_wakeup_wlan\n"
        6 "enter kiv_led_set_led_wakeup_wlan, not power on \n " | 6 "enter kiv_led_set_led_wifi_init\n"
        6 "enter kiv_led_set_led_wifi_init, not power on \n "
        6 "enter kiv_led_set_wifi_wps_state, not power on \n ")",
        [] { product_on(LED_PRODUCT_UFI); wifi_and_wps("1", "", "1"); wifi_and_wps("0", "1", "");
             wifi_and_wps("1", "2", "0"); wifi_and_wps("3", "1", "1"); cur_led_sleep_status = 2;
             wifi_and_wps("1", "", ""); nv("RadioOff", "1"); nv("WscModeOption", "0"); kiv_led_set_led_wakeup_wlan();
             led_power_state = POWER_OFF; kiv_led_set_led_wakeup_wlan(); kiv_led_set_led_wifi_init();
             kiv_led_set_wifi_wps_state(); });
}

TEST(sms, NewMessageBlinksForTenSeconds)
{
    expect_effects("new, another, timer, unread, none", R"(
        sms off | led 50 blink 800/1200 4 | timer 10000 once "" = 1 | delete 1 | timer 10000 once "" = 2 | sms off
        led 50 on 4 | sms 1 | sms off | led 50 off | sms 0)",
        [] { product_on(LED_PRODUCT_UFI); notify(5, 4); notify(5, 4); notify(5, 2); fake_fire(2); note_sms();
             nv("sms_nvunread_count", "0"); notify(5, 2); note_sms(); });
    expect_effects("read while it blinks; a fired timer's handle is deleted", R"(
        sms off | led 50 blink 800/1200 4 | timer 10000 once "" = 1 | delete 1 | sms off | led 50 off | sms off
        led 50 blink 800/1200 4 | timer 10000 once "" = 2 | sms off | led 50 on 4 | sms off | led 50 blink 800/1200 4
        timer 10000 once "" = 3 | delete 3 | sms off | led 50 blink 800/1200 4 | sms 3)",
        [] { product_on(LED_PRODUCT_UFI); nv("sms_nvunread_count", "0"); notify(5, 4); notify(5, 2); notify(5, 4);
             fake_fire(2); notify(5, 4); notify(5, 0x1000); note_sms(); });
    expect_effects("no timer to be had", R"(
        sms off | led 50 blink 800/1200 4 | timer 10000 once "" = 0 | timer 10000 once "" = 1 | delete 1 | sms off
        led 50 off)",
        [] { product_on(LED_PRODUCT_UFI); fake_platform().failing_timers = 1; notify(5, 4); notify(5, 4);
             nv("sms_nvunread_count", "0"); notify(5, 2); });
}

TEST(sms, StoreFullAndGuards)
{
    expect_effects("full until there is room", R"(
        sms off | led 50 blink 800/1200 4 | sms 3 | sms 3 | sms off | led 50 on 4 | sms 1)",
        [] { product_on(LED_PRODUCT_UFI); notify(5, 0x1000); notify(5, 2); note_sms(); nv("sms_nv_capability", "100");
             nv("sms_nvtotal_count", "100"); notify(5, 4); note_sms(); nv("sms_nvtotal_count", "99"); notify(5, 2);
             note_sms(); });
    expect_effects("off and asleep only record", R"(
        sms 3 | sms 2 | bat off | net off | led 13 on 2 | led 43 off | sms off | led 50 blink 800/1200 4
        timer 10000 once "" = 1)",
        [] { product_on(LED_PRODUCT_UFI); led_power_state = POWER_OFF; notify(5, 0x1000); note_sms();
             led_power_state = POWER_ON; cur_led_sleep_status = 1; notify(5, 4); note_sms(); led_net_type = 1;
             notify(27, 1, "0"); });
    expect_effects("a quick power-off leaves the timer", "sms off | led 50 on 4",
        [] { product_on(LED_PRODUCT_UFI); notify(5, 4); mc(0x40000200); forget(); fake_fire(1); });
}

TEST(voice, RoutedByProduct)
{
    expect_effects("single chip, asleep and off too",
        "voice off | led 60 blink 400/1600 4 | voice off | led 60 on 4 | voice off | led 60 off",
        [] { product_on(LED_PRODUCT_UNI_CORE_CPE); cur_led_sleep_status = 1; notify(43, 2, "PHONE BLINK");
             notify(43, 2, "PHONE BLINK"); led_power_state = POWER_OFF; notify(43, 2, "PHONE LED ON");
             notify(43, 2, "phone led on"); notify(43, 2, "PHONE LED ON" + std::string(1008, '!')); });
    expect_effects("module, voicemail there alone",
        "voice off | led 60 blink 1000/1000 4 | voicemail off | led 63 blink 1000/1000 1",
        [] { product_on(LED_PRODUCT_MODULE);
             mc(0x40); forget(); notify(43, 2, "PHONE BLINK"); notify(5, 0x2000, "1");
             led_product_type = LED_PRODUCT_UFI; notify(5, 0x2000, "1"); notify(43, 2, "PHONE LED ON"); });
}
// clang-format on
