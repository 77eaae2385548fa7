#include "policy/mc_event.h"

#include "core/led_log.h"
#include "core/reverser.h"
#include "kiv/socket.h"

void kiv_led_run_mc_event(std::span<const mc_event_row> rows, uint32_t event, const char *led_log_source)
{
    for (const mc_event_row &row : rows) {
        if (row.event != event) {
            continue;
        }
        if (row.line != nullptr) {
            LED_INFO("%s", row.line);
        }
        if (row.scene != nullptr) {
            row.scene();
        }
        if (row.reverser != 0) {
            kiv_led_send_common_reverser_msg(KIV_MODULE_MAIN, row.reverser);
        }
        return;
    }
}
