// The program as a whole, with the daemon itself.
#include "device.h"

#include <cstdio>
#include <filesystem>
#include <fstream>
#include <gtest/gtest.h>
#include <sys/wait.h>

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
        for (int c = fgetc(out); c != EOF; c = fgetc(out))
            result.printed += static_cast<char>(c);
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
    {"expect bat_green on 3\n",                                                                          1, "a.scn:5: expected: bat_green on 3\n  shown:    bat_green on 4\n"},
    {"expect only bat_green on 4\n",                                                                     1, "shown:    bat_green on 4 and net_red on 2\n"                    },
    {"expect dark\n",                                                                                    1, "a.scn:5: expected: dark\n"                                      },
    {"after 1s\nexpect requests 1\n",                                                                    1, "shown:    0 LED requests\n"                                     },
    {"expect log \"recv REG_MC_EVENT_POWERON\" level 0\n",                                               1, "a.scn:5: expected: log"                                         },
    {"expect no log \"recv REG_MC_EVENT_POWERON\"\n",                                                    1, "a.scn:5: expected: no log"                                      },
    {"notify SMS NEW_SMS\nexpect timer 10000 repeat\n",                                                  1, "shown:    1 timers, 10000 once\n"                               },
    {"notify SMS NEW_SMS\nafter 1s\nnotify MAIN SHUTTING_DOWN\nexpect deleted timer\nexpect timers 0\n", 0,
     "2 expectations held, 1.000 s of device time\n"                                                                                                                         },
    {"notify MAIN SHUTTING_DOWN\nexpect sent MAIN \"4097\"\n",                                           1, "\"4096\", 8) = 0\n"                                             },
    {"expect nv is_night_mode=1\n",                                                                      1, "shown:    is_night_mode=\"0\"\n"                                },
    {"expect ran \"echo\"\n",                                                                            1, "shown:    no shell command\n"                                   },
    {"expect tr181 DEV.LEDS \"x\"\n",                                                                    1, "shown:    DEV.LEDS does not exist\n"                            },
    {"kill\nexpect alive\n",                                                                             1, "shown:    the daemon has ended\n"                               },
    {"start\n",                                                                                          2, "a.scn:5: start: the daemon runs already\n"                      },
    {"kill\nnotify MAIN POWERON\n",                                                                      2, "a.scn:6: notify MAIN POWERON: the daemon does not run\n"        },
    {"indication 1356\nkill\nindication 1356\n",                                                         2, "a.scn:7: indication 1356: the daemon does not run\n"            },
    {"repeat 3\nafter 1000d\nend\nclock jump +1000d\nrepeat 2\nclock jump +1000d\nend\n",                2,
     "a.scn:10: clock jump +1000d: the clock would leave the years 1970 to 2037\n"                                                                                           },
    {"fail kiv_recv_msg * 0 2\nexpect nothing\n",                                                        2, "a.scn:6: expect nothing changed\n"                              },
 // Killed in the middle of a scene, and started again on the same device.
    {"notify SMS NEW_SMS\nkill\nexpect timers 0\nstart\nexpect requests 2\nnotify MAIN POWERON\nafter 20s\n"
     "expect bat_green on 4\nexpect alive\n",                                                       0, "4 expectations held, 20.000 s of device time\n"                 },
 // A storm counts as one step.
    {"repeat 50\nnotify MAIN BATTERY_VALUE\nend\nexpect requests 250\n",                                 0, "1 expectation held"                                             },
    {"fail kiv_bsp_set_leds_sync sms_blue -7\nnotify SMS NEW_SMS\nexpect sms_blue off\nexpect log \"fail:-7\" level "
     "0\n",                                                                                         0, "2 expectations held"                                            },
 // The receive thread sleeps while the clock stands still, and its queue takes eleven messages at most.
    {"kill\nsys led:rolling_leds 0\nstart\nrepeat 20\nnotify MAIN POWERON\nend\n",                       2,
     "a.scn:9: notify MAIN POWERON: the queue is full"                                                                                                                       },
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
        for (const fs::directory_entry &entry : fs::directory_iterator(place))
            count += entry.is_directory();
        return count;
    };
    play(POWERED + "expect alive\n");
    EXPECT_EQ(devices(), 0);
    play(POWERED + "expect alive\n", "--keep");
    EXPECT_EQ(devices(), 1);
    play(POWERED + "expect dark\n");
    EXPECT_EQ(devices(), 2);
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
