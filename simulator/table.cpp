#include "table.h"

#include "names.h"
#include "player.h"

#include <array>
#include <cstdio>
#include <string>
#include <sys/wait.h>
#include <unistd.h>

namespace
{
// Products as they are listed in names.
enum product_mask : unsigned {
    UFI = 1,
    DATA_CARD = 2,
    PAPER_KITE = 4,
    MODULE = 8,
    UNI_CORE = 16,
    POWERED = UFI | MODULE | UNI_CORE, // told when the device is on
    WIFI = UFI | PAPER_KITE | UNI_CORE,
    REMINDED = UFI | PAPER_KITE | UNI_CORE,
    EVERY = 31,
};

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
    state_row{EVERY,                         "",                                                          "Power"                                                              },
    state_row{EVERY,                         "on, nothing else to tell",                                  ""                                                                   },
    state_row{UFI,                           "self-test, first 200 ms",                                   "notify MAIN INITAL"                                                 },
    state_row{UFI,                           "self-test, afterwards",                                     "notify MAIN INITAL\nafter 1s"                                       },
    state_row{POWERED,                       "shutting down",                                             "notify MAIN SHUTTING_DOWN"                                          },
    state_row{POWERED,                       "restarting",                                                "notify MAIN RESTARTING"                                             },
    state_row{UFI | UNI_CORE,                "resetting to factory settings",                             "notify MAIN RESETTING"                                              },
    state_row{UFI | MODULE,                  "off, charging",                                             "nv battery_charging=1\ncharger 1\nnotify MAIN POWER_OFF_CHARGE"     },
    state_row{UFI | MODULE,                  "off, charged",                                              "nv battery_charging=2\ncharger 1\nnotify MAIN POWER_OFF_CHARGE"     },
    state_row{POWERED,                       "off, but only for the eye",                                 "notify MAIN POWER_OFF_UNREADL"                                      },
    state_row{UFI,                           "quick power off",                                           "notify MAIN POWER_OFF_QUICKEN"                                      },
    state_row{UFI,                           "quick power off, charging",                                 "nv battery_charging=1\nnotify MAIN POWER_OFF_CHARGE_QUICKEN"        },
    state_row{UFI | MODULE,                  "asleep",                                                    "notify SLEEP 1"                                                     },
    state_row{UNI_CORE,                      "asleep",                                                    "notify SLEEP 5"                                                     },

    state_row{UFI | MODULE,                  "",                                                          "Battery"                                                            },
    state_row{UFI | MODULE,                  "10 %",                                                      "nv battery_value=10\nnotify MAIN BATTERY_VALUE"                     },
    state_row{UFI | MODULE,                  "20 %",                                                      "nv battery_value=20\nnotify MAIN BATTERY_VALUE"                     },
    state_row{UFI | MODULE,                  "40 %",                                                      "nv battery_value=40\nnotify MAIN BATTERY_VALUE"                     },
    state_row{UFI | MODULE,                  "10 %, charging",
              "nv battery_value=10 battery_charging=1\ncharger 1\nnotify MAIN CHARGIN_STATUS"                                                                                  },
    state_row{UFI | MODULE,                  "40 %, charging",
              "nv battery_value=40 battery_charging=1\ncharger 1\nnotify MAIN CHARGIN_STATUS"                                                                                  },
    state_row{UFI | MODULE,                  "80 %, charging",                                            "nv battery_charging=1\ncharger 1\nnotify MAIN CHARGIN_STATUS"       },
    state_row{UFI | MODULE,                  "charged",                                                   "nv battery_charging=2\ncharger 1\nnotify MAIN CHARGIN_STATUS"       },
    state_row{UFI | MODULE,                  "none in the device",                                        "nv battery_exist=0\nbattery 0\nnotify MAIN BATTERY_VALUE"           },
    state_row{MODULE,                        "charger connected",                                         "charger 1\nindication 1356"                                         },

    state_row{EVERY,                         "",                                                          "Network"                                                            },
    state_row{EVERY,                         "limited or no service",                                     "nv network_type=LIMITED_SERVICE_GSM\nnotify NWINFO NETTYPE"         },
    state_row{EVERY,                         "2G",                                                        "nv network_type=EDGE\nnotify NWINFO NETTYPE"                        },
    state_row{EVERY,                         "3G",                                                        "nv network_type=HSPA+\nnotify NWINFO NETTYPE"                       },
    state_row{EVERY,                         "5G",                                                        "nv network_type=SA\nnotify NWINFO NETTYPE"                          },
    state_row{MODULE,                        "3G, roaming",
              "nv network_type=HSPA+ simcard_roam=Roaming\nnotify NWINFO NETTYPE\nnotify NWINFO ROAMING_STATUS"                                                                },
    state_row{MODULE,                        "4G, roaming",                                               "nv simcard_roam=Roaming\nnotify NWINFO ROAMING_STATUS"              },
    state_row{DATA_CARD | MODULE | UNI_CORE, "no signal bar",                                             "nv signalbar=0\nnotify NWINFO SIG_BAR"                              },
    state_row{DATA_CARD | MODULE | UNI_CORE, "1 signal bar",                                              "nv signalbar=1\nnotify NWINFO SIG_BAR"                              },
    state_row{DATA_CARD | MODULE | UNI_CORE, "2 signal bars",                                             "nv signalbar=2\nnotify NWINFO SIG_BAR"                              },
    state_row{DATA_CARD | MODULE | UNI_CORE, "3 signal bars",                                             "nv signalbar=3\nnotify NWINFO SIG_BAR"                              },
    state_row{DATA_CARD | MODULE | UNI_CORE, "5 signal bars",                                             "nv signalbar=5\nnotify NWINFO SIG_BAR"                              },
    state_row{EVERY,                         "data call up",                                              "nv q6_ppp_status=q6_ppp_connected\nnotify PPP PPP_STATUS 1"         },

