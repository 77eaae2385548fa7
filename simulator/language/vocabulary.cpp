#include "language/vocabulary.h"

#include "kiv/reg.h"
#include "kiv/socket.h"
#include "language/words.h"

#include <algorithm>
#include <array>

namespace
{
constexpr std::array keys = {
    nv_word{"battery_charging",          "0 not charging, 1 charging, 2 charged; on the module CPE 3 shows no battery"        },
    nv_word{"battery_exist",             "0 no battery in a handheld, anything else one"                                      },
    nv_word{"battery_value",             "percent; a handheld is red and blinks to 12, is red to 23, the module CPE low to 20"},
    nv_word{"network_type",              "a network name, see below"                                                          },
    nv_word{"simcard_roam",              "Home, anything else is roaming"                                                     },
    nv_word{"signalbar",                 "bars, 0 to 5"                                                                       },
    nv_word{"sim_states",                "only logged"                                                                        },
    nv_word{"wifi_onoff_state",          "0 off, 1 on"                                                                        },
    nv_word{"RadioOff",                  "read at a handheld's wake-up in place of wifi_onoff_state: 0 off, 1 on"             },
    nv_word{"WscModeOption",             "only logged"                                                                        },
    nv_word{"wifi_chip1_wps_state",      "1 pairing, anything else not"                                                       },
    nv_word{"wifi_chip2_wps_state",      "1 pairing, anything else not"                                                       },
    nv_word{"sms_nvunread_count",        "0 no unread message; anything else, and no value at all, some"                      },
    nv_word{"sms_nv_capability",         "how many messages the store holds"                                                  },
    nv_word{"sms_nvtotal_count",         "how many it has"                                                                    },
    nv_word{"night_mode_switch",         "0 off, 1 on, 2 suspended for this night; the daemon writes 1 when that is over"     },
    nv_word{"night_mode_start_time",     "HH:MM, UTC"                                                                         },
    nv_word{"night_mode_end_time",       "HH:MM, UTC; before the start: in the next morning"                                  },
    nv_word{"night_mode_close_all_led",  "1 leaves nothing lit, 0 the net LED dimmed"                                         },
    nv_word{"nitz_sync_flag",            "1 the network has set the clock"                                                    },
    nv_word{"syn_done",                  "1 the clock is synchronised"                                                        },
    nv_word{"systime_mode",              "manual: the user has set the clock"                                                 },
    nv_word{"is_night_mode",             "written by the daemon: 1 in the night, 0 otherwise"                                 },
    nv_word{"data_volume_limit_switch",  "1 the reminder is on, 0 off"                                                        },
    nv_word{"data_volume_limit_unit",    "data or time"                                                                       },
    nv_word{"data_volume_limit_size",
            "4_1 is 4 MB, 4_1024 4 GB, 4_1048576 4 TB, without a code bytes; hours when the unit is time"                     },
    nv_word{"data_volume_alert_percent", "of the limit, from where on it reminds"                                             },
    nv_word{"monthly_tx_bytes",          "bytes"                                                                              },
    nv_word{"monthly_rx_bytes",          "bytes"                                                                              },
    nv_word{"monthly_time",              "seconds"                                                                            },
    nv_word{"q6_ppp_status",             "q6_ppp_connected: the data call is up"                                              },
    nv_word{"thermal_led_enable",        "above this temperature a sensor is too hot; 0 switches the alarm off"               },
};

constexpr std::array networks = {
    network_word{"GSM",        "2G"},
    network_word{"GPRS",       "2G"},
    network_word{"EDGE",       "2G"},
    network_word{"CDMA",       "2G"},
    network_word{"HSDPA",      "3G"},
    network_word{"HSUPA",      "3G"},
    network_word{"UMTS",       "3G"},
    network_word{"HSPA",       "3G"},
    network_word{"HSPA+",      "3G"},
    network_word{"DC-HSPA+",   "3G"},
    network_word{"EVDO",       "3G"},
    network_word{"EVDO_EHRPD", "3G"},
    network_word{"CDMA_EVDO",  "3G"},
    network_word{"TDSCDMA",    "3G"},
    network_word{"LTE",        "4G"},
    network_word{"ENDC",       "5G"},
    network_word{"SA",         "5G"},
    network_word{"LTE-NSA",    "5G"},
};

constexpr std::array<std::string_view, 9> sources = {
    "kiv_mirta_led",     "kiv_mirta_led_operation", "kiv_mirta_led_set_status", "kiv_mirta_led_set_status_singlechip",
    "kiv_mirta_led_cpe", "kiv_led_night_mode",      "kiv_led_data_limit",       "kiv_led_over_temp",
    "kiv_led_tr181",
};

constexpr std::array texts = {
    text_word{KIV_MODULE_WLAN,  REG_WLAN_CURRENT_STATUS,       "0 off, 1 on",                                                ""},
    text_word{KIV_MODULE_WLAN,  REG_WLAN_AP_WPS_STATE,         "1 pairing, any other number not",                            ""},
    text_word{KIV_MODULE_WLAN,  REG_WLAN_AP_WPS_STATE_CHIP2,   "1 pairing, any other number not",                            ""},
    text_word{KIV_MODULE_SMS,   REG_WMS_SMS_VOCEMAIL_SET_FLAG, "1 a voicemail waits, any other number none",                 ""},
    text_word{KIV_MODULE_PPP,   REG_PPP_STATUS,                "1 connected, any other number not",                          ""},
    text_word{KIV_MODULE_SLEEP, REG_SLEEP_STATUS_EVENT,        "1 asleep, on the single-chip CPE 5; any other number awake",
              ""                                                                                                               },
    text_word{KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE,     "PHONE LED ON, PHONE BLINK, PHONE LED OFF",
              "|PHONE LED ON|PHONE BLINK|PHONE LED OFF|"                                                                       },
};
} // namespace

std::span<const nv_word> nv_words()
{
    return keys;
}

std::span<const network_word> network_words()
{
    return networks;
}

std::span<const std::string_view> log_sources()
{
    return sources;
}

const text_word *find_text_word(int module_id, uint32_t event)
{
    const auto *found = std::find_if(texts.begin(), texts.end(), [=](const text_word &word) {
        return word.module_id == module_id && word.event == event;
    });
    return found == texts.end() ? nullptr : found;
}

std::string_view indication_meaning(int id)
{
    switch (id) {
    case 1350:
    case 1351:
        return "the battery has come or gone: how it stands is asked and read anew";
    case 1356:
        return "a charger is connected";
    case 1357:
        return "no charger is connected";
    default:
        return {};
    }
}

bool has_meaning(int module_id, uint32_t event, std::string_view text)
{
    const text_word *word = find_text_word(module_id, event);
    if (!word) {
        return text.empty() || module_id == KIV_MODULE_DST; // whose text is logged
    }
    if (!word->only.empty()) {
        return word->only.find("|" + std::string(text) + "|") != std::string_view::npos;
    }
    return parse_number(text, INT32_MIN, INT32_MAX).has_value();
}
