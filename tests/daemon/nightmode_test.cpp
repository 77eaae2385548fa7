// Night mode, and the LED table for the TR-181 data model.
#include "harness.h"
#include "nightmode/kiv_led_tr181.h"

#include <atomic>
#include <chrono>
#include <sstream>
#include <thread>

constexpr int CHECK_MS = 20000;

static void set_up(const char *start, const char *end, const char *night_switch)
{
    led_enable = 1;
    nv("night_mode_start_time", start);
    nv("night_mode_end_time", end);
    nv("night_mode_switch", night_switch);
    command(KIV_MSG_CMD_LED_NIGHT_MODE_MSG);
}

static void check_at(int hour, int minute)
{
    utc(hour, minute);
    fire_timers(CHECK_MS);
}

// times: "21:59 lit 22:00 dark" and so on, in the order of the checks. The first check is made at noon.
static void expect_window(const char *start, const char *end, const char *times)
{
    on_a_fresh_device(start + std::string(" to ") + end, [start, end, times] {
        nv("nitz_sync_flag", "1");
        utc(12, 0);
        set_up(start, end, "1");
        std::istringstream expected(times);
        int hour = 0;
        int minute = 0;
        char colon = ':';
        for (std::string word; expected >> hour >> colon >> minute >> word;) {
            check_at(hour, minute);
            EXPECT_EQ(is_night_mode == 1 ? "dark" : "lit", word) << hour << ":" << minute;
        }
        EXPECT_TRUE(expected.eof());
    });
}

TEST(night_mode, WindowEdges)
{
    expect_window("22:00", "06:00", "21:59 lit 22:00 dark 23:59 dark 0:00 dark 5:59 dark 6:00 lit");
    expect_window("08:00", "20:00", "7:59 lit 8:00 dark 19:59 dark 20:00 lit");
    expect_window("07:30", "07:30", "7:29 dark 7:30 dark 0:00 dark");             // the whole day
    expect_window("22:30", "6", "22:29 lit 22:30 dark 6:29 dark 6:30 lit");       // the minutes are taken over
    expect_window("20:00", "25:00", "19:59 lit 20:00 dark 23:59 dark 0:00 lit");  // an end beyond the day
    expect_window("8:00:000000", "99999999999", "8:00 dark 7:59 lit 23:59 dark"); // cut to seven characters
    expect_window("x", "", "0:00 dark 23:59 dark");                               // no times: the whole day
}

DEVICE_TEST(night_mode, EveryCallFromASetUpByDayIntoTheNightAndBack)
{
    nv("nitz_sync_flag", "1");
    nv("syn_done", "2");
    nv("systime_mode", "auto");
    utc(21, 59);
    set_up("22:00", "06:00", "1");
    expect_calls(R"(
        nv night_mode_start_time 8
        info kiv_led_night_mode "Night mode: start_time:22:00\n"
        nv night_mode_end_time 8
        info kiv_led_night_mode "Night mode: end_time:06:00\n"
        nv night_mode_switch 8
        info kiv_led_night_mode "Cur night mode switch:1\n"
        nv night_mode_close_all_led 8
        info kiv_led_night_mode "Need close all led:0\n"
        nv nitz_sync_flag 8
        nv syn_done 8
        nv systime_mode 8
        error kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:1,0,1"
        error kiv_led_night_mode "Now is Normal mode, LED ON!\n"
        nv written is_night_mode=0
        relight
        timer 20000 repeat
        info kiv_led_night_mode "Creat night mode check timer SUCCESS\n")");
    check_at(22, 0);
    expect_calls(R"(
        nv nitz_sync_flag 8
        nv syn_done 8
        nv systime_mode 8
        error kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:,1,1"
        error kiv_led_night_mode "Night mode, LED OFF!\n"
        nv written is_night_mode=1
        relight)");
    check_at(22, 1); // nothing more to do
    expect_effects("");
    nv("nitz_sync_flag", "");
    check_at(22, 2);
    expect_effects(R"(
        nv written is_night_mode=0
        relight)");
    expect_log("kiv_led_night_mode", R"(
        info "Time not sync![0,2,auto]"
        error "[thread]First check night mode[arg, is in night, mode switch]:,0,1"
        error "Now is Normal mode, LED ON!\n")");
}

