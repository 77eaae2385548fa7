// The program as a whole, with the daemon itself.
#include "language/vocabulary.h"
#include "seen/trace.h"
#include "world/device.h"

#include <algorithm>
#include <cstdio>
#include <fcntl.h>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <sstream>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

namespace fs = std::filesystem;

namespace
{
struct outcome {
    int code = -1;
    std::string printed; // both streams
};

class Play : public testing::Test
{
protected:
    void SetUp() override
    {
        std::string error;
        place = make_device(error);
        setenv("TMPDIR", place.c_str(), 1); // what a failed run keeps goes with us
    }
    void TearDown() override
    {
        unsetenv("TMPDIR");
        remove_device(place);
    }

    outcome play(const std::string &text, const std::string &options = "")
    {
        std::ofstream(place + "/a.scn") << text;
        const std::string command = "cd " + place + " && " + SIMULATOR + " run " + options + " a.scn 2>&1";
        outcome result;
        FILE *out = popen(command.c_str(), "r");
        for (int c = fgetc(out); c != EOF; c = fgetc(out)) {
            result.printed += static_cast<char>(c);
        }
        result.code = WEXITSTATUS(pclose(out));
        return result;
    }

    std::string place;
};

const std::string POWERED = "product UFI\nnv battery_exist=1 battery_value=80\nstart\nnotify MAIN POWERON\n";

struct outcome_row {
    const char *text;
    int code;
    const char *printed;
};

// Each is played behind POWERED, whose lines are 1 to 4.
const outcome_row outcome_rows[] = {
    {"expect bat_green on 3\n",                                                                                      1, "a.scn:5: expected: bat_green on 3\n  shown:    bat_green on 4\n"},
    {"expect only bat_green on 4\n",                                                                                 1, "shown:    bat_green on 4 and net_red on 2\n"                    },
    {"notify VOICE \"PHONE BLINK\"\n",                                                                               1, "a.scn:5: expected: the daemon has registered for this event\n"  },
    {"notify unregistered VOICE \"PHONE BLINK\"\nexpect no request\n",                                               0, "1 expectation held"                                             },
    {"notify MAIN POWERON\nexpect nothing changed\nexpect no request\n",                                             1, "a.scn:7: expected: no request\n"                                },
    {"nv battery_value=10\nrepeat 2\nnotify MAIN BATTERY_VALUE\nend\nexpect bat_red off\n",                          1,
     "  the front: bat_red blink 800/1200 4 and net_red on 2\n  bat_red, its last requests:\n"                                                                                           },
    {"notify SMS NEW_SMS\nafter 10s\nexpect sms_blue off\n",                                                         1, "    10.000  on 4  set off by a timer of 10000 ms"               },
    {"repeat 3\nafter 1s\nexpect bat_green off\nend\n",                                                              1,
     "  in round 1 of 3 of the repeat at a.scn:5\n  at 1.000 s of device time"                                                                                                           },
    {"expect dark\n",                                                                                                1, "a.scn:5: expected: dark\n"                                      },
    {"after 1s\nexpect requests 1\n",                                                                                1, "shown:    0 LED requests\n"                                     },
    {"expect log \"recv REG_MC_EVENT_POWERON\" level 0\n",                                                           1, "a.scn:5: expected: log"                                         },
    {"expect no log \"recv REG_MC_EVENT_POWERON\"\n",                                                                1, "a.scn:5: expected: no log"                                      },
    {"notify SMS NEW_SMS\nexpect timer 10000 repeat\n",                                                              1, "shown:    1 timers, 10000 once\n"                               },
    {"notify SMS NEW_SMS\nafter 1s\nnotify MAIN SHUTTING_DOWN\nexpect deleted timer\nexpect timers 0\n",             0,
     "2 expectations held, 1.000 s of device time\n"                                                                                                                                     },
    {"notify MAIN SHUTTING_DOWN\nexpect sent MAIN \"4097\"\n",                                                       1, "\"4096\", 8) = 0\n"                                             },
    {"expect nv is_night_mode=1\n",                                                                                  1, "shown:    is_night_mode=\"0\"\n"                                },
    {"expect ran \"echo\"\n",                                                                                        1, "shown:    no shell command\n"                                   },
    {"expect tr181 DEV.LEDS \"x\"\n",                                                                                1, "shown:    DEV.LEDS does not exist\n"                            },
    {"kill\nexpect alive\n",                                                                                         1, "shown:    the daemon has ended\n"                               },
    {"start\n",                                                                                                      2, "a.scn:5: start: the daemon runs already\n"                      },
    {"kill\nnotify MAIN POWERON\n",                                                                                  2, "a.scn:6: notify MAIN POWERON: the daemon does not run\n"        },
    {"indication 1356\nkill\nindication 1356\n",                                                                     2, "a.scn:7: indication 1356: the daemon does not run\n"            },
    {"repeat 3\nafter 1000d\nend\nclock jump +1000d\nrepeat 2\nclock jump +1000d\nend\n",                            2,
     "a.scn:10: clock jump +1000d: the clock would leave the years 1970 to 2037\n"                                                                                                       },
    {"fail kiv_recv_msg * 0 2\nexpect nothing\n",                                                                    2, "a.scn:6: expect nothing changed\n"                              },
 // Killed in the middle of a scene, and started again on the same device.
    {"notify SMS NEW_SMS\nkill\nexpect timers 0\nstart\nexpect requests 2\nnotify MAIN POWERON\nafter 20s\n"
     "expect bat_green on 4\nexpect alive\n",                                                                   0, "4 expectations held, 20.000 s of device time\n"                 },
 // A storm counts as one step.
    {"repeat 50\nnotify MAIN BATTERY_VALUE\nend\nexpect requests 250\n",                                             0, "1 expectation held"                                             },
    {"fail kiv_bsp_set_leds_sync sms_blue -7\nnotify SMS NEW_SMS\nexpect sms_blue off\nexpect log \"fail:-7\" level "
     "0\n",                                                                                                     0, "2 expectations held"                                            },
 // The receive thread sleeps for five seconds; what its queue has no room for waits, and none is lost.
    {"kill\nsys led:rolling_leds 0\nstart\nrepeat 200\nnotify MAIN POWERON\nend\nafter 10s\nexpect requests 2600\n", 0,
     "1 expectation held"                                                                                                                                                                },
};
} // namespace

