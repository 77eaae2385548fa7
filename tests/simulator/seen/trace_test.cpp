#include "seen/observed.h"

#include <gtest/gtest.h>
#include <unistd.h>

TEST(Trace, FindsTheEndOfArgumentsThatHoldParentheses)
{
    const auto entry = parse_trace_line(R"(12.000500 timer kiv_nvconfig_write("a) = 1", "b\"(", 3) = -1, "x")");
    ASSERT_TRUE(entry);
    EXPECT_EQ(entry->time_us, 12'000'500);
    EXPECT_EQ(entry->call, "kiv_nvconfig_write");
    EXPECT_EQ(entry->result, "-1, \"x\"");
    EXPECT_EQ(quoted_texts(entry->arguments), (std::vector<std::string>{"a) = 1", "b\"("}));
}

TEST(Trace, RefusesLinesThatAreNone)
{
    for (const char *line : {"", "1.000000", "1.000000 main", "1.000000 main f", "1.000000 main f(", "x main f()",
                             "1.00 main f()", "1.000000 main f(\"a)"}) {
        EXPECT_FALSE(parse_trace_line(line)) << line;
    }
}

TEST(Trace, WaitsForTheRestOfALine)
{
    char path[] = "/tmp/kiv_trace_XXXXXX";
    const int out = mkstemp(path);
    trace_file trace;
    ASSERT_TRUE(open_trace(trace, path));
    ASSERT_EQ(write(out, "1.000000 main f() = 0\n1.00000", 29), 29);
    EXPECT_EQ(read_trace(trace).size(), 1U);
    ASSERT_EQ(write(out, "1 main g() = 0\n", 15), 15);
    const std::vector<trace_entry> rest = read_trace(trace);
    ASSERT_EQ(rest.size(), 1U);
    EXPECT_EQ(rest[0].time_us, 1'000'001);
    close_trace(trace);
    close(out);
    unlink(path);
}

TEST(Observed, KeepsLedsAndTimersAsTheDaemonLeavesThem)
{
    observed state;
    for (const char *line : {
             "0.000000 main kiv_bsp_set_leds_sync(sms_blue blink 4 800/1200) = 0",
             "0.000000 main kiv_bsp_set_leds_sync(sms_blue off 0) = -5", // fails: still blinking
             "0.000000 main kiv_bsp_set_leds_sync(bat_red on 4) = 0",
             "0.000000 main kiv_bsp_set_leds_sync(bat_red off 0) = 0",
             "0.000000 main kiv_bsp_set_leds_sync(33 on 4) = 0",
             "0.000000 main kiv_timer(5000, repeat) = 1",
             "0.000000 main kiv_timer(10000, once) = 2",
             "0.000000 main kiv_timer(20000, repeat) = 3",
             "0.000000 main kiv_timer(1000, once) = 0", // none was to be had
             "0.000000 main kiv_delete_timer(0) = 0",
             "0.000000 main kiv_delete_timer(3) = 0",
             "5.000000 timer kiv_timer_fire(1)",
             "10.000000 timer kiv_timer_fire(2)",
         }) {
        observe(state, parse_trace_line(line).value());
    }
    EXPECT_EQ(describe(state.leds[50]), "blink 800/1200 4");
    EXPECT_EQ(describe(state.leds[0]), "off");
    EXPECT_EQ(state.requests_in_step, 5);
    ASSERT_EQ(state.timers.size(), 1U);
    EXPECT_EQ(state.timers[1].period_ms, 5000);
    EXPECT_TRUE(state.timer_deleted_in_step);
}
