#include "policy/standard/signal_led.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"

#include <algorithm>
#include <array>

constexpr char led_log_source[] = "kiv_mirta_led";

enum signal_led_state : int { SIGNAL_LED_DARK = 0, SIGNAL_LED_BLINK = 6, SIGNAL_LED_LIT = 7 };

constexpr unsigned max_bars = 5;
constexpr unsigned max_level = 3;

// By the number of bars.
constexpr std::array<signal_led_state, max_bars + 1> state_of_bars = {
    SIGNAL_LED_DARK, SIGNAL_LED_BLINK, SIGNAL_LED_LIT, SIGNAL_LED_LIT, SIGNAL_LED_LIT, SIGNAL_LED_LIT,
};

struct signal_led_row {
    int state;
    led_step step;
};

constexpr auto signal_led_rows = std::array{
    signal_led_row{SIGNAL_LED_DARK,  {LED_SIG_6, LED_OP_OFF, 0, 0, 0}       },
    signal_led_row{SIGNAL_LED_BLINK, {LED_SIG_6, LED_OP_BLINK, 200, 1400, 4}},
    signal_led_row{SIGNAL_LED_LIT,   {LED_SIG_6, LED_OP_ON, 0, 0, 4}        },
};

void kiv_led_handle_signal_state(int bars)
{
    LED_INFO("kiv_led_handle_signal_state :%d", bars);

    // Unsigned, so that a negative count is out of range too.
    const unsigned count = static_cast<unsigned>(bars);
    if (bars != led_signal_level && count <= max_bars) {
        kiv_set_signal_led_state(state_of_bars[count]);
    }
    led_signal_level = bars;
}

void kiv_set_signal_led_state(int state)
{
    LED_INFO("kiv_set_signal_led_state :%d", state);
    for (const signal_led_row &row : signal_led_rows) {
        if (row.state == state) {
            kiv_led_apply(kiv_led_set_sig_led_operation, row.step);
        }
    }
}

void kiv_singlechip_led_handle_signal_state(int bars)
{
    if (led_power_state != POWER_ON) {
        LED_ERROR("kiv_singlechip_led_handle_signal_state, not power on!");
        return;
    }
    if (cur_led_sleep_status != 0) {
        LED_ERROR("kiv_singlechip_led_handle_signal_state, sleep mode!");
        return;
    }

    // Unsigned, so that a negative count is the highest level.
    const int level = static_cast<int>(std::min(static_cast<unsigned>(bars), max_level));
    if (over_temp_enable == 1 && is_over_temp == 1) {
        led_signal_level = level;
        LED_ERROR("kiv_cpe_led_handle_signal_state, OVER TEMP!");
        return;
    }
    LED_INFO("kiv_led_handle_signal_state :%d", level);
    if (level != led_signal_level) {
        kiv_qt330x_set_led_signal_state(level);
    }
    led_signal_level = level;
}

void kiv_qt330x_set_led_signal_state(int level)
{
    LED_INFO("kiv_qt330x_set_led_signal_state: sig = %d", level);
    kiv_led_set_sig_led_operation(LED_SIG_BLUE, LED_OP_ON, 0, 0, level);
}
