#include "policy/common/voice.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "ground/nv_read.h"
#include "policy/products.h"

#include <string_view>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

static led_word voice_phone_led_state; // phone_state, as last received

static phone_state phone_state_of(std::string_view text)
{
    if (text == "PHONE LED ON") {
        return PHONE_LED_ON;
    }
    return text == "PHONE BLINK" ? PHONE_LED_BLINK : PHONE_LED_OFF;
}

void recv_VoiceMailStatus(const char *text)
{
    const int flag = kiv_led_text_to_int(text);

    LED_INFO("recv_VoiceMailStatus:%d\n", flag);
    kiv_led_voicemail_dispatch(flag);
}

void recv_voicePhoneStatus(const char *text)
{
    // A call rings whether the device is on, off or asleep: both conditions are only logged.
    if (led_power_state != POWER_ON) {
        LED_INFO("recv_voicePhoneStatus, not power on \n ");
    } else if (cur_led_sleep_status == ASLEEP) {
        LED_INFO("recv_voicePhoneStatus, sleep mode \n ");
    }

    const phone_state state = phone_state_of(text);
    const int shown = voice_phone_led_state;
    if (state != shown) {
        LED_INFO("set voice phone led from %d to %d\n", shown, state);
        kiv_led_voice_status_dispatch(state);
    }
    voice_phone_led_state = state;
}

void recv_simStatus()
{
    const nv_text states = kiv_led_read_nv_text("sim_states");

    LED_INFO("[NVinfo]sim_states: %s\n", states.data());
}
