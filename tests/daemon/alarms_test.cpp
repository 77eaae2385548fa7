#include "alarms/kiv_led_data_limit.h"
#include "alarms/kiv_led_over_temp.h"

#include "harness.h"

#include <gtest/gtest.h>

static void used_up(led_product product)
{
    product_on(product);
    led_net_type = 4;
    nv("data_volume_limit_switch", "1"), nv("data_volume_limit_unit", "data");
    nv("data_volume_limit_size", "1"), nv("monthly_tx_bytes", "1"), nv("data_volume_alert_percent", "100");
}

static void ticks(int count)
{
    for (int i = 0; i < count; ++i) {
        fake_note("tick"), fake_fire(2);
    }
}

struct usage {
    const char *unit, *size, *alert, *sent, *received, *time;
};

// One digit a usage: whether the alert level counts as reached.
static void reached(std::initializer_list<usage> usages)
{
    std::string digits;
    for (const usage &row : usages) {
        nv("data_volume_limit_unit", row.unit), nv("data_volume_limit_size", row.size), nv("monthly_time", row.time);
        nv("data_volume_alert_percent", row.alert), nv("monthly_tx_bytes", row.sent),
            nv("monthly_rx_bytes", row.received);
        digits += kiv_led_check_data_limit() == 1 ? '1' : '0';
    }
    forget(), fake_note(digits);
}

static void sensors(std::array<std::optional<int>, 7> readings)
{
    fake_platform().sensors = readings;
}

static void limit(const char *text)
{
    nv("thermal_led_enable", text), kiv_led_over_temp_init();
    fake_note("enabled " + std::to_string(over_temp_enable) + ", hot " + std::to_string(is_over_temp));
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(data_limit, Quotients)
{
    expect_effects("by data", "1010111",
        [] { reached({{"data", "4_1024", "75", "1610612736", "1610612736", ""},
                      {"data", "4_1024", "76", "1610612736", "1610612736", ""},
                      {"data", "0.5_1048576", "50", "274877906944", "0", ""},
                      {"data", "1_1", "100", "1048575", "0", ""}, {"data", "100_5", "99", "99", "", ""},
                      {"data", "1e2", "100", "100", "", ""}, {"data", "1", "100", "16777217", "", ""}}); });
    expect_effects("by time, other units, single precision", "10001", // the usage rounds down, the limit does not
        [] { reached({{"time", "10", "80", "", "", "30000"}, {"time", "10", "84", "", "", "30000"},
                      {"", "10", "1", "9", "9", "30000"}, {"data", "16777217", "100", "16777217", "", ""},
                      {"data", "16777216", "100", "16777217", "", ""}}); });
    expect_effects("infinite, not a number, sums and texts beyond range", "1010010",
        [] { reached({{"data", "0", "18446744073709551615", "1", "", ""}, {"data", "", "0", "", "", ""},
                      {"data", "x", "100", "1", "", ""}, {"time", "nan", "0", "", "", "5"},
                      {"data", "1_1024", "1", "18446744073709551615", "1", ""}, // the sum wraps to 0
                      {"data", "1", "5", "99999999999999999999999", "", ""}, {"data", "1e999", "1", "5", "5", ""}}); });
    expect_effects("switched off", "0",
        [] { nv("data_volume_limit_switch", "0"); reached({ {"data", "1", "1", "9", "", ""} }); });
    expect_calls("reads in their order", R"(
        nv data_volume_limit_switch 128 | nv data_volume_limit_unit 128 | nv monthly_tx_bytes 128
        nv monthly_rx_bytes 128 | nv data_volume_limit_size 128 | nv data_volume_alert_percent 128
        nv data_volume_limit_switch 128 | nv data_volume_limit_unit 128 | nv monthly_time 128
        nv data_volume_limit_size 128 | nv data_volume_alert_percent 128)",
        [] { nv("data_volume_limit_unit", "data"); kiv_led_check_data_limit(); nv("data_volume_limit_unit", "time");
             kiv_led_check_data_limit(); });
}