TEST_F(Play, EndsAsItsExpectationsDo)
{
    for (const outcome_row &row : outcome_rows) {
        const outcome result = play(POWERED + row.text);
        EXPECT_EQ(result.code, row.code) << row.text << result.printed;
        EXPECT_NE(result.printed.find(row.printed), std::string::npos) << row.text << result.printed;
    }
}

TEST_F(Play, PrintsTheTimeline)
{
    const outcome result = play(POWERED + "expect bat_green on 4\nnotify SMS NEW_SMS\nafter 10s\nafter 1s\n");
    EXPECT_EQ(result.printed.substr(0, result.printed.find("played in")),
              "    0.000  start\n"
              "             sig_blue       on 0\n"
              "    0.000  notify MAIN POWERON\n"
              "             bat_green      on 4\n"
              "             net_red        on 2\n"
              "    0.000  notify SMS NEW_SMS\n"
              "             sms_blue       blink 800/1200 4\n"
              "   10.000    sms_blue       on 4\n"
              "1 expectation held, 11.000 s of device time\n");
}

TEST_F(Play, KeepsTheDeviceOfAFailedRunOnly)
{
    const auto devices = [&] {
        int count = 0;
        for (const fs::directory_entry &entry : fs::directory_iterator(place)) {
            count += entry.is_directory();
        }
        return count;
    };
    play(POWERED + "expect alive\n");
    EXPECT_EQ(devices(), 0);
    play(POWERED + "expect alive\n", "--keep");
    EXPECT_EQ(devices(), 1);
    play(POWERED + "expect dark\n");
    EXPECT_EQ(devices(), 2);
}

