// The data-volume reminder and the over-temperature alarm.
#include "harness.h"

#include <algorithm>

constexpr int CHECK_MS = 5000;
constexpr int REMIND_MS = 1000;
constexpr int SCAN_MS = 20000;
static const std::string LOG_SOURCE = "kiv_led_data_limit";

// On, in a data call whose allowance is used up; the next check notices.
static void used_up(led_product product)
{
    switched_on(product);
    led_net_type = 4;
    nv("data_volume_limit_switch", "1");
    nv("data_volume_limit_unit", "data");
    nv("data_volume_limit_size", "1");
    nv("data_volume_alert_percent", "100");
    nv("monthly_tx_bytes", "1");
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    expect_effects(R"(
        only net_blue on 2
        timer 5000 repeat)");
}

static void check()
{
    fire_timers(CHECK_MS);
}

struct usage {
    const char *unit, *size, *alert, *sent, *received, *time;
};

// Whether the alert level counts as reached: whether a check starts or ends the reminder.
static bool reaches(const usage &row)
{
    nv("data_volume_limit_unit", row.unit);
    nv("data_volume_limit_size", row.size);
    nv("data_volume_alert_percent", row.alert);
    nv("monthly_tx_bytes", row.sent);
    nv("monthly_rx_bytes", row.received);
    nv("monthly_time", row.time);
    check();
    const std::map<int, fake_timer> timers = fake_timers();
    return std::ranges::any_of(timers, [](const auto &timer) { return timer.second.period_ms == REMIND_MS; });
}

DEVICE_TEST(data_limit, UsageByData)
{
    used_up(LED_PRODUCT_UFI);
    EXPECT_TRUE(reaches({"data", "4_1024", "75", "1610612736", "1610612736", ""}));
    EXPECT_FALSE(reaches({"data", "4_1024", "76", "1610612736", "1610612736", ""}));
    EXPECT_TRUE(reaches({"data", "0.5_1048576", "50", "274877906944", "0", ""}));
    EXPECT_FALSE(reaches({"data", "1_1", "100", "1048575", "0", ""}));
    EXPECT_TRUE(reaches({"data", "1_1", "100", "1048576", "0", ""}));
    EXPECT_TRUE(reaches({"data", "100_5", "99", "99", "", ""})); // no such unit: bytes
    EXPECT_TRUE(reaches({"data", "1e2", "100", "100", "", ""}));
    EXPECT_TRUE(reaches({"data", "1", "100", "16777217", "", ""}));
}

// The usage is rounded to single precision, the limit is not.
DEVICE_TEST(data_limit, UsageByTimeAndItsPrecision)
{
    used_up(LED_PRODUCT_UFI);
    EXPECT_TRUE(reaches({"time", "10", "80", "", "", "30000"}));
    EXPECT_FALSE(reaches({"time", "10", "84", "", "", "30000"}));
    EXPECT_FALSE(reaches({"", "10", "1", "9", "9", "30000"}));
    EXPECT_FALSE(reaches({"data", "16777217", "100", "16777217", "", ""}));
    EXPECT_TRUE(reaches({"data", "16777216", "100", "16777217", "", ""}));
}

DEVICE_TEST(data_limit, NumbersOutOfRange)
{
    used_up(LED_PRODUCT_UFI);
    EXPECT_TRUE(reaches({"data", "0", "18446744073709551615", "1", "", ""}));
    EXPECT_FALSE(reaches({"data", "", "0", "", "", ""}));
    EXPECT_TRUE(reaches({"data", "x", "100", "1", "", ""}));
    EXPECT_FALSE(reaches({"time", "nan", "0", "", "", "5"}));
    EXPECT_FALSE(reaches({"data", "1_1024", "1", "18446744073709551615", "1", ""})); // the sum wraps to 0
    EXPECT_TRUE(reaches({"data", "1", "5", "99999999999999999999999", "", ""}));
    EXPECT_FALSE(reaches({"data", "1e999", "1", "5", "5", ""}));
}