TEST(data_limit, Reminder)
{
    expect_effects("one check timer, the pattern, the phase goes on after a stop", R"(
        net off | led 15 on 2 | timer 5000 repeat "" = 1 | timer 1000 repeat "" = 2 | tick | tick | net off
        led 15 on 2 | tick | tick | tick | tick | net off | tick | net off | led 13 blink 400/400 2 | delete 2
        net off | led 15 on 2 | timer 1000 repeat "" = 3 | net off | net off | led 15 on 2)",
        [] { used_up(LED_PRODUCT_UFI); notify(3, 1, "1"); notify(3, 1, "1"); fake_fire(1); fake_fire(1); ticks(7);
             nv("data_volume_limit_switch", "0"); fake_fire(1); fake_fire(1); nv("data_volume_limit_switch", "12");
             fake_fire(1); fake_fire(3); fake_fire(3); });
    expect_effects("usage below the level, then the call ends", R"(
        net off | led 15 on 2 | timer 5000 repeat "" = 1 | timer 1000 repeat "" = 2 | delete 2 | net off | led 15 on 2
        timer 1000 repeat "" = 3 | net off | led 15 on 2 | delete 3 | net off | led 15 on 2 | delete 1)",
        [] { used_up(LED_PRODUCT_PAPER_KITE); nv("q6_ppp_status", "q6_ppp_connected"); notify(3, 4); fake_fire(1);
             nv("monthly_tx_bytes", "0"); fake_fire(1); nv("monthly_tx_bytes", "1"); fake_fire(1);
             nv("q6_ppp_status", ""); notify(3, 4, "1"); });
    expect_effects("asleep the check deletes itself, the call's end only darkens", R"(
        net off | led 15 on 2 | timer 5000 repeat "" = 1 | delete 1 | net off | ppp 0 | net off | led 8 off | net off
        led 15 on 2 | led 6 off)",
        [] { used_up(LED_PRODUCT_UNI_CORE_CPE); nv("network_type", "LTE"); notify(3, 1, "1"); cur_led_sleep_status = 1;
             fake_fire(1); notify(3, 1, "0"); fake_note("ppp " + std::to_string(led_ppp_state)); notify(27, 1, "5");
             notify(27, 1, "0"); });
    expect_effects("scenes stop both; failed timers", R"(
        net off | led 15 on 2 | timer 5000 repeat "" = 0 | timer 5000 repeat "" = 1 | timer 1000 repeat "" = 0
        delete 0 | net off | led 15 on 2 | delete 1 | handheld off)",
        [] { used_up(LED_PRODUCT_UFI); fake_platform().failing_timers = 1; notify(3, 1, "1"); notify(3, 1, "1");
             fake_platform().failing_timers = 1; fake_fire(1); mc(0x40000200); });
    expect_effects("a data card has none; while off the call is only recorded", "net off | led 15 on 2 | ppp 1",
        [] { used_up(LED_PRODUCT_DATA_CARD); notify(3, 1, "1"); led_power_state = POWER_OFF; notify(3, 1, "0");
             notify(3, 1, "1"); fake_note("ppp " + std::to_string(led_ppp_state)); });
    expect_calls("all calls of a check", R"(
        nv data_volume_limit_switch 2 | 6:kiv_led_data_limit "[info] enter  get_dstStatus status:1\n"
        6:kiv_led_data_limit "get_dstStatus, not power on \n " | nv data_volume_limit_switch 2
        6:kiv_led_data_limit "[info] enter  get_dstStatus status:1\n"
        6:kiv_led_data_limit "get_dstStatus, sleep mode \n " | nv data_volume_limit_switch 2
        6:kiv_led_data_limit "[info] enter  get_dstStatus status:1\n" | nv data_volume_limit_switch 128
        nv data_volume_limit_unit 128 | nv data_volume_limit_switch 128 | nv data_volume_limit_unit 128
        6:kiv_led_data_limit "[info]  data not overflow , stop remind\n")",
        [] { nv("data_volume_limit_switch", "1x"); led_ppp_state = 1; get_dstStatus(nullptr);
             led_power_state = POWER_ON; cur_led_sleep_status = 1; get_dstStatus(nullptr); cur_led_sleep_status = 0;
             get_dstStatus(nullptr); });
}

TEST(over_temp, ScansAndBlinks)
{
    expect_calls("the first sensor above the limit ends the scan", R"(
        nv thermal_led_enable 8 | 6:kiv_led_over_temp "Cur Temp LED switch:70" | sensor 0 | sensor 1
        0:kiv_led_over_temp "OVER temp led FUNC and blink!!"
        6_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=2\n" | led 8 blink 1000/1000 3
        timer 20000 repeat "" = 1 | 0:kiv_led_over_temp "Enable temp led FUNC!!" | enabled 1, hot 1 | sensor 0
        sensor 1 | sensor 0 | sensor 1 | sensor 2 | sensor 3 | sensor 4 | sensor 5 | sensor 6
        0:kiv_led_over_temp "Not over temp led FUNC and relight!!" | 6_operation "enter kiv_led_set_sig_led_off\n"
        led 8 off | 6 "kiv_qt330x_set_led_signal_state: sig = 2"
        6_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=0\n" | led 8 on 2)",
        [] { led_signal_level = 2; sensors({65, 71}); limit("70"); fake_fire(1); sensors({65, 70, 70, 70, 70, 70, 70});
             fake_fire(1); });
    expect_effects("a silent sensor counts as the one before it",
        "timer 20000 repeat \"\" = 1 | enabled 1, hot 0 | led 8 blink 1000/1000 3",
        [] { sensors({std::nullopt, 5}); limit("5"); sensors({6, std::nullopt}); fake_fire(1); });
    expect_effects("set up again while hot, then off, negative, beyond range", R"(
        led 8 blink 1000/1000 3 | timer 20000 repeat "" = 1 | enabled 1, hot 1 | enabled 1, hot 1 | delete 1
        led 8 off | led 8 on 0 | enabled 0, hot 0 | delete 0 | led 8 off | led 8 on 0 | enabled 0, hot 0
        timer 20000 repeat "" = 2 | enabled 1, hot 0)",
        [] { sensors({71}); limit("70"); limit("70"); limit("0"); limit("-5"); limit("99999999999999"); });
    expect_effects("no timer, and then one", R"(
        led 8 blink 1000/1000 3 | timer 20000 repeat "" = 0 | enabled 1, hot 1 | timer 20000 repeat "" = 1
        enabled 1, hot 1)", [] { sensors({71}); fake_platform().failing_timers = 1; limit("70"); limit("70"); });
    expect_logs("hot while switched off", R"(6:kiv_led_over_temp "Over temp switch is OFF.")",
        [] { kiv_led_set_over_temp_state(1); });
}
// clang-format on