    state_row{WIFI,                          "",                                                          "Wi-Fi"                                                              },
    state_row{WIFI,                          "off",                                                       "nv wifi_onoff_state=0\nnotify WLAN CURRENT_STATUS 0"                },
    state_row{WIFI,                          "WPS pairing",                                               "nv wifi_chip1_wps_state=1\nnotify WLAN AP_WPS_STATE 1"              },

    state_row{UFI | MODULE | UNI_CORE,       "",                                                          "Messages and calls"                                                 },
    state_row{UFI,                           "new message",                                               "nv sms_nvunread_count=1\nnotify SMS NEW_SMS"                        },
    state_row{UFI,                           "new message, ten seconds later",                            "nv sms_nvunread_count=1\nnotify SMS NEW_SMS\nafter 10s"             },
    state_row{UFI,                           "unread messages",                                           "nv sms_nvunread_count=1\nnotify SMS NV_UNREAD_SMS"                  },
    state_row{UFI,                           "message store full",                                        "nv sms_nvtotal_count=100\nnotify SMS MEMORY_FULL"                   },
    state_row{MODULE,                        "voicemail",                                                 "notify SMS VOCEMAIL_SET_FLAG 1"                                     },
    state_row{MODULE | UNI_CORE,             "phone in use",                                              "notify VOICE \"PHONE LED ON\""                                      },
    state_row{MODULE | UNI_CORE,             "phone rings",                                               "notify VOICE \"PHONE BLINK\""                                       },

    state_row{EVERY,                         "",                                                          "Night, alarms and reminders"                                        },
    state_row{EVERY,                         "night, dimmed",
              "nv night_mode_switch=1 night_mode_start_time=22:00 night_mode_end_time=06:30 syn_done=1\n"
              "clock 23:00\ncommand NIGHT_MODE\nafter 20s"                                                                                                                     },
    state_row{EVERY,                         "night, dark",
              "nv night_mode_switch=1 night_mode_start_time=22:00 night_mode_end_time=06:30 syn_done=1\n"
              "nv night_mode_close_all_led=1\nclock 23:00\ncommand NIGHT_MODE\nafter 20s"                                                                                      },
    state_row{EVERY,                         "too hot",                                                   "nv thermal_led_enable=60\nsensor 0 75\ncommand OVER_TEMP\nafter 20s"},
    state_row{REMINDED,                      "allowance nearly used up: of seven seconds of a call, one",
              "nv data_volume_limit_switch=1 data_volume_limit_unit=data data_volume_limit_size=4_1024\n"
              "nv data_volume_alert_percent=75 monthly_tx_bytes=4294967296 monthly_rx_bytes=0\n"
              "nv q6_ppp_status=q6_ppp_connected\nnotify PPP PPP_STATUS 1\nafter 12s"                                                                                          },
};

unsigned mask_of(const product_name &product)
{
    return 1U << (&product - all_products().data());
}

std::string script(const product_name &product, const state_row &row)
{
    std::string text = "product " + std::string(product.name) + "\n" + std::string(AT_REST) + "start\n";
    if (mask_of(product) & POWERED)
        text += POWER_ON;
    return text + std::string(row.stimuli);
}

std::string lit(const play_report &report)
{
    std::string list;
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const led_look &look = report.leds[static_cast<size_t>(led)];
        if (look.mode != led_mode::OFF && look.brightness > 0)
            list += (list.empty() ? "" : ", ") + std::string(led_name(led)) + " " + describe(look);
    }
    return list.empty() ? "dark" : list;
}

bool no_include(const std::string &, std::string &)
{
    return false;
}

int print_row(const product_name &product, const state_row &row, const daemon_options &options)
{
    scenario story;
    std::string error;
    if (!parse_scenario(script(product, row), std::string(row.state), no_include, story, error)) {
        fprintf(stderr, "%s\n", error.c_str());
        return PLAY_IMPOSSIBLE;
    }
    play_options how;
    how.process = options;
    const play_report report = play(story, how);
    if (report.result != PLAY_HELD)
        fputs(report.failure.c_str(), stderr);
    else
        printf("| %s | %s |\n", std::string(row.state).c_str(), lit(report).c_str());
    return report.result;
}

int print_row_apart(const product_name &product, const state_row &row, const daemon_options &options)
{
    fflush(stdout);
    const pid_t child = fork();
    if (child == 0) {
        const int result = print_row(product, row, options);
        fflush(stdout);
        _exit(result);
    }
    int status = 0;
    if (child < 0 || waitpid(child, &status, 0) < 0 || !WIFEXITED(status))
        return PLAY_FAILED;
    return WEXITSTATUS(status);
}
} // namespace

int print_table(std::string_view name, const daemon_options &wanted)
{
    daemon_options options = wanted;
    std::string error;
    const product_name *product = find_product(name);
    if (!product)
        error = "unknown product '" + std::string(name) + "'; products are " + product_names();
    else
        find_daemon(options, error);
    if (!error.empty()) {
        fprintf(stderr, "%s\n", error.c_str());
        return PLAY_IMPOSSIBLE;
    }
    printf("| %s | LEDs that are lit |\n| --- | --- |\n", std::string(product->name).c_str());
    for (const state_row &row : states) {
        if (!(row.products & mask_of(*product)))
            continue;
        if (row.state.empty())
            printf("| **%s** | |\n", std::string(row.stimuli).c_str());
        else if (const int result = print_row_apart(*product, row, options))
            return result;
    }
    return 0;
}
