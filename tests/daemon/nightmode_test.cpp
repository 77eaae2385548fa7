#include "nightmode/kiv_led_night_mode.h"
#include "nightmode/kiv_led_tr181.h"

#include "harness.h"

#include <gtest/gtest.h>

static void night(const char *start, const char *end, const char *on, const char *synchronised = "1")
{
    nv("night_mode_start_time", start), nv("night_mode_end_time", end), nv("night_mode_switch", on);
    nv("nitz_sync_flag", synchronised);
    kiv_led_night_mode_init();
}

static void at(int hour, int minute)
{
    at_utc(hour, minute);
    fake_fire(1);
}

// One digit a time of day: whether the LEDs are dark then. The first check is made at noon.
static void window(const char *start, const char *end, std::initializer_list<std::pair<int, int>> times)
{
    at_utc(12, 0), night(start, end, "1"), forget();
    std::string dark;
    for (const auto &[hour, minute] : times) {
        at(hour, minute);
        dark += is_night_mode == 1 ? '1' : '0';
    }
    forget(), fake_note(dark);
}

// Calls and what they cause stand side by side.
// clang-format off
TEST(nightmode, WindowEdges)
{
    expect_effects("through midnight", "011110",
        [] { window("22:00", "06:00", { {21, 59}, {22, 0 }, {23, 59}, {0, 0 }, {5, 59}, {6, 0 } }); });
    expect_effects("within a day", "0110", [] { window("08:00", "20:00", { {7, 59}, {8, 0 }, {19, 59}, {20, 0 } }); });
    expect_effects("start equal to end", "111", [] { window("07:30", "07:30", { {7, 29}, {7, 30}, {0, 0 } }); });
    expect_effects("an hour alone takes the minutes over", "0110",
        [] { window("22:30", "6", { {22, 29}, {22, 30}, {6, 29}, {6, 30} }); });
    expect_effects("an end beyond the day", "0110",
        [] { window("20:00", "25:00", { {19, 59}, {20, 0 }, {23, 59}, {0, 0 } }); });
    expect_effects("texts that are cut, or no times", "101",
        [] { window("8:00:000000", "99999999999", { {8, 0 }, {7, 59}, {23, 59} }); });
    expect_effects("no times: the whole day", "11", [] { window("x", "", { {0, 0 }, {23, 59} }); });
}