DEVICE_TEST(data_limit, EveryCallOfACheck)
{
    used_up(LED_PRODUCT_UFI);
    check();
    expect_calls(R"(
        nv data_volume_limit_switch 2
        info kiv_led_data_limit "[info] enter  get_dstStatus status:1\n"
        nv data_volume_limit_switch 128
        nv data_volume_limit_unit 128
        nv monthly_tx_bytes 128
        nv monthly_rx_bytes 128
        nv data_volume_limit_size 128
        nv data_volume_alert_percent 128
        info kiv_led_data_limit "[info] data overflow start remind\n"
        timer 1000 repeat)");
    nv("monthly_tx_bytes", "0");
    nv("data_volume_limit_unit", "time");
    check();
    expect_calls(R"(
        nv data_volume_limit_switch 2
        info kiv_led_data_limit "[info] enter  get_dstStatus status:1\n"
        nv data_volume_limit_switch 128
        nv data_volume_limit_unit 128
        nv monthly_time 128
        nv data_volume_limit_size 128
        nv data_volume_alert_percent 128
        nv data_volume_limit_switch 128
        nv data_volume_limit_unit 128
        nv monthly_time 128
        nv data_volume_limit_size 128
        nv data_volume_alert_percent 128
        info kiv_led_data_limit "[info]  data not overflow , stop remind\n"
        deleted timer 1000
        info kiv_mirta_led "enter kiv_set_net_led_state type=4 , ppp=1\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_operation led_id=15,led_operation=0\n"
        info kiv_mirta_led_operation "enter kiv_led_set_net_led_off\n"
        only net_blue on 2)");
}

// One check timer, one reminder; the pattern of seven seconds goes on where the last reminder stopped.
DEVICE_TEST(data_limit, Pattern)
{
    used_up(LED_PRODUCT_UFI);
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    check();
    check();
    expect_effects("timer 1000 repeat");
    const auto second = [](const std::string &shows) {
        fire_timers(REMIND_MS);
        expect_effects(shows);
    };
    const std::string normal = "only net_blue on 2";
    second("");
    expect_log(LOG_SOURCE, R"(
        info "[IN FUNC]:kiv_led_remind_data_limit_proc\n")");
    second(normal);
    second("");
    second("");
    second("");
    second("net off");
    second("only net_red blink 400/400 2");
    nv("data_volume_limit_switch", "0");
    check();
    expect_effects(R"(
        deleted timer 1000
        only net_blue on 2)");
    expect_log(LOG_SOURCE, R"(
        info "[info] enter  get_dstStatus status:0\n"
        info "[info] disable data overflow remind, stop remind\n")");
    check();
    expect_effects("");
    nv("data_volume_limit_switch", "12"); // the first character counts
    check();
    expect_effects("timer 1000 repeat");
    second("net off");
    second(normal);
    nv("data_volume_limit_switch", "2"); // neither on nor off
    check();
    expect_effects("");
}

// A tick that was already on its way when the reminder ended shows nothing.
DEVICE_TEST(data_limit, LateTick)
{
    used_up(LED_PRODUCT_UFI);
    check();
    const fake_timer late = running_timer(REMIND_MS);
    for (int second = 0; second < 5; ++second) {
        fire_timers(REMIND_MS);
    }
    nv("data_volume_limit_switch", "0");
    check();
    expect_effects(R"(
        timer 1000 repeat
        only net_blue on 2
        deleted timer 1000
        only net_blue on 2)");
    step([&late] { late.callback(late.argument); });
    expect_effects("");
}

DEVICE_TEST(data_limit, SecondProcessorsCall)
{
    switched_on(LED_PRODUCT_PAPER_KITE);
    led_net_type = 3;
    nv("q6_ppp_status", "q6_ppp_connected");
    notify(KIV_MODULE_PPP, REG_Q6_PPP_STATUS);
    expect_effects(R"(
        only net_blue on 2
        timer 5000 repeat)");
    expect_log(LOG_SOURCE, R"(
        error "q6_ppp_status q6_ppp_connected\n"
        info "[info] enter the pppStatus fun p_data:1\n"
        info "[info]PPP connect, start check data remind\n"
        info "[IN FUNC]:kiv_led_start_remind_data_limit_check\n")");
    nv("data_volume_limit_switch", "1");
    nv("data_volume_limit_unit", "data");
    nv("monthly_tx_bytes", "1");
    check();
    nv("q6_ppp_status", "");
    notify(KIV_MODULE_PPP, REG_Q6_PPP_STATUS, "1"); // NV counts, not the payload
    expect_effects(R"(
        timer 1000 repeat
        only net_blue on 2
        deleted timer 1000
        only net_blue on 2
        deleted timer 5000)");
    expect_log(LOG_SOURCE, R"(
        info "[info] enter  get_dstStatus status:1\n"
        info "[info] data overflow start remind\n"
        error "q6_ppp_status \n"
        info "[info] enter the pppStatus fun p_data:0\n"
        info "[info]PPP disconnect, stop data remind\n")");
}

