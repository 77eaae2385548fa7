// The module CPE.
#include "policy/cpe/battery.h"
#include "policy/cpe/indicators.h"
#include "policy/cpe/state.h"

#include "harness.h"

#include <gtest/gtest.h>

static void on()
{
    led_product_type = LED_PRODUCT_MODULE;
    led_enable = 1;
    fake_platform().charger = {0, 0};
    fake_platform().battery = {0, 1};
    nv("simcard_roam", "Home"), nv("network_type", "LTE"), nv("signalbar", "3"), nv("battery_value", "60");
    mc(0x40);
    forget();
}

static void now(int source, uint32_t event, const char *key, const char *value)
{
    nv(key, value), notify(source, event);
}

static void battery(const char *charging, const char *percent)
{
    nv("battery_charging", charging), now(1, 0x40000010, "battery_value", percent);
}

static void charger(std::optional<bsp_query_result> answer)
{
    fake_platform().charger = answer, getChargerConnect();
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(cpe, PowerEvents)
{
    expect_effects("power on reads everything again", R"(
        charger 0 0 | bat off | battery 0 0 | bat off | led 1 on 1 | voice off | led 58 on 1 | net off | led 13 on 1
        net off | led 14 on 1 | voice off | led 61 on 1 | voice off | led 59 on 1 | voicemail off
        led 63 blink 1000/1000 1 | system echo 1 > /sys/class/leds/led:wifi_power_ctrl/brightness | power 0 sleep 0)",
        [] { led_product_type = LED_PRODUCT_MODULE; led_enable = 1; fake_platform().charger = {0, 1};
             fake_platform().battery = {0, 1}; nv("simcard_roam", "Home"); nv("signalbar", "3");
             now(23, 0x40, "network_type", "LTE"); notify(5, 0x2000, "1"); nv("battery_value", "60"); mc(0x40);
             note_power(); });
    expect_effects("off, restarting, unreal",
        "bat off | net off | voice off | voicemail off |" + reverser +
        "4096\" | bat off | net off | voice off | voicemail off | bat off | net off | voice off | voicemail off",
        [] { on(); mc(0x20); mc(0x100); mc(0x800); now(23, 1, "signalbar", "5"); notify(3, 1, "1"); });
    expect_effects("charging while off leaves the battery dark", R"(
        bat off | net off | voice off | voicemail off | charger 0 0 | led 52 off | battery 0 0 | bat off | bat off)",
        [] { on(); nv("battery_charging", "1"); mc(0x400); });
    expect_effects("what this product ignores", "",
        [] { on(); mc(0x80); mc(0x200); mc(0x40000200); mc(0x40004000); notify(27, 1, "1"); mc(0x60); });
}

TEST(cpe, NetworkAndSignal)
{
    expect_effects("roaming, types, call, bars; what is the same shows nothing", R"(
        net off | led 14 blink 1000/1000 1 | voice off | led 59 on 1 | net off | led 16 blink 1000/1000 1 | voice off
        led 59 on 1 | net off | led 13 on 1 | voice off | led 58 on 1 | voice off | led 59 on 1 | voice off
        led 59 on 1 | net off | led 16 on 1 | voice off | led 59 on 1 | net off | led 16 on 1 | voice off
        led 61 on 1)",
        [] { on(); now(23, 2, "simcard_roam", "Away"); now(23, 2, "simcard_roam", "");
             now(23, 0x40, "network_type", "GSM"); now(23, 0x40, "network_type", "none");
             now(23, 0x40, "network_type", "SA"); now(23, 2, "simcard_roam", "Home");
             now(23, 0x40, "network_type", "UMTS"); notify(3, 1, "1"); notify(3, 1, "1"); now(23, 1, "signalbar", "9");
             now(23, 1, "signalbar", "0"); });
    expect_calls("lines before power-on and the pattern", R"(
        0_cpe "kiv_cpe_led_handle_nwinfoStatus, not power on!"
        0_cpe "kiv_cpe_led_handle_nwRoamStatus, not power on!" | 0_cpe "kiv_cpe_led_handle_pppStatus, not power on!"
        0_cpe "kiv_cpe_led_handle_signal_state, not power on!"
        0_cpe "kiv_cpe_led_handle_voicemail_state, not power on!" | 6_cpe "kiv_cpe_led_handle_nwinfoStatus:1 to 1"
        0_cpe "kiv_cpe_led_handle_nwRoamStatus:0 to 0" | 0_cpe "kiv_cpe_led_handle_pppStatus:0 to 1"
        6_set_status "kiv_cpe_set_led_net_led_status: type = 1, roam = 0"
        6_operation "enter kiv_led_set_net_led_operation led_id=13,led_operation=0\n"
        6_operation "enter kiv_led_set_net_led_off\n" | net off | led 13 on 1
        6_cpe "kiv_cpe_led_handle_signal_state:0 to 9"
        6_set_status "kiv_cpe_set_led_sig_led_status: type = 1, sig = 9,roam = 0"
        6_operation "kiv_led_set_voice_led_off" | voice off
        6_operation "kiv_led_set_voice_led_operation led_id=58,led_operation=0\n" | led 58 on 1)",
        [] { kiv_cpe_led_handle_nwinfoStatus(4); kiv_cpe_led_handle_nwRoamStatus(1); kiv_cpe_led_handle_pppStatus(1);
             kiv_cpe_led_handle_signal_state(3); kiv_cpe_led_handle_voicemail_state(1); cur_cpe_power_state = POWER_ON;
             kiv_cpe_led_handle_nwinfoStatus(1); kiv_cpe_led_handle_nwRoamStatus(0); kiv_cpe_led_handle_pppStatus(1);
             kiv_cpe_led_handle_signal_state(9); });
}

