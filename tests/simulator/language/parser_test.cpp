#include "language/doubts.h"
#include "language/scenario.h"

#include <gtest/gtest.h>
#include <map>
#include <vector>

namespace
{
const std::map<std::string, std::string> other_files = {
    {"dir/power.scn",  "notify MAIN POWERON\n"  },
    {"dir/broken.scn", "\nexpect nonsense\n"    },
    {"dir/again.scn",  "include \"again.scn\"\n"},
    {"dir/open.scn",   "repeat 2\nafter 1s\n"   },
};

bool load(const std::string &path, std::string &text)
{
    const auto found = other_files.find(path);
    if (found == other_files.end()) {
        return false;
    }
    text = found->second;
    return true;
}

std::string hex(const std::string &bytes)
{
    std::string text;
    char digits[3];
    for (const char byte : bytes) {
        snprintf(digits, sizeof digits, "%02x", static_cast<unsigned char>(byte));
        text += digits;
    }
    return text;
}

// What a statement does, in a form that a table can hold.
std::string essence(const statement &s)
{
    std::string text;
    for (const file_write &file : s.files) {
        text += (text.empty() ? "" : " ") + file.path + (file.text ? "=" + *file.text : " gone");
    }
    switch (s.what) {
    case verb::WRITE:
        return text;
    case verb::SEND:
        return "send " + hex(s.bytes);
    case verb::INDICATE:
        return "indicate " + s.bytes;
    case verb::FAIL:
        return "fail " + s.key + " " + s.bytes;
    case verb::REPAIR:
        return "repair " + s.key;
    case verb::TIME_OF_DAY:
        return "time " + std::to_string(s.number);
    case verb::DATE:
        return "date " + std::to_string(s.number);
    case verb::JUMP:
        return "jump " + std::to_string(s.number);
    case verb::AFTER:
        return "after " + std::to_string(s.number);
    case verb::REPEAT:
        return "repeat " + std::to_string(s.number) + " of " + std::to_string(s.body.size());
    default:
        return "other";
    }
}

struct error_row {
    const char *text;
    const char *error;
};

const error_row error_rows[] = {
    {"start\n\n  jump\n",                         "a.scn:3: unknown statement 'jump'; statements are product, cfg,"     },
    {"product BRICK\n",                           "a.scn:1: unknown product 'BRICK'; products are UFI, DATA_CARD,"      },
    {"nv\n",                                      "a.scn:1: nv KEY=VALUE"                                               },
    {"nv ../x=1\n",                               "a.scn:1: '../x' cannot be a key"                                     },
    {"nv a=1 b\n",                                "a.scn:1: 'b' is not KEY=VALUE"                                       },
    {"nv a=\"1\n",                                "a.scn:1: a quote is not closed"                                      },
    {"nv a=\"\\q\"\n",                            "a.scn:1: unknown escape"                                             },
    {"cfg 42=1\n",                                "a.scn:1: unknown configuration item '42'; items are 531 and 6000"    },
    {"clock 24:00\n",                             "a.scn:1: clock HH:MM[:SS]"                                           },
    {"clock 2026-02-29 10:00\n",                  "a.scn:1: clock HH:MM[:SS]"                                           },
    {"clock jump 1d\n",                           "a.scn:1: clock jump +TIME or -TIME"                                  },
    {"start now\n",                               "a.scn:1: 'now' is too much"                                          },
    {"notify\n",                                  "a.scn:1: notify takes a module here"                                 },
    {"notify RADIO X\n",                          "a.scn:1: unknown module 'RADIO'; modules are MAIN, PPP,"             },
    {"notify 65536 1\n",                          "a.scn:1: unknown module '65536'"                                     },
    {"notify MAIN NEW_SMS\n",                     "a.scn:1: unknown event 'NEW_SMS'; events of this module are REG_MC_" },
    {"notify MAIN 0x100000000\n",                 "a.scn:1: unknown event '0x100000000'"                                },
    {"notify SLEEP 1 2\n",                        "a.scn:1: '2' is too much"                                            },
    {"register 3 1 2 3\n",                        "a.scn:1: register takes a mask from 0 to 4294967295 here"            },
    {"command BLINK\n",                           "a.scn:1: unknown command 'BLINK'; commands are CIRCLE_LED_CTRL,"     },
    {"raw 0g\n",                                  "a.scn:1: '0g' is not bytes of two hexadecimal digits"                },
    {"raw 123\n",                                 "a.scn:1: '123' is not bytes of two hexadecimal digits"               },
    {"raw length 4097 fill 0\n",                  "a.scn:1: raw takes a length from 1 to 4096 here, not '4097'"         },
    {"raw cmd=1 size=2\n",                        "a.scn:1: unknown field 'size'; fields are cmd, dest,"                },
    {"raw cmd=65536\n",                           "a.scn:1: cmd takes a number to 65535"                                },
    {"raw cmd=1 cut=0\n",                         "a.scn:1: a message has 1 to 4096 bytes"                              },
    {"indication -1\n",                           "a.scn:1: indication takes an indication from 0"                      },
    {"sensor 7 20\n",                             "a.scn:1: sensor takes a sensor from 0 to 6 here, not '7'"            },
    {"sys ../x 1\n",                              "a.scn:1: '../x' is no folder of /sys/class/leds"                     },
    {"fail a/b * -1\n",                           "a.scn:1: 'a/b' is no platform call"                                  },
    {"fail kiv_timer * x\n",                      "a.scn:1: fail takes a result from"                                   },
    {"after 10\n",                                "a.scn:1: after TIME"                                                 },
    {"after 1001d\n",                             "a.scn:1: after TIME"                                                 },
    {"after 0x1s\n",                              "a.scn:1: after TIME"                                                 },
    {"repeat 0\nend\n",                           "a.scn:1: repeat takes how many times from 1 to 1000000 here, not '0'"},
    {"start\nrepeat 2\nrepeat 3\nend\n",          "a.scn:2: repeat without end"                                         },
    {"end\n",                                     "a.scn:1: end without repeat"                                         },
    {"include \"power.scn\"\n",                   "a.scn:1: cannot read 'power.scn'"                                    },
    {"include \"dir/broken.scn\"\n",              "dir/broken.scn:2: unknown expectation 'nonsense'"                    },
    {"include \"dir/again.scn\"\n",               "dir/again.scn:1: includes are nested more than 8 deep"               },
    {"repeat 2\ninclude \"dir/open.scn\"\nend\n", "dir/open.scn:1: repeat without end"                                  },
    {"expect\n",                                  "a.scn:1: expect what?"                                               },
    {"expect net_green on 2\n",                   "a.scn:1: unknown expectation 'net_green'; expect only, dark,"        },
    {"expect net_red 2\n",                        "a.scn:1: net_red can be 'on BRIGHTNESS', 'off' or"                   },
    {"expect net_red on 5\n",                     "a.scn:1: expect takes a brightness from 0 to 4 here, not '5'"        },
    {"expect net_red blink 800 4\n",              "a.scn:1: '800' is not blink times such as 800/1200"                  },
    {"expect only net_red on 1 and dark\n",       "a.scn:1: unknown LED 'dark'; LEDs are bat_red,"                      },
    {"expect nothing\n",                          "a.scn:1: expect nothing changed"                                     },
    {"expect no LED\n",                           "a.scn:1: expect no log \"TEXT\""                                     },
    {"expect sent LED \"1\"\n",                   "a.scn:1: unknown module 'LED'"                                       },
    {"expect timer 1000 often\n",                 "a.scn:1: expect timer MS once, or expect timer MS repeat"            },
};

struct meaning_row {
    const char *line;
    const char *essence;
};

const meaning_row meaning_rows[] = {
    {"product UFI",                                                 "cfg/6000=NO_DRIVER_UFI"                                                 },
    {"cfg 531 missing",                                             "cfg/531 gone"                                                           },
    {"cfg 6000=\"two words\"",                                      "cfg/6000=two words"                                                     },
    {"nv a=1 b=\"x # y\" c=missing # comment",                      "nv/a=1 nv/b=x # y nv/c gone"                                            },
    {"nv a=\"missing\" b= c=x=y",                                   "nv/a=missing nv/b= nv/c=x=y"                                            },
    {"clock 22:00",                                                 "time 79200"                                                             },
    {"clock 2026-01-31 22:00:01",                                   "date 1769896801"                                                        },
    {"clock jump -1d",                                              "jump -86400000000000"                                                   },
    {"notify MAIN POWERON",                                         "send 022f00002600010004000000"
                            "40000000"                                                                            },
    {"notify 1 0x40",                                               "send 022f00002600010004000000"
                      "40000000"                                                                                        },
    {"notify MAIN REG_MC_BATTERY_VALUE",                            "send 022f00002600010004000000"
                                         "10000040"                                                  },
    {"notify SLEEP 1",                                              "send 022f000026001b0006000000"
                       "01000000"
                       "3100"                                                                                          },
    {"notify SLEEP STATUS_EVENT 0",                                 "send 022f000026001b0006000000"
                                    "01000000"
                                    "3000"                                                                },
    {"notify WLAN AP_WPS_STATE \"\\x01\\n\"",                       "send 022f000026000a0007000000"
                                              "80000000"
                                              "010a00"                                          },
    {"command RELIGHT",                                             "send 161b00002600010004000000"
                        "00000000"                                                                                    },
    {"command 6914",                                                "send 021b00002600010004000000"
                     "00000000"                                                                                          },
    {"register PPP 0x1 0x40000002 3 4",                             "send 012f00002600030010000000"
                                        "01000000020000400300000004000000"                            },
    {"raw 01ff 02",                                                 "send 01ff02"                                                            },
    {"raw length 3 fill 0x41",                                      "send 414141"                                                            },
    {"raw cmd=12034 dest=39 source=1 event=0x40 len=9 text=\"hi\"", "send 022f0000270001000900000040000000"
                                                                    "6869"},
    {"raw cmd=1 dest=2 cut=5",                                      "send 0100000002"                                                        },
    {"indication 1356 null",                                        "indicate 1356 null"                                                     },
    {"sensor 6 -5",                                                 "bsp/sensor_6=-5"                                                        },
    {"sensor 0 missing",                                            "bsp/sensor_0 gone"                                                      },
    {"battery 5 0",                                                 "bsp/battery=5 0"                                                        },
    {"charger missing",                                             "bsp/charger gone"                                                       },
    {"sys led:rolling_leds 2",                                      "leds/led:rolling_leds/brightness=2"                                     },
    {"fail kiv_timer * 0",                                          "fail kiv_timer '*' 0"                                                   },
    {"fail kiv_bsp_set_leds_sync \"net_red on\" -1 3",              "fail kiv_bsp_set_leds_sync 'net_red on' -1 3"                           },
    {"repair all",                                                  "repair "                                                                },
    {"after 90m",                                                   "after 5400000000000"                                                    },
    {"repeat 3\nafter 1s\nafter 2s\nend",                           "repeat 3 of 2"                                                          },
    {"include \"dir/power.scn\"",                                   "send 022f00002600010004000000"
                                  "40000000"                                                                },
};
} // namespace

