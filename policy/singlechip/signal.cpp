#include "policy/singlechip/signal.h"

#include "ground/led_ctx.h"
#include "ground/led_log.h"
#include "painters/signal_led.h"

#include <algorithm>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";
constexpr unsigned MAX_LEVEL = 3;

void kiv_singlechip_led_handle_signal_state(int bars)
{
    if (led_power_state != POWER_ON) {
        LED_ERROR("kiv_singlechip_led_handle_signal_state, not power on!");
        return;
    }
    if (cur_led_sleep_status != AWAKE) {
        LED_ERROR("kiv_singlechip_led_handle_signal_state, sleep mode!");
        return;
    }

    // Unsigned, so that a negative count is the highest level.
    const int level = static_cast<int>(std::min(static_cast<unsigned>(bars), MAX_LEVEL));
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