DEVICE_TEST(night_mode, SuspendedForTonight)
{
    nv("nitz_sync_flag", "1");
    utc(23, 0);
    set_up("22:00", "06:00", "2");
    expect_effects("timer 20000 repeat");
    expect_errors(R"(
        error kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:1,1,2"
        error kiv_led_night_mode "Normal mode, LED ON!\n")");
    check_at(23, 1);
    expect_effects("");
    check_at(6, 0);
    expect_effects(R"(
        nv written night_mode_switch=1
        nv written is_night_mode=0
        relight)");
    expect_log("kiv_led_night_mode", R"(
        error "[thread]First check night mode[arg, is in night, mode switch]:,0,2"
        error "Next time will Enable Night mode\n"
        error "Now is Normal mode, LED ON!\n")");
    check_at(22, 0);
    expect_effects(R"(
        nv written is_night_mode=1
        relight)");
}

DEVICE_TEST(night_mode, SetUpAgainByNightThenSwitchedOff)
{
    nv("nitz_sync_flag", "1");
    utc(23, 0);
    set_up("22:00", "06:00", "1");
    expect_effects(R"(
        nv written is_night_mode=1
        relight
        timer 20000 repeat)");
    set_up("22:00", "06:00", "1");
    expect_effects(R"(
        nv written is_night_mode=1
        relight)");
    set_up("22:00", "06:00", "3"); // as good as off
    expect_effects(R"(
        deleted timer 20000
        nv written is_night_mode=0
        relight)");
    set_up("22:00", "06:00", "");
    expect_effects(R"(
        deleted timer none
        nv written is_night_mode=0
        relight)");
    expect_errors(R"(
        error kiv_led_night_mode "Delete night mode check timer AND EXIT night mode\n")");
}

// The net LED is shown anew when its part in the night changes, by day too.
DEVICE_TEST(night_mode, CloseAllShowsTheNetLedAnew)
{
    led_net_type = 4;
    nv("night_mode_close_all_led", "1");
    set_up("22:00", "06:00", "0");
    expect_effects(R"(
        only net_blue on 2
        deleted timer none
        nv written is_night_mode=0
        relight)");
    EXPECT_EQ(int{night_mode_close_all_led}, 1);
    set_up("22:00", "06:00", "0");
    expect_effects(R"(
        deleted timer none
        nv written is_night_mode=0
        relight)");
}

// The clock counts once the network, a time server or a person has set it.
TEST(night_mode, ClockThatCounts)
{
    const auto dark = [](const char *nitz, const char *done, const char *mode, int expected) {
        on_a_fresh_device(std::string(nitz) + done + mode, [nitz, done, mode, expected] {
            utc(23, 0);
            nv("nitz_sync_flag", nitz);
            nv("syn_done", done);
            nv("systime_mode", mode);
            set_up("22:00", "06:00", "1");
            EXPECT_EQ(int{is_night_mode}, expected);
        });
    };
    dark("", "", "", 0);
    dark("2", "0", "manually", 0);
    dark("1", "", "", 1);
    dark("", "1", "", 1);
    dark("", "", "manual", 1);
}

// Only a text of one character is a first check, which acts although nothing has changed.
DEVICE_TEST(night_mode, FirstChecksAreThoseOfOneCharacter)
{
    char longer[] = "11";
    nv("nitz_sync_flag", "1");
    utc(23, 0);
    set_up("22:00", "06:00", "1");
    expect_effects(R"(
        nv written is_night_mode=1
        relight
        timer 20000 repeat)");
    const fake_timer timer = running_timer(CHECK_MS);
    step([&] { timer.callback(longer); });
    expect_effects("");
    expect_log("kiv_led_night_mode", R"(
        error "[thread]First check night mode[arg, is in night, mode switch]:11,1,1")");
    step([&] { timer.callback(nullptr); });
    expect_effects("");
    expect_log("kiv_led_night_mode", R"(
        error "[thread]First check night mode[arg, is in night, mode switch]:(null),1,1")");
}

