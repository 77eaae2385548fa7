#include "core/registration.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "kiv/reg.h"
#include "kiv/socket.h"

#include <array>
#include <span>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

struct registration {
    int module;
    uint32_t mask1;
    const char *begin = nullptr; // logged before; nullptr: none
    const char *end = nullptr;   // logged after
};

constexpr uint32_t MC_EVENTS = REG_MC_CHARGIN_STATUS | REG_MC_EVENT_SHUTTING_DOWN | REG_MC_EVENT_POWERON |
                               REG_MC_EVENT_RESTARTING | REG_MC_EVENT_POWER_OFF_CHARGE | REG_MC_EVENT_POWER_OFF_UNREADL;
constexpr uint32_t MC_QUICK_EVENTS =
    REG_MC_EVENT_POWER_OFF_QUICKEN | REG_MC_EVENT_POWER_OFF_CHARGE_QUICKEN | REG_MC_EVENT_POWER_OFF_QUICKEN_ACK;
constexpr uint32_t WLAN_AND_WPS_EVENTS = REG_WLAN_CURRENT_STATUS | REG_WLAN_AP_WPS_STATE | REG_WLAN_AP_WPS_STATE_CHIP2;
constexpr uint32_t WLAN_EVENT_4 = 0x4; // registered on the handheld, shown by nothing

constexpr auto common_registrations = std::array{
    registration{KIV_MODULE_MDM,    REG_SIM_STATUS                                                     },
    registration{KIV_MODULE_NWINFO, REG_NWINFO_SIG_BAR | REG_NWINFO_ROAMING_STATUS | REG_NWINFO_NETTYPE},
    registration{KIV_MODULE_PPP,    REG_PPP_STATUS | REG_Q6_PPP_STATUS                                 },
};
constexpr auto ufi_registrations = std::array{
    registration{KIV_MODULE_DST,  REG_DST_FLOW_STATUS                                                      },
    registration{KIV_MODULE_WLAN, REG_WLAN_CURRENT_STATUS | WLAN_EVENT_4                                   },
    registration{KIV_MODULE_SMS,  REG_WMS_SMS_NV_UNREAD_SMS | REG_WMS_SMS_NEW_SMS | REG_WMS_SMS_MEMORY_FULL},
};
constexpr auto paper_kite_registrations = std::array{
    registration{KIV_MODULE_WLAN, WLAN_AND_WPS_EVENTS},
};
// clang-format off
constexpr auto module_registrations = std::array{
    registration{KIV_MODULE_SMS, REG_WMS_SMS_VOCEMAIL_SET_FLAG, "reg SMS notify msg begin!", "reg SMS notify msg end!"},
    registration{KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "reg voice phone notify msg begin!",
                 "reg voice phone notify msg end!"},
};
constexpr auto uni_core_cpe_registrations = std::array{
    registration{KIV_MODULE_WLAN,  WLAN_AND_WPS_EVENTS},
    registration{KIV_MODULE_VOICE, REG_VOICE_PHONE_LED_STATE, "reg voice phone notify msg!"},
};
// clang-format on

static std::span<const registration> registrations_of_this_product()
{
    switch (this_product()) {
    case LED_PRODUCT_UFI:
        return ufi_registrations;
    case LED_PRODUCT_PAPER_KITE:
        return paper_kite_registrations;
    case LED_PRODUCT_MODULE:
        return module_registrations;
    case LED_PRODUCT_UNI_CORE_CPE:
        return uni_core_cpe_registrations;
    case LED_PRODUCT_DATA_CARD:
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

static void register_for_main_control()
{
    reg_masks masks = {MC_EVENTS, REG_MC_BATTERY_VALUE, 0, 0};

    switch (this_product()) {
    case LED_PRODUCT_DATA_CARD:
    case LED_PRODUCT_PAPER_KITE: // on from the daemon's start, and until its end
        return;
    case LED_PRODUCT_UFI:
        LED_INFO("reg mc resetting msg!");
        LED_INFO("reg mc quick power on/off msg!");
        masks.mask1 |= REG_MC_EVENT_RESETTING | REG_MC_EVENT_INITAL;
        masks.mask2 |= MC_QUICK_EVENTS;
        break;
    case LED_PRODUCT_UNI_CORE_CPE:
        LED_INFO("reg mc resetting msg!");
        masks.mask1 |= REG_MC_EVENT_RESETTING;
        break;
    case LED_PRODUCT_MODULE:
        break;
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
