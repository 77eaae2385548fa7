#include "ground/reverser.h"

#include "ground/led_log.h"
#include "kiv/socket.h"

#include <charconv>

constexpr char LED_LOG_SOURCE[] = "kiv_mirta_led";
constexpr uint32_t REVERSER_EVENT = 0x20000000; // by which the main-control module knows the LED daemon's answer
constexpr uint16_t REVERSER_TEXT_LENGTH = 4;    // every value has four digits; the terminator is not sent

void kiv_led_send_common_reverser_msg(uint16_t dest_module_id, int value)
{
    svc_msg message = {};

    message.us_cmd = MSG_CMD_SERVICE_NOTIFY;
    message.us_dest_module_id = dest_module_id;
    message.us_source_module_id = KIV_MODULE_LED;
    message.ul_event_mask = REVERSER_EVENT;
    message.us_data_len = sizeof message.ul_event_mask + REVERSER_TEXT_LENGTH;
    std::to_chars(message.p_data, message.p_data + sizeof message.p_data - 1, value);

    if (kiv_msg_send(&message, message.us_data_len) == 0) {
        LED_INFO("%s: send common reverser success.\n", __func__);
    } else {
        LED_INFO("%s: send common reverser fail.\n", __func__);
    }
}