TEST_F(Play, WritesOverNothingButATrace)
{
    const std::string story = POWERED + "expect alive\n";
    std::string text;
    EXPECT_EQ(play(story, "--trace a.scn").code, 2);
    read_file(place + "/a.scn", text);
    EXPECT_EQ(text, story);
    EXPECT_EQ(play(story, "--trace .").code, 2);
    ASSERT_EQ(mkfifo((place + "/pipe").c_str(), 0600), 0);
    EXPECT_EQ(play(story, "--trace pipe").code, 2);
    const int reader = open((place + "/pipe").c_str(), O_RDWR | O_NONBLOCK);
    EXPECT_EQ(play(story, "--junit pipe").code, 0);
    text.assign(4096, '\0');
    EXPECT_GT(read(reader, text.data(), text.size()), 0);
    EXPECT_NE(text.find("tests=\"1\" failures=\"0\""), std::string::npos) << text;
    close(reader);
    EXPECT_EQ(play(story, "--trace t").code, 0);
    EXPECT_EQ(play(story, "--trace t").code, 0);
}

TEST_F(Play, TakesNoEndForAnExpectedOneWhenTheTraceIsLost)
{
    std::ofstream(place + "/daemon") << "#!/bin/sh\nexit 74\n";
    fs::permissions(place + "/daemon", fs::perms::owner_all);
    for (const std::string options : {"", "--real-time "}) {
        const outcome result = play("product UFI\nlaunch\nexpect ended\n", options + "--daemon ./daemon");
        EXPECT_EQ(result.code, 2) << options << result.printed;
        EXPECT_NE(result.printed.find("its trace could not be written\n"), std::string::npos) << result.printed;
    }
}

TEST_F(Play, NamesWhatAStandstillWaitsIn)
{
    ASSERT_EQ(mkfifo((place + "/pipe").c_str(), 0600), 0);
    std::ofstream(place + "/daemon") << "#!/bin/sh\nexec cat pipe\n";
    fs::permissions(place + "/daemon", fs::perms::owner_all);
    const outcome result = play("product UFI\nlaunch\n", "--daemon ./daemon");
    EXPECT_EQ(result.code, 2);
    EXPECT_NE(result.printed.find("has not come to rest: thread 1 (cat) waits in openat"), std::string::npos)
        << result.printed;
}

TEST_F(Play, TellsACiSystemWhatFailed)
{
    std::ofstream(place + "/good.scn") << POWERED + "expect bat_green on 4\n";
    const outcome result = play(POWERED + "expect dark\nexpect bat_green off\nexpect alive\n",
                                "--quiet --keep-going -j 2 --junit out.xml --artifacts out good.scn");
    EXPECT_EQ(result.code, 1);
    EXPECT_NE(result.printed.find("2 scenarios, 1 failed, 2 expectations held\n"), std::string::npos) << result.printed;
    EXPECT_NE(result.printed.find("a.scn:6: expected: bat_green off"), std::string::npos) << result.printed;
    std::string report;
    read_file(place + "/out.xml", report);
    EXPECT_NE(report.find("tests=\"2\" failures=\"1\" errors=\"0\""), std::string::npos) << report;
    EXPECT_TRUE(fs::exists(place + "/out/a.scn/device/trace"));
    EXPECT_TRUE(fs::exists(place + "/out/a.scn/timeline"));
    EXPECT_FALSE(fs::exists(place + "/out/good.scn"));
}

TEST_F(Play, WarnsOfWhatNobodyMet)
{
    const outcome result = play(POWERED + "nv battery_valeu=1\nfail kiv_bsp_set_leds_sync net_16 -5\n");
    EXPECT_EQ(result.code, 0);
    for (const char *warning : {"a.scn:5: warning: nobody has read NV 'battery_valeu'",
                                "a.scn:6: warning: no call of kiv_bsp_set_leds_sync has met this fail",
                                "a.scn: warning: the scenario expects nothing", "0 expectations held"}) {
        EXPECT_NE(result.printed.find(warning), std::string::npos) << result.printed;
    }
    EXPECT_NE(play("fail kiv_bsp_set_led_sync * -5\n").printed.find("did you mean kiv_bsp_set_leds_sync?"),
              std::string::npos);
}

