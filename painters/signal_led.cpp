#include "painters/signal_led.h"

#include "ground/led_log.h"
#include "kiv/adabsp.h"
#include "output/led_groups.h"

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";

void kiv_qt330x_set_led_signal_state(int level)
{
    LED_INFO("kiv_qt330x_set_led_signal_state: sig = %d", level);
    kiv_led_set_sig_led_operation(LED_SIG_BLUE, LED_OP_ON, 0, 0, level);
}
