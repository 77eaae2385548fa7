#include "evidence/drops.h"

#include "language/names.h"

#include <array>

namespace
{
constexpr std::string_view OFF = "the device was not powered on";
constexpr std::string_view ASLEEP = "the device was asleep";
constexpr std::string_view NOT_AWAKE = "the device was not powered on, or asleep";

struct drop_row {
    std::string_view line;   // a piece of it
    std::string_view groups; // of LEDs, each with a blank before and behind; "*" for all
    std::string_view reason;
};

constexpr std::array drop_rows = {
    drop_row{"kiv_led_handle_nwinfoStatus, not power on",            " net ",                OFF                               },
    drop_row{"kiv_led_handle_nwinfoStatus, sleep mode",              " net ",                ASLEEP                            },
    drop_row{"kiv_led_handle_pppStatus, not power on",               " net ",                OFF                               },
    drop_row{"kiv_led_handle_pppStatus, sleep mode",                 " net ",                ASLEEP                            },
    drop_row{"get_dstStatus, not power on",                          " net ",                OFF                               },
    drop_row{"get_dstStatus, sleep mode",                            " net ",                ASLEEP                            },
    drop_row{"recv_SMSstatus not power on",                          " sms ",                OFF                               },
    drop_row{"recv_SMSstatus : sleep mode",                          " sms ",                ASLEEP                            },
    drop_row{"kiv_led_set_led_wifi_init, not power on",              " wifi ",               OFF                               },
    drop_row{"kiv_led_set_led_wakeup_wlan, not power on",            " wifi ",               OFF                               },
    drop_row{"kiv_led_set_wifi_wps_state, not power on",             " wifi ",               OFF                               },
    drop_row{"ignore WLAN message",                                  " wifi ",               NOT_AWAKE                         },
    drop_row{"ignore WPS message",                                   " wifi ",               NOT_AWAKE                         },
    drop_row{"sleep so wifi led off",                                " wifi ",               ASLEEP                            },
    drop_row{"recv_battery_state, KIV_LED_SLEEP",                    " bat ",                ASLEEP                            },
    drop_row{"kiv_singlechip_led_handle_signal_state, not power on", " sig ",                OFF                               },
    drop_row{"kiv_singlechip_led_handle_signal_state, sleep mode",   " sig ",                ASLEEP                            },
    drop_row{"kiv_cpe_led_handle_signal_state, OVER TEMP",           " sig ",                "the board was too hot"           },
    drop_row{"kiv_cpe_led_handle_nwinfoStatus, not power on",        " net voice ",          OFF                               },
    drop_row{"kiv_cpe_led_handle_nwRoamStatus, not power on",        " net voice ",          OFF                               },
    drop_row{"kiv_cpe_led_handle_pppStatus, not power on",           " net ",                OFF                               },
    drop_row{"kiv_cpe_led_handle_signal_state, not power on",        " voice ",              OFF                               },
    drop_row{"kiv_cpe_led_handle_voicemail_state, not power on",     " voicemail ",          OFF                               },
    drop_row{"kiv_led_handle_sleep_status_change:  not power on",    " bat net wifi sms ",   OFF                               },
    drop_row{"Power OFF, Ignore relight msg",                        " sig power wifi net ", OFF                               },
    drop_row{"led id error!",                                        " power ",              "its group refuses that LED"      },
    drop_row{"LED function disable and not receive message",         "*",                    "the LED function is switched off"},
};
} // namespace

std::string dropped_for(int led, const std::string &log_text)
{
    const std::string_view name = led_name(led);
    const std::string group = " " + std::string(name.substr(0, name.find('_'))) + " ";
    if (log_text.find("Night mode check: led_id=" + std::to_string(led) + " brightness=0") != std::string::npos) {
        return "the night keeps it dark";
    }
    for (const drop_row &row : drop_rows) {
        if (log_text.find(row.line) != std::string::npos &&
            (row.groups == "*" || row.groups.find(group) != std::string_view::npos)) {
            return std::string(row.reason);
        }
    }
    return {};
}