DEVICE_TEST(data_limit, OnlyOneIsConnected)
{
    used_up(LED_PRODUCT_UFI);
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "2");
    expect_effects(R"(
        only net_blue on 2
        deleted timer 5000)");
    EXPECT_EQ(int{led_ppp_state}, 0);
}

// What a check finds while the device is off or asleep, or the call down although it was not told so.
DEVICE_TEST(data_limit, ChecksThatDoNothing)
{
    used_up(LED_PRODUCT_UFI);
    led_ppp_state = 0;
    check();
    expect_effects("");
    expect_log(LOG_SOURCE, R"(
        info "[info] enter  get_dstStatus status:1\n")");
    led_ppp_state = 1;
    led_power_state = POWER_OFF;
    check();
    expect_effects("");
    expect_log(LOG_SOURCE, R"(
        info "[info] enter  get_dstStatus status:1\n"
        info "get_dstStatus, not power on \n ")");
    led_power_state = POWER_ON;
    cur_led_sleep_status = 5; // not asleep
    check();
    expect_effects("timer 1000 repeat");
    cur_led_sleep_status = 1;
    check();
    expect_effects("deleted timer 5000");
    expect_log(LOG_SOURCE, R"(
        info "[info] enter  get_dstStatus status:1\n"
        info "get_dstStatus, sleep mode \n ")");
}

DEVICE_TEST(data_limit, CallWhileAsleepOrOff)
{
    used_up(LED_PRODUCT_UNI_CORE_CPE);
    cur_led_sleep_status = 1;
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "0");
    expect_effects(R"(
        net off
        deleted timer 5000)");
    expect_log(LOG_SOURCE, R"(
        error "[info] enter the pppStatus fun p_data:0\n"
        info "[info] enter the pppStatus fun p_data:0\n"
        info "enter kiv_led_handle_pppStatus, sleep mode \n ")");
    EXPECT_EQ(int{led_ppp_state}, 0);
    cur_led_sleep_status = 0;
    led_power_state = POWER_OFF;
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    expect_effects("");
    expect_log(LOG_SOURCE, R"(
        error "[info] enter the pppStatus fun p_data:1\n"
        info "[info] enter the pppStatus fun p_data:1\n"
        info "enter kiv_led_handle_pppStatus, not power on \n ")");
    EXPECT_EQ(int{led_ppp_state}, 1);
}

DEVICE_TEST(data_limit, TimersThatFail)
{
    switched_on(LED_PRODUCT_UFI);
    led_net_type = 4;
    fake_platform().failing_timers = 1;
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
    notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1"); // tried again
    expect_effects(R"(
        only net_blue on 2
        timer 5000 repeat fails
        timer 5000 repeat)");
}

TEST(data_limit, WhichProductsRemind)
{
    const auto reminds = [](led_product product, const std::string &expected) {
        on_a_fresh_device("product " + std::to_string(product), [product, expected] {
            switched_on(product);
            notify(KIV_MODULE_PPP, REG_PPP_STATUS, "1");
            expect_effects(expected);
        });
    };
    reminds(LED_PRODUCT_UFI, "timer 5000 repeat");
    reminds(LED_PRODUCT_DATA_CARD, "");
    reminds(LED_PRODUCT_PAPER_KITE, "timer 5000 repeat");
    reminds(LED_PRODUCT_MODULE, "");
    reminds(LED_PRODUCT_UNI_CORE_CPE, "timer 5000 repeat");
}

static void sensors(std::array<std::optional<int>, BSP_SENSOR_COUNT> readings)
{
    fake_platform().sensors = readings;
}

static void set_limit(const char *text)
{
    nv("thermal_led_enable", text);
    command(KIV_MSG_CMD_LED_OVER_TEMP_MSG);
}

