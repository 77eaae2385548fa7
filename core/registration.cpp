#include "core/registration.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "kiv/reg.h"
#include "kiv/socket.h"

#include <array>
#include <span>

constexpr char led_log_source[] = "kiv_mirta_led";

struct registration {
    int module;
    uint32_t mask1;
    const char *begin = nullptr; // logged before; nullptr: none
    const char *end = nullptr;   // logged after
};

constexpr uint32_t mc_events = REG_MC_CHARGIN_STATUS | REG_MC_EVENT_SHUTTING_DOWN | REG_MC_EVENT_POWERON |
                               REG_MC_EVENT_RESTARTING | REG_MC_EVENT_POWER_OFF_CHARGE | REG_MC_EVENT_POWER_OFF_UNREADL;
constexpr uint32_t mc_quick_events =
    REG_MC_EVENT_POWER_OFF_QUICKEN | REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN | REG_MC_EVENT_POWER_OFF_QUICKEN_ACK;
constexpr uint32_t wlan_and_wps_events = REG_WLAN_CURRENT_STATUS | REG_WLAN_AP_WPS_STATE | REG_WLAN_AP_WPS_STATE_CHIP2;
constexpr uint32_t wlan_event_4 = 0x4; // registered on the handheld, shown by nothing

constexpr auto common_registrations = std::array{
    registration{KIV_MODULE_MDM,    REG_SIM_STATUS                                                     },
    registration{KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR | REG_NWINFO_ROAMING_STATUS | REG_NWINFO_NETTYPE},
    registration{KIV_MODULE_PPP,    REG_PPP_STATUS | REG_Q6_PPP_STATUS                                 },
};
constexpr auto ufi_registrations = std::array{
    registration{KIV_MODULE_DST,  REG_DST_FLOW_STATUS                                                      },
    registration{KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS | wlan_event_4                                   },
    registration{KIV_MODULE_SMS,  REG_WMS_SMS_NV_UNREAD_SMS | REG_WMS_SMS_NEW_SMS | REG_WMS_SMS_MEMORY_FULL},
};
constexpr auto paper_kite_registrations = std::array{
    registration{KIV_MODULE_WLAN, wlan_and_wps_events},
};
// clang-format off
constexpr auto module_registrations = std::array{
    registration{KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG, "reg SMS notify msg begin!", "reg SMS notify msg end!"},
    registration{KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "reg voice phone notify msg begin!",
                 "reg voice phone notify msg end!"},
};
// clang-format on
// clang-format off
constexpr auto uni_core_cpe_registrations = std::array{
    registration{KIV_MODULE_WLAN,  wlan_and_wps_events},
    registration{KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "reg voice phone notify msg!"},
};
// clang-format on

static std::span<const registration> registrations_of_this_product()
{
    switch (static_cast<led_product>(int{led_product_type})) {
    case LED_PRODUCT_UFI:
        return ufi_registrations;
    case LED_PRODUCT_PAPER_KITE:
        return paper_kite_registrations;
    case LED_PRODUCT_MODULE:
        return module_registrations;
    case LED_PRODUCT_UNI_CORE_CPE:
        return uni_core_cpe_registrations;
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_COUNT:
        break;
    }
    return {};
}

static void register_for(std::span<const registration> registrations)
{
    for (const registration &row : registrations) {
        const reg_masks masks = {row.mask1, 0, 0, 0};

        if (row.begin != nullptr) {
            LED_ERROR("%s", row.begin);
        }
        kiv_reg_func(row.module, KIV_MODULE_LED, &masks);
        if (row.end != nullptr) {
            LED_ERROR("%s", row.end);
        }
    }
}

// The data card and the paper-kite are powered by their host: no main-control events.
static void register_for_main_control()
{
    const int product = led_product_type;
    if (product == LED_PRODUCT_DATA_CARD || product == LED_PRODUCT_PAPER_KITE) {
        return;
    }

    reg_masks masks = {mc_events, REG_MC_BATTERY_VALUE, 0, 0};
    if (product == LED_PRODUCT_UFI || product == LED_PRODUCT_UNI_CORE_CPE) {
        LED_INFO("reg mc resetting msg!");
        masks.mask1 |= REG_MC_EVENT_RESETTING;
    }
    if (product == LED_PRODUCT_UFI) {
        LED_INFO("reg mc quick power on/off msg!");
        masks.mask1 |= REG_MC_EVENT_INITAL;
        masks.mask2 |= mc_quick_events;
    }
    kiv_reg_func(KIV_MODULE_MAIN, KIV_MODULE_LED, &masks);
}

void kiv_led_regNotifyMsg()
{
    LED_INFO("kiv_led_regNotifyMsg");
    register_for_main_control();
    register_for(common_registrations);
    register_for(registrations_of_this_product());
}
