#include "evidence/from_log.h"
#include "evidence/why.h"
#include "language/names.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <filesystem>
#include <functional>

namespace
{
using framing = std::function<std::string(const std::string &source, const std::string &text)>;

framing behind(const std::string &head)
{
    return [head](const std::string &, const std::string &text) { return head + text; };
}

struct framing_case {
    const char *name;
    framing frame;
};

const framing_case framings[] = {
    {"bare", behind("")},
    {"RFC 3164", behind("<30>Nov 22 20:15:04 cpe kiv_mirta_led[312]: ")},
    {"RFC 3164, no PID", behind("Nov  2 20:15:04 kiv_mirta_led: ")},
    {"RFC 5424", behind("<30>1 2026-11-22T20:15:04.01Z cpe kiv_mirta_led 312 - [a@1 b=\"c\"] ")},
    {"journal, short-iso", behind("2026-11-22T20:15:04+0100 cpe kiv_mirta_led[312]: ")},
    {"journal, short-monotonic", behind("[  123.456789] cpe kiv_mirta_led[312]: ")},
    {"logread", behind("Sun Nov 22 20:15:04 2026 daemon.info kiv_mirta_led[312]: ")},
    {"logread with a stamp", behind("Sun Nov 22 20:15:04 2026 [99.123] daemon.info kiv_mirta_led[312]: ")},
    {"standard error", behind("2026-11-22 20:15:04.123 INFO kiv_led_night_mode:90 ")},
    {"standard error, journal",
     behind("Nov 22 20:15:04 cpe kiv_mirta_led[9]: 2026-11-22 20:15:04.1 INFO kiv_mirta_led:9 ")},
    {"the source as the name",
     [](const std::string &source, const std::string &text) {
         return "Sun Nov 22 20:15:04 2026 daemon.info " + source + "[312]: " + text;
     }},
};

// What the daemon logged in a recording, with lines of another process in between that speak of the same things.
std::string log_of(const recording &trace, const framing &frame)
{
    std::string log;
    for (const trace_entry &entry : trace.entries) {
        if (entry.call == "kiv_syslog_append") {
            log += frame(quoted_texts(entry.arguments).at(0), log_text(entry)) + "\n";
            log += "Nov 22 20:15:04 cpe ledtest[7]: kiv_mirta_led: enter kiv_led_set_net_led_off\n";
        }
    }
    return log;
}

// Those that a log can tell: brightness and blink times are not in it.
std::string changes(const history &told, int led)
{
    std::string text;
    for (const led_change &change : changes_of(told, led)) {
        if (!change.failed && change.before.mode == change.after.mode) {
            continue;
        }
        const cause what = told.activities[change.in].what;
        const bool same_in_both = what == cause::MESSAGE || what == cause::INDICATION;
        text += std::string(change.failed ? "failed" : "") + std::to_string(static_cast<int>(change.after.mode)) +
                (same_in_both ? " by " + describe(told, change.in) : " by itself") + "\n";
    }
    return text;
}

log_history read(const std::string &log)
{
    log_history out;
    std::string error;
    EXPECT_TRUE(parse_log(log, "log", out, error)) << error;
    return out;
}
} // namespace

TEST(Log, TellsOfEveryLedWhatTheTraceOfTheSameRunTells)
{
    for (const auto &file : std::filesystem::directory_iterator(RECORDINGS)) {
        recording trace;
        std::string error;
        ASSERT_TRUE(load_recording(file.path(), trace, error)) << error;
        const history traced = history_of(trace);
        for (const auto &[name, frame] : framings) {
            const log_history logged = read(log_of(trace, frame));
            for (const led_row &led : led_rows) {
                EXPECT_EQ(changes(logged.told, led.led_id), changes(traced, led.led_id))
                    << file.path() << ", " << name << ", " << led.name;
            }
        }
    }
}