DEVICE_TEST(over_temp, EveryCallOfASetUpWhileHotAndOfCooling)
{
    switched_on(LED_PRODUCT_UNI_CORE_CPE);
    led_signal_level = 2;
    sensors({65, 71});
    set_limit("70");
    expect_calls(R"(
        nv thermal_led_enable 8
        info kiv_led_over_temp "Cur Temp LED switch:70"
        sensor 0
        sensor 1
        error kiv_led_over_temp "OVER temp led FUNC and blink!!"
        info kiv_mirta_led_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=2\n"
        sig_blue blink 1000/1000 3
        timer 20000 repeat
        error kiv_led_over_temp "Enable temp led FUNC!!")");
    fire_timers(SCAN_MS); // the board keeps it blinking
    expect_calls(R"(
        sensor 0
        sensor 1)");
    sensors({65, 70, 70, 70, 70, 70, 70});
    fire_timers(SCAN_MS);
    expect_calls(R"(
        sensor 0
        sensor 1
        sensor 2
        sensor 3
        sensor 4
        sensor 5
        sensor 6
        error kiv_led_over_temp "Not over temp led FUNC and relight!!"
        info kiv_mirta_led_operation "enter kiv_led_set_sig_led_off\n"
        sig_blue off
        info kiv_mirta_led "kiv_qt330x_set_led_signal_state: sig = 2"
        info kiv_mirta_led_operation "enter kiv_led_set_sig_led_operation led_id=8,led_operation=0\n"
        sig_blue on 2)");
}

// A sensor that is silent counts as the one before it, the first one as 0.
DEVICE_TEST(over_temp, SilentSensors)
{
    switched_on(LED_PRODUCT_UFI);
    sensors({std::nullopt, 5});
    set_limit("5");
    EXPECT_EQ(int{is_over_temp}, 0);
    sensors({5, 5, 5, 5, 5, 5, 6});
    fire_timers(SCAN_MS);
    EXPECT_EQ(int{is_over_temp}, 1);
    sensors({});
    fire_timers(SCAN_MS);
    EXPECT_EQ(int{is_over_temp}, 0);
}

DEVICE_TEST(over_temp, SetUpAgain)
{
    switched_on(LED_PRODUCT_UFI);
    sensors({71});
    set_limit("70");
    expect_effects(R"(
        sig_blue blink 1000/1000 3
        timer 20000 repeat)");
    set_limit("70");
    expect_effects("");
    EXPECT_EQ(int{over_temp_enable}, 1);
    set_limit("0");
    expect_effects(R"(
        deleted timer 20000
        sig_blue off
        sig_blue on 0)");
    expect_log("kiv_led_over_temp", R"(
        info "Cur Temp LED switch:0"
        info "Delete over temp timer AND EXIT over temp mode\n")");
    EXPECT_EQ(int{over_temp_enable}, 0);
    EXPECT_EQ(int{is_over_temp}, 0);
    set_limit("-5");
    expect_effects(R"(
        deleted timer none
        sig_blue off
        sig_blue on 0)");
    set_limit("99999999999999");
    expect_effects("timer 20000 repeat");
}

DEVICE_TEST(over_temp, NoTimerToBeHadAtFirst)
{
    switched_on(LED_PRODUCT_UFI);
    fake_platform().failing_timers = 1;
    set_limit("70");
    expect_effects("timer 20000 repeat fails");
    expect_log("kiv_led_over_temp", R"(
        info "Cur Temp LED switch:70")");
    set_limit("70");
    expect_effects("timer 20000 repeat");
}

// A scan that was already on its way when the alarm was switched off remembers what it finds and shows nothing.
DEVICE_TEST(over_temp, LateScan)
{
    switched_on(LED_PRODUCT_UFI);
    set_limit("70");
    const fake_timer late = running_timer(SCAN_MS);
    set_limit("0");
    expect_effects(R"(
        timer 20000 repeat
        deleted timer 20000
        sig_blue off
        sig_blue on 0)");
    sensors({1});
    step([&late] { late.callback(late.argument); });
    expect_effects("");
    expect_log("kiv_led_over_temp", R"(
        info "Over temp switch is OFF.")");
    EXPECT_EQ(int{is_over_temp}, 1);
}

// The signal changes while the timer's thread makes the request for the blink: it is kept for later, not shown over it.
DEVICE_TEST(over_temp, SignalThatChangesAsTheBlinkBegins)
{
    switched_on(LED_PRODUCT_UNI_CORE_CPE);
    set_limit("70");
    sensors({71});
    forget();
    fake_platform().meanwhile = [](const std::string &line) {
        if (line == "sig_blue blink 1000/1000 3") {
            nv("signalbar", "1");
            notify(KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR);
        }
    };
    fire_timers(SCAN_MS);
    expect_effects("sig_blue blink 1000/1000 3");
    EXPECT_EQ(int{led_signal_level}, 1);
}