TEST(Parser, SaysWhereAndWhatIsWrong)
{
    for (const error_row &row : error_rows) {
        scenario story;
        std::string error;
        EXPECT_FALSE(parse_scenario(row.text, "a.scn", load, story, error)) << row.text;
        EXPECT_EQ(error.substr(0, strlen(row.error)), row.error) << row.text;
    }
}

TEST(Parser, TurnsStatementsIntoWhatTheyDo)
{
    for (const meaning_row &row : meaning_rows) {
        scenario story;
        std::string error;
        ASSERT_TRUE(parse_scenario(row.line, "a.scn", load, story, error)) << error;
        ASSERT_EQ(story.statements.size(), 1U) << row.line;
        EXPECT_EQ(essence(story.statements[0]), row.essence) << row.line;
    }
}

TEST(Parser, BoundsWhatItReads)
{
    scenario story;
    std::string error;
    EXPECT_FALSE(parse_scenario(std::string(SCENARIO_FILE_MAX + 1, '\n'), "a.scn", load, story, error));
    EXPECT_EQ(error, "a.scn:1: the file is larger than 256 KiB");
    EXPECT_FALSE(parse_scenario("\n" + std::string(9000, 'x'), "a.scn", load, story, error));
    EXPECT_EQ(error, "a.scn:2: the line is longer than 8192 characters");
    std::string nested;
    for (int depth = 0; depth < 9; depth++) {
        nested += "repeat 2\n";
    }
    EXPECT_FALSE(parse_scenario(nested, "a.scn", load, story, error));
    EXPECT_EQ(error, "a.scn:9: repeats are nested more than 8 deep");
}