TEST(Log, NamesTheLineTheTimerAndWhatItCannotTell)
{
    const log_history log = read("Nov 22 20:15:00 cpe dnsmasq[1]: enter kiv_led_set_sms_led_off\n"
                                 "Nov 22 20:15:01 cpe kiv_mirta_led[312]: [info] enter messageParse fun\n"
                                 "Nov 22 20:15:01 cpe kiv_mirta_led[312]: regDecodeMsg source_id 5, mask1 4\n"
                                 "Nov 22 20:15:01 cpe kiv_mirta_led[312]: enter kiv_led_set_new_sms_timer\n"
                                 "Nov 22 20:15:11 cpe kiv_mirta_led[312]: enter kiv_led_new_sms_timeout_proc\n"
                                 "Nov 22 20:15:11 cpe kiv_mirta_led[312]: enter kiv_led_set_sms_led_operation "
                                 "led_id=50,led_operation=0\n");
    EXPECT_EQ(
        why(log.told, LED_SMS_BLUE, log.calls->entries.size()),
        "sms_blue shows on, since Nov 22 20:15:11 (line 6)\n"
        "  set off by     the new message's timer (10000 ms, once), started at Nov 22 20:15:01 (line 4) by notify "
        "SMS NEW_SMS\n"
        "  decided        enter kiv_led_new_sms_timeout_proc\n"
        "  not in the log brightness and blink times, and each value read that no line repeats\n"
        "                 threads: a line in between may be of something else\n");
    EXPECT_EQ(why(log.told, LED_SMS_BLUE, entry_after(*log.calls, 5'000'000)),
              "sms_blue is dark: nobody has asked for it since the log begins, at Nov 22 20:15:01 (line 2)\n"
              "  not in the log what the LED showed before its first line, and what it may have lost\n");
}

TEST(Log, SaysWhenItWasKeptWithoutTheLinesThatTellRequests)
{
    const log_history log = read("kiv_mirta_led: Night mode, LED OFF!\n");
    EXPECT_NE(why(log.told, LED_NET_BLUE, log.calls->entries.size()).find("not in the log requests"),
              std::string::npos);
}

TEST(Log, SaysWhereTheLoggerDroppedLines)
{
    const log_history log = read("kiv_mirta_led: enter kiv_led_set_sms_led_off\n"
                                 "Nov 22 20:15:01 cpe systemd-journald[9]: Suppressed 12 messages from led.service\n");
    EXPECT_NE(why(log.told, LED_SMS_BLUE, log.calls->entries.size())
                  .find("what the logger has dropped, for the last time at Nov 22 20:15:01 (line 2)"),
              std::string::npos);
}

TEST(Log, RefusesWhatHoldsNoLineOfTheDaemon)
{
    for (const std::string &text : {std::string(), std::string("\n\n\n"), std::string(9000, '\0'),
                                    std::string("\0enter kiv_led_set_net_led_off\n\0\0", 34),
                                    std::string("\x7f"
                                                "ELF\x02\x01 kiv"),
                                    std::string("Nov 22 20:15:01 cpe init[1]: starting kiv_mirta_led: ok\n")}) {
        log_history out;
        std::string error;
        EXPECT_FALSE(parse_log(text, "f", out, error)) << text;
        EXPECT_EQ(error, "f: no line of kiv_mirta_led in it");
    }
}

TEST(Log, ReadsLinesThatWereCutAnywhere)
{
    recording trace;
    std::string error;
    ASSERT_TRUE(load_recording(RECORDINGS "/handheld.trace", trace, error)) << error;
    const std::string whole = log_of(trace, framings[1].frame).substr(0, 3000);
    for (size_t size = 100; size < whole.size(); size += 7) {
        const log_history log = read(whole.substr(0, size));
        EXPECT_NE(why(log.told, LED_BAT_GREEN, log.calls->entries.size()), "") << size;
        read(whole.substr(0, size / 2) + "\n" + whole.substr(size));
    }
}
