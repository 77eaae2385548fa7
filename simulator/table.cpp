#include "table.h"

#include "language/names.h"
#include "player.h"

#include <array>
#include <cstdio>
#include <fcntl.h>
#include <string>
#include <sys/wait.h>
#include <unistd.h>

using namespace product_set;

namespace
{
constexpr unsigned POWERED = UFI | MODULE | UNI_CORE_CPE; // told when the device is on
constexpr unsigned WIFI = UFI | PAPER_KITE | UNI_CORE_CPE;
constexpr unsigned WPS = PAPER_KITE | UNI_CORE_CPE;
constexpr unsigned REMINDED = UFI | PAPER_KITE | UNI_CORE_CPE;

struct state_row {
    unsigned products;
    std::string_view state; // empty begins a group of rows, whose name is the stimuli
    std::string_view stimuli;
};

constexpr std::string_view AT_REST = "cfg 531=1\n"
                                     "nv battery_exist=1 battery_charging=0 battery_value=80 network_type=LTE\n"
                                     "nv signalbar=4 simcard_roam=Home wifi_onoff_state=1 RadioOff=1\n"
                                     "nv sms_nvunread_count=0 sms_nv_capability=100 sms_nvtotal_count=1\n"
                                     "battery 1\ncharger 0\n";
constexpr std::string_view POWER_ON = "notify MAIN POWERON\n";

// What happens to the device, and to no LED: the daemon decides what that shows.
constexpr std::array states = {
    state_row{EVERY_PRODUCT,                     "",                                                          "Power"                                                              },
    state_row{EVERY_PRODUCT,                     "on, nothing else to tell",                                  ""                                                                   },
    state_row{UFI,                               "self-test, first 200 ms",                                   "notify MAIN INITAL"                                                 },
    state_row{UFI,                               "self-test, afterwards",                                     "notify MAIN INITAL\nafter 1s"                                       },
    state_row{POWERED,                           "shutting down",                                             "notify MAIN SHUTTING_DOWN"                                          },
    state_row{POWERED,                           "restarting",                                                "notify MAIN RESTARTING"                                             },
    state_row{UFI | UNI_CORE_CPE,                "resetting to factory settings",                             "notify MAIN RESETTING"                                              },
    state_row{UFI | MODULE,                      "off, charging",                                             "nv battery_charging=1\ncharger 1\nnotify MAIN POWER_OFF_CHARGE"     },
    state_row{UFI | MODULE,                      "off, charged",                                              "nv battery_charging=2\ncharger 1\nnotify MAIN POWER_OFF_CHARGE"     },
    state_row{POWERED,                           "off, but only for the eye",                                 "notify MAIN POWER_OFF_UNREADL"                                      },
    state_row{UFI,                               "quick power off",                                           "notify MAIN POWER_OFF_QUICKEN"                                      },
    state_row{UFI,                               "quick power off, charging",                                 "nv battery_charging=1\nnotify MAIN POWER_OFF_CHARGE_QUICKEN"        },
    state_row{UFI | MODULE,                      "asleep",                                                    "notify SLEEP 1"                                                     },
    state_row{UNI_CORE_CPE,                      "asleep",                                                    "notify SLEEP 5"                                                     },

    state_row{UFI | MODULE,                      "",                                                          "Battery"                                                            },
    state_row{UFI | MODULE,                      "10 %",                                                      "nv battery_value=10\nnotify MAIN BATTERY_VALUE"                     },
    state_row{UFI | MODULE,                      "20 %",                                                      "nv battery_value=20\nnotify MAIN BATTERY_VALUE"                     },
    state_row{UFI | MODULE,                      "40 %",                                                      "nv battery_value=40\nnotify MAIN BATTERY_VALUE"                     },
    state_row{UFI | MODULE,                      "10 %, charging",
              "nv battery_value=10 battery_charging=1\ncharger 1\nnotify MAIN CHARGIN_STATUS"                                                                                      },
    state_row{UFI | MODULE,                      "40 %, charging",
              "nv battery_value=40 battery_charging=1\ncharger 1\nnotify MAIN CHARGIN_STATUS"                                                                                      },
    state_row{UFI | MODULE,                      "80 %, charging",                                            "nv battery_charging=1\ncharger 1\nnotify MAIN CHARGIN_STATUS"       },
    state_row{UFI | MODULE,                      "charged",                                                   "nv battery_charging=2\ncharger 1\nnotify MAIN CHARGIN_STATUS"       },
    state_row{UFI | MODULE,                      "none in the device",                                        "nv battery_exist=0\nbattery 0\nnotify MAIN BATTERY_VALUE"           },
    state_row{MODULE,                            "charger connected",                                         "charger 1\nindication 1356"                                         },

    state_row{EVERY_PRODUCT,                     "",                                                          "Network"                                                            },
    state_row{EVERY_PRODUCT,                     "limited or no service",                                     "nv network_type=LIMITED_SERVICE_GSM\nnotify NWINFO NETTYPE"         },
    state_row{EVERY_PRODUCT,                     "2G",                                                        "nv network_type=EDGE\nnotify NWINFO NETTYPE"                        },
    state_row{EVERY_PRODUCT,                     "3G",                                                        "nv network_type=HSPA+\nnotify NWINFO NETTYPE"                       },
    state_row{EVERY_PRODUCT,                     "5G",                                                        "nv network_type=SA\nnotify NWINFO NETTYPE"                          },
    state_row{MODULE,                            "3G, roaming",
              "nv network_type=HSPA+ simcard_roam=Roaming\nnotify NWINFO NETTYPE\nnotify NWINFO ROAMING_STATUS"                                                                    },
    state_row{MODULE,                            "4G, roaming",                                               "nv simcard_roam=Roaming\nnotify NWINFO ROAMING_STATUS"              },
    state_row{DATA_CARD | MODULE | UNI_CORE_CPE, "no signal bar",                                             "nv signalbar=0\nnotify NWINFO SIG_BAR"                              },
    state_row{DATA_CARD | MODULE | UNI_CORE_CPE, "1 signal bar",                                              "nv signalbar=1\nnotify NWINFO SIG_BAR"                              },
    state_row{DATA_CARD | MODULE | UNI_CORE_CPE, "2 signal bars",                                             "nv signalbar=2\nnotify NWINFO SIG_BAR"                              },
    state_row{DATA_CARD | MODULE | UNI_CORE_CPE, "3 signal bars",                                             "nv signalbar=3\nnotify NWINFO SIG_BAR"                              },
    state_row{DATA_CARD | MODULE | UNI_CORE_CPE, "5 signal bars",                                             "nv signalbar=5\nnotify NWINFO SIG_BAR"                              },
    state_row{EVERY_PRODUCT,                     "data call up",                                              "nv q6_ppp_status=q6_ppp_connected\nnotify PPP PPP_STATUS 1"         },

    state_row{WIFI,                              "",                                                          "Wi-Fi"                                                              },
    state_row{WIFI,                              "off",                                                       "nv wifi_onoff_state=0\nnotify WLAN CURRENT_STATUS 0"                },
    state_row{WPS,                               "WPS pairing",                                               "nv wifi_chip1_wps_state=1\nnotify WLAN AP_WPS_STATE 1"              },

    state_row{UFI | MODULE | UNI_CORE_CPE,       "",                                                          "Messages and calls"                                                 },
    state_row{UFI,                               "new message",                                               "nv sms_nvunread_count=1\nnotify SMS NEW_SMS"                        },
    state_row{UFI,                               "new message, ten seconds later",                            "nv sms_nvunread_count=1\nnotify SMS NEW_SMS\nafter 10s"             },
    state_row{UFI,                               "unread messages",                                           "nv sms_nvunread_count=1\nnotify SMS NV_UNREAD_SMS"                  },
    state_row{UFI,                               "message store full",                                        "nv sms_nvtotal_count=100\nnotify SMS MEMORY_FULL"                   },
    state_row{MODULE,                            "voicemail",                                                 "notify SMS VOCEMAIL_SET_FLAG 1"                                     },
    state_row{MODULE | UNI_CORE_CPE,             "phone in use",                                              "notify VOICE \"PHONE LED ON\""                                      },
    state_row{MODULE | UNI_CORE_CPE,             "phone rings",                                               "notify VOICE \"PHONE BLINK\""                                       },

    state_row{EVERY_PRODUCT,                     "",                                                          "Night, alarms and reminders"                                        },
    state_row{EVERY_PRODUCT,                     "night, dimmed",
              "nv night_mode_switch=1 night_mode_start_time=22:00 night_mode_end_time=06:30 syn_done=1\n"
              "clock 23:00\ncommand NIGHT_MODE\nafter 20s"                                                                                                                         },
    state_row{EVERY_PRODUCT,                     "night, dark",
              "nv night_mode_switch=1 night_mode_start_time=22:00 night_mode_end_time=06:30 syn_done=1\n"
              "nv night_mode_close_all_led=1\nclock 23:00\ncommand NIGHT_MODE\nafter 20s"                                                                                          },
    state_row{EVERY_PRODUCT,                     "too hot",                                                   "nv thermal_led_enable=60\nsensor 0 75\ncommand OVER_TEMP\nafter 20s"},
    state_row{REMINDED,                          "allowance nearly used up: of seven seconds of a call, one",
              "nv data_volume_limit_switch=1 data_volume_limit_unit=data data_volume_limit_size=4_1024\n"
              "nv data_volume_alert_percent=75 monthly_tx_bytes=4294967296 monthly_rx_bytes=0\n"
              "nv q6_ppp_status=q6_ppp_connected\nnotify PPP PPP_STATUS 1\nafter 12s"                                                                                              },
};

std::string lit(const table_row &row)
{
    std::string list;
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const led_look &look = row.leds[static_cast<size_t>(led)];
        if (look.mode != led_mode::OFF && look.brightness > 0) {
            list += (list.empty() ? "" : ", ") + std::string(led_name(led)) + " " + describe(look);
        }
    }
    return list.empty() ? "dark" : list;
}

