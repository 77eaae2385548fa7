#include "policy/singlechip/setters.h"

#include "ground/led_log.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"

#include <array>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led_set_status_singlechip";

constexpr led_step signal_lit = {LED_SIG_6, LED_OP_ON, 0, 0, 4};

// By signal state.
constexpr auto signal_steps = std::array{
    led_step{LED_SIG_6, LED_OP_OFF,   0,   0,    0},
    led_step{LED_SIG_6, LED_OP_BLINK, 800, 1200, 4},
    signal_lit,
    signal_lit,
    signal_lit,
    signal_lit,
};
// By phone_state.
constexpr auto voice_steps = std::array{
    led_step{LED_VOICE_BLUE, LED_OP_OFF,   0,   0,    0},
    led_step{LED_VOICE_BLUE, LED_OP_ON,    0,   0,    4},
    led_step{LED_VOICE_BLUE, LED_OP_BLINK, 400, 1600, 4},
};

void kiv_singlechip_led_set_sigal_status(int signal_state)
{
    LED_INFO("enter kiv_singlechip_led_set_sigal_status signal_state=%d\n", signal_state);
    if (static_cast<unsigned>(signal_state) < signal_steps.size()) {
        kiv_led_set_sig_led_operation(signal_steps[static_cast<unsigned>(signal_state)]);
    }
}

void kiv_singlechip_led_set_voice_status(int state)
{
    if (static_cast<unsigned>(state) < voice_steps.size()) {
        kiv_led_set_voice_led_operation(voice_steps[static_cast<unsigned>(state)]);
    }
}