TEST(nightmode, EntersAndLeaves)
{
    expect_calls("every call of a set-up by day, the edge and back", R"(
        nv night_mode_start_time 8 | 6:kiv_led_night_mode "Night mode: start_time:22:00\n" | nv night_mode_end_time 8
        6:kiv_led_night_mode "Night mode: end_time:06:00\n" | nv night_mode_switch 8
        6:kiv_led_night_mode "Cur night mode switch:1\n" | nv night_mode_close_all_led 8
        6:kiv_led_night_mode "Need close all led:0\n" | nv nitz_sync_flag 8 | nv syn_done 8 | nv systime_mode 8
        0:kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:1,0,1"
        0:kiv_led_night_mode "Now is Normal mode, LED ON!\n" | nv write is_night_mode "0" 1 | relight
        timer 20000 repeat "" = 1 | 6:kiv_led_night_mode "Creat night mode check timer SUCCESS\n"
        nv nitz_sync_flag 8 | nv syn_done 8 | nv systime_mode 8
        0:kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:,1,1"
        0:kiv_led_night_mode "Night mode, LED OFF!\n" | nv write is_night_mode "1" 1 | relight | nv nitz_sync_flag 8
        nv syn_done 8 | nv systime_mode 8
        0:kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:,1,1"
        nv nitz_sync_flag 8 | nv syn_done 8 | nv systime_mode 8 | 6:kiv_led_night_mode "Time not sync![0,2,auto]"
        0:kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:,0,1"
        0:kiv_led_night_mode "Now is Normal mode, LED ON!\n" | nv write is_night_mode "0" 1 | relight
        stdout minutes:1319/minutes:1320/minutes:1321/)",
        [] { nv("syn_done", "2"); nv("systime_mode", "auto"); at_utc(21, 59); night("22:00", "06:00", "1"); at(22, 0);
             at(22, 1); nv("nitz_sync_flag", ""); at(22, 2); });
    expect_effects("suspended for tonight", R"(
        timer 20000 repeat "" = 1 | nv write night_mode_switch "1" 1 | nv write is_night_mode "0" 1 | relight
        nv write is_night_mode "1" 1 | relight)",
        [] { at_utc(23, 0); night("22:00", "06:00", "2"); at(23, 1); at(6, 0); at(22, 0); });
    expect_errors("suspended lines", R"(
        0:kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:1,1,2"
        0:kiv_led_night_mode "Normal mode, LED ON!\n"
        0:kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:,0,2"
        0:kiv_led_night_mode "Next time will Enable Night mode\n"
        0:kiv_led_night_mode "Now is Normal mode, LED ON!\n"
        0:kiv_led_night_mode "[thread]First check night mode[arg, is in night, mode switch]:(null),0,1")",
        [] { at_utc(23, 0); night("22:00", "06:00", "2"); at(6, 0); kiv_led_night_mode_proc(nullptr); });
    expect_effects("set up again by night, then switched off", R"(
        nv write is_night_mode "1" 1 | relight | timer 20000 repeat "" = 1 | nv write is_night_mode "1" 1 | relight
        net off | led 15 on 1 | nv write is_night_mode "1" 1 | relight | delete 1 | nv write is_night_mode "0" 1
        relight | delete 0 | nv write is_night_mode "0" 1 | relight)",
        [] { at_utc(23, 0); night("22:00", "06:00", "1"); night("22:00", "06:00", "1"); led_net_type = 4;
             night_mode_close_all_led = 1; night("22:00", "06:00", "1"); night("22:00", "06:00", "3");
             night("22:00", "06:00", ""); });
    expect_effects("clock set by hand or done; no timer at first", R"(
        nv write is_night_mode "1" 1 | relight | timer 20000 repeat "" = 0 | nv write is_night_mode "1" 1 | relight
        timer 20000 repeat "" = 1)",
        [] { fake_platform().failing_timers = 1; at_utc(23, 0); nv("systime_mode", "manual");
             night("22:00", "06:00", "1", "0"); nv("systime_mode", ""); nv("syn_done", "1");
             night("22:00", "06:00", "1", "0"); });
}

static std::string led_record(const char *instance, const char *path, const char *name, const char *where)
{
    return std::string(" | tr181 142 1 0 0:\"") + instance + "\" 4:\"DEV.LEDS." + path + R"(" 38:"\x01" 64:"cpe-)" +
           name + R"(" 134:"\x01" 160:")" + where + "\" | sleep 1";
}

TEST(tr181, RecordsAtTheirOffsets)
{
    const char *front = R"(InUse" 198:"\x01" 224:"Front)";
    const char *back = R"(Controlled" 198:"\x01" 224:"Back)";
    expect_effects("after forty seconds, then one a second",
        R"(sleep 40 | tr181_init | tr181 141 1 0 0:"\x01" 4:"DEV.LEDS" 38:"\x01" 64:"\n")" +
        led_record("\\x01", "LED1", "power", front) + led_record("\\x02", "LED2", "wifi", front) +
        led_record("\\x03", "LED3", "phone", front) + led_record("\\x04", "LED4", "network", front) +
        led_record("\\x05", "LED5", "battery", front) + led_record("\\x06", "LED6", "signal", front) +
        led_record("\\x07", "LED7", "WAN/LAN1", back) + led_record("\\x08", "LED8", "LAN2", back) +
        led_record("\\x09", "LED9", "LAN3", back) + led_record("\\n", "LED10", "LAN4", back),
        [] { kiv_tr181_led_init(nullptr); });
    expect_logs("a store that refuses", R"(
        0:kiv_led_tr181 "[kiv_tr181_led_init] start !" | 0:kiv_led_tr181 "kiv_tr181_leds_update\n"
        0:kiv_led_tr181 "kiv_tr181_leds_update ret:-4" | 0:kiv_led_tr181 "kiv_tr181_ledsled_update\n"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED0 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED1 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED2 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED3 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED4 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED5 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED6 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED7 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED8 ret:-4"
        0:kiv_led_tr181 "kiv_tr181_ledsled_update:set LED9 ret:-4")",
        [] { fake_platform().tr181_result = -4; kiv_tr181_led_init(nullptr); });
}
// clang-format on