TEST(cpe, BatteryAndCharger)
{
    expect_effects("levels", R"(
        battery 0 0 | bat off | led 0 blink 1000/1000 1 | battery 0 0 | bat off | led 3 blink 1000/1000 1
        battery 0 0 | battery 0 0 | bat off | led 1 blink 1000/1000 1 | battery 0 0 | bat off | battery 0 0 | bat off
        led 0 on 1 | battery 0 0 | bat off | led 3 on 1 | battery 0 0 | bat off | led 1 on 1 | battery 0 0 | bat off
        led 0 on 1)",
        [] { on(); battery("1", "20"); battery("1", "21"); battery("1", "50"); battery("1", "51"); battery("3", "51");
             battery("0", "20"); battery("0", "50"); battery("2", "51"); battery("", "x"); });
    expect_logs("no battery, no answer, no valid answer", R"(
        6_cpe "[info] enter getBatteryExist" | 6_cpe "[info] isBattExist ret 0,data 2!!"
        6_set_status "enter kiv_cpe_led_set_bat_status cur_cpe_battery_status=7\n"
        6_operation "kiv_led_set_bat_led_off" | 6_cpe "[info] enter getBatteryExist"
        6_cpe "[info] enter getBatteryExist" | 6_cpe "[info] isBattExist ret -3,data 1!!"
        0_cpe "getBatteryExist error = -3")",
        [] { on(); fake_platform().battery = {0, 2}; kiv_cpe_led_handle_battery_state();
             fake_platform().battery.reset(); kiv_cpe_led_handle_battery_state(); fake_platform().battery = {-3, 1};
             kiv_cpe_led_handle_battery_state(); });
    expect_logs("charger answers", R"(
        6_cpe "[info] enter getChargerConnect" | 6_cpe "[info] isUsbCharged ret 0,data 5!!"
        6_cpe "getChargerConnect: 2" | 6_cpe "kiv_cpe_led_handle_charger_state: 2!"
        6_operation "enter kiv_led_set_power_led_off\n" | 6_cpe "[info] enter getChargerConnect"
        6_cpe "[info] isUsbCharged ret 0,data 1!!" | 6_cpe "getChargerConnect: 1"
        6_cpe "kiv_cpe_led_handle_charger_state: 1!"
        6_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=0\n"
        0_operation "led id error!\n" | 6_cpe "[info] enter getChargerConnect"
        6_cpe "[info] isUsbCharged ret 1,data 0!!" | 6_cpe "getChargerConnect: 1"
        6_cpe "kiv_cpe_led_handle_charger_state: 1!"
        6_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=0\n"
        0_operation "led id error!\n" | 6_cpe "[info] enter getChargerConnect" | 6_cpe "getChargerConnect: 1"
        6_cpe "kiv_cpe_led_handle_charger_state: 1!"
        6_operation "enter kiv_led_set_power_led_operation led_id=54,led_operation=0\n"
        0_operation "led id error!\n")",
        [] { charger({ {0, 5} }); charger({{0, 1}}); charger({{1, 0}}); charger(std::nullopt); });
}
// clang-format on
