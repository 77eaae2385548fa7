#include "evidence/why.h"
#include "language/names.h"

#include <gtest/gtest.h>

namespace
{
// A handheld's evening: on, a message that blinks for ten seconds, night, asleep, and a message that is dropped.
constexpr const char *EVENING = R"(0.000000 main kiv_syslog_append(0, "kiv_mirta_led", 56, 31, "kiv_mirta_led start!\n")
0.000000 main kiv_timer(20000, repeat) = 1
1.000000 receive kiv_recv_msg(6, 1036) = 16, cmd 12034 dest 38 source 1 len 4 event 0x40 ""
1.000000 receive kiv_nvconfig_read("battery_value", 64) = 0, "80"
1.000000 receive kiv_syslog_append(6, "kiv_mirta_led", 83, 31, "power green on,power_percent=80\n")
1.000000 receive kiv_bsp_set_leds_sync(bat_red off 0) = 0
1.000000 receive kiv_bsp_set_leds_sync(bat_green on 4) = 0
1.000000 receive kiv_nvconfig_read("network_type", 64) = 0, "LTE"
1.000000 receive kiv_bsp_set_leds_sync(net_blue on 2) = 0
15.000000 receive kiv_recv_msg(6, 1036) = 16, cmd 12034 dest 38 source 5 len 4 event 0x4 ""
15.000000 receive kiv_bsp_set_leds_sync(sms_blue blink 4 800/1200) = 0
15.000000 receive kiv_timer(10000, once) = 2
20.000000 timer kiv_timer_fire(1)
20.000000 timer kiv_syslog_append(0, "kiv_led_night_mode", 90, 31, "Night mode, LED OFF!\n")
20.000000 timer kiv_lib_led_relight_msg() = 0
20.000000 receive kiv_recv_msg(6, 1036) = 12, cmd 6934 dest 38 source 38 len 0
20.000000 receive kiv_syslog_append(6, "kiv_mirta_led_operation", 20, 31, "Night mode check: led_id=15 brightness=1")
20.000000 receive kiv_bsp_set_leds_sync(net_blue on 1) = 0
25.000000 timer kiv_timer_fire(2)
25.000000 timer kiv_bsp_set_leds_sync(sms_blue on 4) = 0
30.000000 receive kiv_recv_msg(6, 1036) = 18, cmd 12034 dest 38 source 27 len 6 event 0x1 "1"
30.000000 receive kiv_bsp_set_leds_sync(net_blue off 0) = 0
30.000000 receive kiv_bsp_set_leds_sync(bat_green off 0) = -5
30.000000 receive kiv_bsp_set_leds_sync(sms_blue off 0) = 0
40.000000 receive kiv_recv_msg(6, 1036) = 16, cmd 12034 dest 38 source 5 len 4 event 0x4 ""
40.000000 receive kiv_syslog_append(6, "kiv_mirta_led", 87, 31, "recv recv_SMSstatus : sleep mode \n")
)";

std::string ask(const std::string &led, double at_s)
{
    recording trace;
    std::string error;
    EXPECT_TRUE(parse_recording(EVENING, "evening", trace, error)) << error;
    const history told = history_of(trace);
    return why(told, find_led(led).value(), entry_after(trace, static_cast<int64_t>(at_s * 1'000'000)));
}
} // namespace

TEST(Why, NamesTheMessageAndWhatWasReadForThisLedOnly)
{
    EXPECT_EQ(ask("bat_green", 10), "bat_green shows on 4, since 1.000\n"
                                    "  set off by     notify MAIN POWERON\n"
                                    "  read           NV battery_value = \"80\"\n"
                                    "  decided        power green on,power_percent=80\n"
                                    "  asked for      on 4, which the board did\n");
}

TEST(Why, NamesTheTimerAndWhoStartedItWhen)
{
    EXPECT_EQ(ask("sms_blue", 26),
              "sms_blue shows on 4, since 25.000\n"
              "  set off by     timer 2 (10000 ms, once), started at 15.000 by notify SMS NEW_SMS\n"
              "  asked for      on 4, which the board did\n");
}

TEST(Why, TellsWhatTheNightMadeOfARequest)
{
    EXPECT_EQ(ask("net_blue", 29),
              "net_blue shows on 1, since 20.000\n"
              "  set off by     command RELIGHT, asked for at 20.000 by timer 1\n"
              "  asked for      on 1, which the board did\n"
              "  changed by     the night gate, which dimmed it to 1; night since 20.000, by timer 1 (every 20000 ms), "
              "started at 0.000 by start-up\n");
}

TEST(Why, TellsOfADarkLedWhatItHadShownAndWhatWasDropped)
{
    EXPECT_EQ(ask("sms_blue", 50), "sms_blue is dark, since 30.000\n"
                                   "  before         on 4\n"
                                   "  set off by     notify SLEEP 1\n"
                                   "  asked for      off, which the board did\n"
                                   "  dropped        notify SMS NEW_SMS, at 40.000: the device was asleep\n");
    EXPECT_EQ(ask("wifi_blue", 50), "wifi_blue is dark: nobody has asked for it since the trace begins, at 0.000\n");
}

TEST(Why, ExplainsARequestThatFailed)
{
    EXPECT_EQ(ask("bat_green", 50), "bat_green shows on 4, since 1.000\n"
                                    "  set off by     notify MAIN POWERON\n"
                                    "  read           NV battery_value = \"80\"\n"
                                    "  decided        power green on,power_percent=80\n"
                                    "  asked for      on 4, which the board did\n"
                                    "  then failed    at 30.000:\n"
                                    "  set off by     notify SLEEP 1\n"
                                    "  asked for      off\n"
                                    "  failed         with -5; the LED stays as it was\n");
}

TEST(Recording, SaysWhatIsWrongWithAFile)
{
    struct refused {
        const char *text;
        const char *error;
    };
    for (const auto &[text, error] : {
             refused{"",                                               "there is no trace in it"},
             refused{"MZ\x90",                                         "f:1: no line"           },
             refused{"1.000000 main f() = 0\ngarbage\n2.000000 main ", "f:2: no line"           },
             refused{"9.000000 main f() = 0\n1.000000 main f() = 0\n", "f:2: older than"        },
    }) {
        recording trace;
        std::string said;
        EXPECT_FALSE(parse_recording(text, "f", trace, said)) << text;
        EXPECT_NE(said.find(error), std::string::npos) << said;
    }
}

TEST(Recording, LeavesOutTheHalfLineOfAKilledProcess)
{
    const std::string lost("1.000000 main f() = 0\n1.000000 main g(\0\0\0\0", 42);
    recording trace;
    std::string error;
    ASSERT_TRUE(parse_recording(lost, "f", trace, error)) << error;
    EXPECT_EQ(trace.entries.size(), 1U);
    EXPECT_TRUE(trace.cut);
}