DEVICE_TEST(night_mode, NoTimerToBeHadAtFirst)
{
    fake_platform().failing_timers = 1;
    set_up("22:00", "06:00", "1");
    expect_effects(R"(
        nv written is_night_mode=0
        relight
        timer 20000 repeat fails)");
    set_up("22:00", "06:00", "1");
    expect_effects(R"(
        nv written is_night_mode=0
        relight
        timer 20000 repeat)");
}

// A check on the timer's thread, and one of a set-up that begins meanwhile: it waits for the first to end.
DEVICE_TEST(night_mode, OneCheckAtATime)
{
    std::atomic<int> checks = 0;
    std::thread second;
    nv("nitz_sync_flag", "1");
    set_up("22:00", "06:00", "1");
    const fake_timer timer = running_timer(CHECK_MS);
    fake_platform().meanwhile = [&](const std::string &line) {
        if (line == "nv nitz_sync_flag 8" && ++checks == 1) {
            second = std::thread(timer.callback, timer.argument);
            std::this_thread::sleep_for(std::chrono::milliseconds(100));
            EXPECT_EQ(checks, 1) << "two checks at a time";
        }
    };
    timer.callback(timer.argument);
    second.join();
    EXPECT_EQ(checks, 2);
}

DEVICE_TEST(tr181, TableIsPublishedAfterFortySeconds)
{
    step([] { kiv_tr181_led_init(nullptr); });
    expect_effects(R"(
        sleep 40 s
        tr181_init
        tr181 141 1 0 "DEV.LEDS" instance 1: 10
        tr181 142 1 0 "DEV.LEDS.LED1" instance 1: "cpe-power" "InUse" "Front"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED2" instance 2: "cpe-wifi" "InUse" "Front"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED3" instance 3: "cpe-phone" "InUse" "Front"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED4" instance 4: "cpe-network" "InUse" "Front"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED5" instance 5: "cpe-battery" "InUse" "Front"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED6" instance 6: "cpe-signal" "InUse" "Front"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED7" instance 7: "cpe-WAN/LAN1" "Controlled" "Back"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED8" instance 8: "cpe-LAN2" "Controlled" "Back"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED9" instance 9: "cpe-LAN3" "Controlled" "Back"
        sleep 1 s
        tr181 142 1 0 "DEV.LEDS.LED10" instance 10: "cpe-LAN4" "Controlled" "Back"
        sleep 1 s)");
}

DEVICE_TEST(tr181, StoreThatRefuses)
{
    fake_platform().tr181_result = -4;
    step([] { kiv_tr181_led_init(nullptr); });
    expect_log("kiv_led_tr181", R"(
        error "[kiv_tr181_led_init] start !"
        error "kiv_tr181_leds_update\n"
        error "kiv_tr181_leds_update ret:-4"
        error "kiv_tr181_ledsled_update\n"
        error "kiv_tr181_ledsled_update:set LED0 ret:-4"
        error "kiv_tr181_ledsled_update:set LED1 ret:-4"
        error "kiv_tr181_ledsled_update:set LED2 ret:-4"
        error "kiv_tr181_ledsled_update:set LED3 ret:-4"
        error "kiv_tr181_ledsled_update:set LED4 ret:-4"
        error "kiv_tr181_ledsled_update:set LED5 ret:-4"
        error "kiv_tr181_ledsled_update:set LED6 ret:-4"
        error "kiv_tr181_ledsled_update:set LED7 ret:-4"
        error "kiv_tr181_ledsled_update:set LED8 ret:-4"
        error "kiv_tr181_ledsled_update:set LED9 ret:-4")");
}
