// The device's LEDs and modules by name, as traces, LED folders and scenarios show them. The one list of each.
#pragma once

#include "kiv/adabsp.h"
#include "kiv/socket.h"

#include <algorithm>
#include <array>
#include <string_view>

struct led_row {
    int led_id;
    const char *name;
};

inline constexpr std::array led_rows = {
    led_row{LED_BAT_RED,          "bat_red"         },
    led_row{LED_BAT_GREEN,        "bat_green"       },
    led_row{LED_BAT_BLUE,         "bat_blue"        },
    led_row{LED_BAT_YELLOW,       "bat_yellow"      },
    led_row{LED_SIG_6,            "sig_6"           },
    led_row{LED_SIG_BLUE,         "sig_blue"        },
    led_row{LED_FLOW_RED,         "flow_red"        },
    led_row{LED_FLOW_GREEN,       "flow_green"      },
    led_row{LED_FLOW_BLUE,        "flow_blue"       },
    led_row{LED_FLOW_YELLOW,      "flow_yellow"     },
    led_row{LED_NET_RED,          "net_red"         },
    led_row{LED_NET_14,           "net_14"          },
    led_row{LED_NET_BLUE,         "net_blue"        },
    led_row{LED_NET_16,           "net_16"          },
    led_row{LED_NET_WHITE,        "net_white"       },
    led_row{LED_ID_41,            "id_41"           },
    led_row{LED_WIFI_BLUE,        "wifi_blue"       },
    led_row{LED_RSSI_RED,         "rssi_red"        },
    led_row{LED_RSSI_GREEN,       "rssi_green"      },
    led_row{LED_RSSI_BLUE,        "rssi_blue"       },
    led_row{LED_RSSI_YELLOW,      "rssi_yellow"     },
    led_row{LED_SMS_GREEN,        "sms_green"       },
    led_row{LED_SMS_BLUE,         "sms_blue"        },
    led_row{LED_POWER_BLUE,       "power_blue"      },
    led_row{LED_POWER_54,         "power_54"        },
    led_row{LED_VOICE_RED,        "voice_red"       },
    led_row{LED_VOICE_GREEN,      "voice_green"     },
    led_row{LED_VOICE_BLUE,       "voice_blue"      },
    led_row{LED_VOICE_YELLOW,     "voice_yellow"    },
    led_row{LED_VOICEMAIL_RED,    "voicemail_red"   },
    led_row{LED_VOICEMAIL_GREEN,  "voicemail_green" },
    led_row{LED_VOICEMAIL_BLUE,   "voicemail_blue"  },
    led_row{LED_VOICEMAIL_YELLOW, "voicemail_yellow"},
    led_row{LED_SIGBAR_0,         "sigbar_0"        },
    led_row{LED_SIGBAR_0 + 1,     "sigbar_1"        },
    led_row{LED_SIGBAR_0 + 2,     "sigbar_2"        },
    led_row{LED_SIGBAR_0 + 3,     "sigbar_3"        },
    led_row{LED_SIGBAR_0 + 4,     "sigbar_4"        },
    led_row{LED_SIGBAR_0 + 5,     "sigbar_5"        },
    led_row{LED_SIGBAR_0 + 6,     "sigbar_6"        },
    led_row{LED_SIGBAR_0 + 7,     "sigbar_7"        },
    led_row{LED_SIGBAR_0 + 8,     "sigbar_8"        },
    led_row{LED_SIGBAR_0 + 9,     "sigbar_9"        },
    led_row{LED_SIGBAR_0 + 10,    "sigbar_10"       },
    led_row{LED_SIGBAR_0 + 11,    "sigbar_11"       },
    led_row{LED_SIGBAR_0 + 12,    "sigbar_12"       },
    led_row{LED_SIGBAR_0 + 13,    "sigbar_13"       },
    led_row{LED_SIGBAR_0 + 14,    "sigbar_14"       },
    led_row{LED_SIGBAR_15,        "sigbar_15"       },
};

static_assert(std::all_of(led_rows.begin(), led_rows.end(),
                          [](const led_row &row) { return row.led_id >= 0 && row.led_id < LED_ID_COUNT; }),
              "LED_ID_COUNT must count every LED");

inline const char *find_led_name(int led_id) // null for an id that the board does not have
{
    for (const led_row &row : led_rows) {
        if (row.led_id == led_id) {
            return row.name;
        }
    }
    return nullptr;
}

inline int find_led_id(std::string_view name) // -1 for a name that no LED has
{
    for (const led_row &row : led_rows) {
        if (name == row.name) {
            return row.led_id;
        }
    }
    return -1;
}

struct module_row {
    int module_id;
    const char *name;
    const char *queue;
};

inline constexpr std::array module_rows = {
    module_row{KIV_MODULE_MAIN,   "MAIN",   "MSG_ID_MAIN"  },
    module_row{KIV_MODULE_PPP,    "PPP",    "MSG_ID_PPP"   },
    module_row{KIV_MODULE_SMS,    "SMS",    "MSG_ID_SMS"   },
    module_row{KIV_MODULE_WLAN,   "WLAN",   "MSG_ID_WLAN"  },
    module_row{KIV_MODULE_MDM,    "MDM",    "MSG_ID_MDM"   },
    module_row{KIV_MODULE_NWINFO, "NWINFO", "MSG_ID_NWINFO"},
    module_row{KIV_MODULE_DST,    "DST",    "MSG_ID_DST"   },
    module_row{KIV_MODULE_SLEEP,  "SLEEP",  "MSG_ID_SLEEP" },
    module_row{KIV_MODULE_LED,    "LED",    "MSG_ID_LED"   }, // the daemon itself
    module_row{KIV_MODULE_VOICE,  "VOICE",  "MSG_ID_VOICE" },
};
