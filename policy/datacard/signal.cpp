#include "policy/datacard/signal.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"

#include <array>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

enum signal_led_state : int { SIGNAL_LED_DARK = 0, SIGNAL_LED_BLINK = 6, SIGNAL_LED_LIT = 7 };

// By the number of bars.
constexpr auto state_of_bars = std::array{
    SIGNAL_LED_DARK, SIGNAL_LED_BLINK, SIGNAL_LED_LIT, SIGNAL_LED_LIT, SIGNAL_LED_LIT, SIGNAL_LED_LIT,
};

static void kiv_set_signal_led_state(signal_led_state state)
{
    LED_INFO("kiv_set_signal_led_state :%d", state);
    switch (state) {
    case SIGNAL_LED_DARK:
        kiv_led_set_sig_led_operation(LED_SIG_6, LED_OP_OFF, 0, 0, 0);
        break;
    case SIGNAL_LED_BLINK:
        kiv_led_set_sig_led_operation(LED_SIG_6, LED_OP_BLINK, 200, 1400, 4);
        break;
    case SIGNAL_LED_LIT:
        kiv_led_set_sig_led_operation(LED_SIG_6, LED_OP_ON, 0, 0, 4);
        break;
    }
}

void kiv_led_handle_signal_state(int bars)
{
    LED_INFO("kiv_led_handle_signal_state :%d", bars);

    const unsigned count = static_cast<unsigned>(bars); // a negative count is out of range too
    if (bars != led_signal_level && count < state_of_bars.size()) {
        kiv_set_signal_led_state(state_of_bars[count]);
    }
    led_signal_level = bars;
}
