#include "output/night_mode_gate.h"

#include "core/led_ctx.h"
#include "core/led_log.h"
#include "kiv/adabsp.h"

constexpr char led_log_source[] = "kiv_mirta_led_operation";
constexpr int dimmed_brightness = 1;

static bool stays_lit_at_night(int led_id)
{
    return led_id == LED_NET_RED || led_id == LED_NET_BLUE || led_id == LED_NET_WHITE;
}

void kiv_led_night_mode_check(int led_id, int *led_operation, int *brightness)
{
    if (is_night_mode != 1) {
        return;
    }
    if (stays_lit_at_night(led_id) && night_mode_close_all_led == 0) {
        *brightness = dimmed_brightness;
    } else {
        *led_operation = LED_OP_OFF;
        *brightness = 0;
    }
    LED_INFO("Night mode check: led_id=%d brightness=%d", led_id, *brightness);
}
