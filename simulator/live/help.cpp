#include "live/help.h"

#include <array>
#include <cstdio>

namespace
{
constexpr std::array rows = {
    help_row{"product UFI",                                  "the product; before the start"                         },
    help_row{"cfg 531=1",                                    "device configuration; cfg 531 missing"                 },
    help_row{"nv battery_value=80 network_type=LTE",         "NV keys; KEY=missing takes one away"                   },
    help_row{"sensor 3 71",                                  "a temperature sensor; sensor 0 missing"                },
    help_row{"charger 0 1",                                  "the board's answer \"RET DATA\"; charger missing"      },
    help_row{"battery 0 1",                                  "the same of the battery"                               },
    help_row{"sys led:rolling_leds 0",                       "the board's animation file, or missing"                },
    help_row{"start",                                        "starts the daemon, or lets one go on that waits"       },
    help_row{"launch",                                       "starts it without the start record"                    },
    help_row{"register 3 0x1 0 0 0",                         "module 3 asks the daemon for notifications"            },
    help_row{"go",                                           "the system daemon's start record"                      },
    help_row{"kill",                                         "ends it at once; start again goes on with this device" },
    help_row{"notify SMS NEW_SMS",                           "a notification: module, event, payload"                },
    help_row{"notify SLEEP 1",                               "a module with one event needs no event name"           },
    help_row{"command RELIGHT",                              "a message with that command"                           },
    help_row{"raw 41 00",                                    "bytes to the daemon's queue; raw length 1036 fill 0xff"},
    help_row{"indication 1356",                              "of the board; indication 1350 null"                    },
    help_row{"fail kiv_bsp_set_leds_sync bat_green -1",      "a platform call fails: arguments or *, result, times"  },
    help_row{"repair all",                                   "no call is made to fail any more"                      },
    help_row{"repeat 3",                                     "what follows, up to end, so many times; one step"      },
    help_row{"end",                                          ""                                                      },
    help_row{"after 10s",                                    "waits; 500ms, 10s, 2m, 3h"                             },
    help_row{"include \"handheld-on.inc\"",                  "the statements of a file"                              },
    help_row{"expect bat_green on 4",                        "also off, blink 800/1200 4"                            },
    help_row{"expect only bat_green on 4 and net_blue on 2", "all others are dark"                                   },
    help_row{"expect dark",                                  "every LED is"                                          },
    help_row{"expect nothing changed",                       "since the last statement; also requests 4"             },
    help_row{"expect log \"text\" level 0",                  "a piece of a log line; expect no log \"text\""         },
    help_row{"expect sent MAIN \"4096\"",                    "a message to a module"                                 },
    help_row{"expect nv is_night_mode=1",                    "the store; expect nv written is_night_mode=1"          },
    help_row{"expect timer 10000 once",                      "one that runs; repeat; timers 2; deleted timer"        },
    help_row{"expect ran \"echo 1 > \"",                     "a shell command"                                       },
    help_row{"expect stdout \"minutes:1320\"",               "what the daemon printed"                               },
    help_row{"expect tr181 DEV.LEDS.LED3 \"cpe-phone\"",     "a record of the TR-181 store"                          },
    help_row{"expect alive",                                 "or ended"                                              },
};
} // namespace

std::span<const help_row> help_rows()
{
    return rows;
}

std::string help_text(std::string_view beginning)
{
    std::string text;
    for (const help_row &row : rows) {
        if (row.example.starts_with(beginning)) {
            std::array<char, 160> line;
            snprintf(line.data(), line.size(), "  %-45s %s\n", std::string(row.example).c_str(),
                     std::string(row.meaning).c_str());
            text += line.data();
        }
    }
    return text.empty() ? "  no statement begins so; help lists them\n" : text;
}