bool no_include(const std::string &, std::string &)
{
    return false;
}

int play_state(const product_name &product, const state_row &row, const daemon_options &options, table_row &out)
{
    scenario story;
    std::string error;
    if (!parse_scenario(switched_on(product) + std::string(row.stimuli), std::string(row.state), no_include, story,
                        error)) {
        fprintf(stderr, "%s\n", error.c_str());
        return PLAY_IMPOSSIBLE;
    }
    player_options how;
    how.process = options;
    const play_report report = play(story, how, false);
    fputs(report.last.failure.c_str(), stderr);
    out.leds = report.leds;
    return report.last.result;
}

// In a process of its own, which hands the LEDs back through a pipe.
int play_state_apart(const product_name &product, const state_row &row, const daemon_options &options, table_row &out)
{
    std::array<int, 2> ends = {-1, -1};
    if (pipe2(ends.data(), O_CLOEXEC) != 0) {
        return PLAY_FAILED;
    }
    fflush(stdout);
    const pid_t child = fork();
    if (child == 0) {
        const int result = play_state(product, row, options, out);
        const bool told = write(ends[1], out.leds.data(), sizeof out.leds) == sizeof out.leds;
        _exit(result == 0 && !told ? PLAY_FAILED : result);
    }
    close(ends[1]);
    const bool heard = read(ends[0], out.leds.data(), sizeof out.leds) == sizeof out.leds;
    close(ends[0]);
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) < 0 || !WIFEXITED(status)) {
        return PLAY_FAILED;
    }
    return WEXITSTATUS(status) == 0 && !heard ? PLAY_FAILED : WEXITSTATUS(status);
}
} // namespace

std::string switched_on(const product_name &product)
{
    const bool is_told = (product.mask & POWERED) != 0;
    return "product " + std::string(product.name) + "\n" + std::string(AT_REST) + "start\n" +
           std::string(is_told ? POWER_ON : "");
}

int play_table(const product_name &product, const daemon_options &options, std::vector<table_row> &rows)
{
    for (const state_row &state : states) {
        if (!(state.products & product.mask)) {
            continue;
        }
        table_row &row = rows.emplace_back();
        row.heading = state.state.empty();
        row.state = row.heading ? state.stimuli : state.state;
        if (row.heading) {
            continue;
        }
        if (const int result = play_state_apart(product, state, options, row)) {
            return result;
        }
    }
    return 0;
}

void print_table(const product_name &product, const std::vector<table_row> &rows)
{
    printf("| %s | LEDs that are lit |\n| --- | --- |\n", std::string(product.name).c_str());
    for (const table_row &row : rows) {
        if (row.heading) {
            printf("| **%s** | |\n", row.state.c_str());
        } else {
            printf("| %s | %s |\n", row.state.c_str(), lit(row).c_str());
        }
    }
}