TEST(Parser, ReadsLinesWithoutNewlineOrWithCarriageReturn)
{
    scenario story;
    std::string error;
    ASSERT_TRUE(parse_scenario("# c\r\n\r\n  start # now\r\nexpect dark", "a.scn", load, story, error)) << error;
    ASSERT_EQ(story.statements.size(), 2U);
    EXPECT_EQ(story.statements[0].text, "start");
    EXPECT_EQ(story.statements[1].line, 4);
}

TEST(Parser, DoubtsWhatParsesAndIsProbablyNotMeant)
{
    const std::map<std::string, std::string> doubts = {
        {"nv battery_valeu=3",                           "the daemon never reads NV 'battery_valeu'; did you mean battery_value?"},
        {"notify VOICE X",                               "'X' means nothing to the daemon; it knows PHONE LED ON"                },
        {"notify SLEEP off",                             "'off' means nothing to the daemon; it knows 1 asleep"                  },
        {"notify MAIN POWERON 1",                        "the daemon does not look at the text of this event"                    },
        {"indication 1358",                              "no board sends indication 1358"                                        },
        {"fail kiv_bsp_set_leds_sync bat_gren -5",       "there is no LED 'bat_gren'; did you mean bat_green?"                   },
        {"repeat 2\nnv x=1\nend",                        "the daemon never reads NV 'x'"                                         },
        {"notify VOICE \"PHONE BLINK\"",                 ""                                                                      },
        {"notify SLEEP 5\nnotify DST FLOW_STATUS any",   ""                                                                      },
        {"notify unregistered VOICE X\nnotify WLAN 4 x", ""                                                                      },
        {"indication 1357\nraw 01",                      ""                                                                      },
        {"fail kiv_bsp_set_leds_sync \"net_ blink\" -5", ""                                                                      },
    };
    for (const auto &[line, doubt] : doubts) {
        scenario story;
        std::string error;
        const std::string text = "product UFI\nstart\n" + line + "\nexpect alive\n";
        ASSERT_TRUE(parse_scenario(text, "a.scn", load, story, error)) << error;
        const std::vector<std::string> found = find_doubts(story);
        ASSERT_EQ(found.size(), doubt.empty() ? 0U : 1U) << line;
        EXPECT_TRUE(doubt.empty() || found[0].find(": warning: " + doubt) != std::string::npos) << found[0];
    }
    scenario story;
    std::string error;
    ASSERT_TRUE(parse_scenario("\xef\xbb\xbfstart\nnotify MAIN POWERON\n", "a.scn", load, story, error)) << error;
    const std::vector<std::string> expected = {
        "a.scn: warning: a file begins with a byte-order mark; it is passed over",
        "a.scn:1: warning: no product is set; without one the daemon takes the device for a data card",
        "a.scn: warning: the scenario expects nothing"};
    EXPECT_EQ(find_doubts(story), expected);
}
