#include "policy/standard/voice.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "core/nv_read.h"
#include "core/product_route.h"
#include "policy/cpe/indicators.h"
#include "policy/cpe/setters.h"
#include "policy/singlechip/setters.h"

#include <string_view>

constexpr char led_log_source[] = "kiv_mirta_led";

constexpr product_route voicemail_route = {
    .module = kiv_cpe_led_handle_voicemail_state,
};
constexpr product_route phone_route = {
    .module = kiv_cpe_led_set_voice_status,
    .uni_core_cpe = kiv_singlechip_led_set_voice_status,
};

static led_word voice_phone_led_state; // 0 off, 1 on, 2 blink: as last received

static int phone_state_of(std::string_view text)
{
    if (text == "PHONE LED ON") {
        return 1;
    }
    return text == "PHONE BLINK" ? 2 : 0;
}

void recv_VoiceMailStatus(const char *text)
{
    const int flag = kiv_led_text_to_int(text);

    LED_INFO("recv_VoiceMailStatus:%d\n", flag);
    kiv_led_route(voicemail_route, flag);
}

void recv_voicePhoneStatus(const char *text)
{
    // A call rings whether the device is on, off or asleep: both conditions are only logged.
    if (led_power_state != POWER_ON) {
        LED_INFO("recv_voicePhoneStatus, not power on \n ");
    } else if (cur_led_sleep_status == 1) {
        LED_INFO("recv_voicePhoneStatus, sleep mode \n ");
    }

    const int state = phone_state_of(text);
    const int shown = voice_phone_led_state;
    if (state != shown) {
        LED_INFO("set voice phone led from %d to %d\n", shown, state);
        kiv_led_route(phone_route, state);
    }
    voice_phone_led_state = state;
}

void recv_simStatus()
{
    const nv_text states = kiv_led_read_nv_text("sim_states");

    LED_INFO("[NVinfo]sim_states: %s\n", states.data());
}