TEST_F(Play, TakesAWrapperInPlaceOfTheDaemon)
{
    const fs::path daemon = fs::path(SIMULATOR).parent_path() / "kiv_mirta_led";
    const std::string wrapper = place + "/wrapper";
    std::ofstream(wrapper) << "#!/bin/sh\n" << daemon.string() << "\nexit $?\n";
    fs::permissions(wrapper, fs::perms::owner_all);
    for (const std::string &option : {"--daemon " + wrapper, std::string("--emulator 'nice -n 1'")}) {
        const outcome result = play(POWERED + "kill\nstart\nnotify MAIN POWERON\nexpect bat_green on 4\n", option);
        EXPECT_EQ(result.code, 0) << option << result.printed;
    }
}

TEST_F(Play, LeavesTheSameTraceEveryTime)
{
    const std::string story = POWERED + "nv night_mode_switch=1 night_mode_start_time=22:00 syn_done=1\n"
                                        "command NIGHT_MODE\nnotify SMS NEW_SMS\nafter 24h\n";
    std::string first;
    std::string again;
    for (int round = 0; round < 5; round++) {
        EXPECT_EQ(play(story, "--trace t").code, 0);
        read_file(place + "/t", round == 0 ? first : again);
        EXPECT_TRUE(round == 0 || first == again) << "round " << round;
    }
    EXPECT_GT(first.size(), 1'000'000U);
}

TEST_F(Play, ReportsADaemonThatEndsByItself)
{
    const outcome result = play("start\nafter 1s\n", "--daemon /bin/false");
    EXPECT_EQ(result.code, 1) << result.printed;
    EXPECT_NE(result.printed.find("a.scn:2: expected: the daemon runs\n  shown:    it ended with status 1\n"),
              std::string::npos)
        << result.printed;
    const outcome ended = play("launch\nexpect alive\n", std::string("--daemon ") + SIMULATOR);
    EXPECT_EQ(ended.code, 1) << ended.printed;
    EXPECT_NE(ended.printed.find("shown:    the daemon ended with status 2"), std::string::npos) << ended.printed;
    EXPECT_EQ(play("launch\nexpect ended\n", std::string("--daemon ") + SIMULATOR).code, 0);
}

TEST_F(Play, GoesOnTheWallClock)
{
    const outcome result =
        play(POWERED + "notify SMS NEW_SMS\nafter 200ms\nexpect sms_blue blink 800/1200 4\n", "--real-time");
    EXPECT_EQ(result.code, 0) << result.printed;
    EXPECT_EQ(play(POWERED + "clock 22:00\n", "--real-time").code, 2);
}

// The vocabulary is written by hand; that it is the daemon's own is seen here.
TEST_F(Play, KnowsTheDaemonsWords)
{
    std::string text = POWERED;
    const std::string classes = "2G3G4G5G";
    for (const network_word &word : network_words()) {
        const size_t shown_as = classes.find(word.shown_as) / 2 + 2;
        text += "nv network_type=" + std::string(word.name) + "\nnotify NWINFO NETTYPE\n" +
                "expect log \"enter kiv_led_handle_nwinfoStatus : " + std::to_string(shown_as) + "\"\n";
    }
    EXPECT_EQ(play(text).code, 0);

    std::ostringstream program;
    program << std::ifstream(DAEMON, std::ios::binary).rdbuf();
    for (const nv_word &word : nv_words()) {
        EXPECT_NE(program.str().find(word.key), std::string::npos) << word.key;
    }
    for (const auto &trace : fs::directory_iterator(RECORDINGS)) {
        std::ifstream lines(trace.path());
        for (std::string line; std::getline(lines, line);) {
            const std::optional<trace_entry> entry = parse_trace_line(line);
            if (entry && entry->call == "kiv_syslog_append") {
                const std::string source = quoted_texts(entry->arguments).at(0);
                EXPECT_NE(std::ranges::find(log_sources(), source), log_sources().end()) << source;
            } else if (entry && entry->call == "kiv_nvconfig_read") {
                const std::string key = quoted_texts(entry->arguments).at(0);
                EXPECT_NE(std::ranges::find(nv_words(), key, &nv_word::key), nv_words().end()) << key;
            }
        }
    }
}
