#include "language/messages.h"

#include "kiv/socket.h"

#include <cstring>

std::string message_bytes(const message_fields &fields, std::string_view text)
{
    svc_msg head = {};
    head.us_cmd = fields.cmd;
    head.us_dest_module_id = fields.dest;
    head.us_source_module_id = fields.source;
    head.us_data_len = fields.len;
    head.ul_event_mask = fields.event;
    std::string bytes(reinterpret_cast<const char *>(&head), offsetof(svc_msg, p_data));
    return bytes.append(text);
}

std::string notification(int module_id, uint32_t event, std::string_view text)
{
    std::string payload(text);
    if (!payload.empty()) {
        payload += '\0';
    }
    const message_fields fields = {
        .cmd = MSG_CMD_SERVICE_NOTIFY,
        .dest = KIV_MODULE_LED,
        .source = static_cast<uint16_t>(module_id),
        .len = static_cast<uint16_t>(sizeof(uint32_t) + payload.size()),
        .event = event,
    };
    return message_bytes(fields, payload);
}

std::string command(int cmd)
{
    const message_fields fields = {
        .cmd = static_cast<uint16_t>(cmd),
        .dest = KIV_MODULE_LED,
        .source = KIV_MODULE_MAIN,
        .len = sizeof(uint32_t),
        .event = 0,
    };
    return message_bytes(fields, {});
}

std::string registration(int module_id, const uint32_t masks[4])
{
    const message_fields fields = {
        .cmd = MSG_CMD_SERVICE_REG,
        .dest = KIV_MODULE_LED,
        .source = static_cast<uint16_t>(module_id),
        .len = 4 * sizeof(uint32_t),
        .event = masks[0],
    };
    return message_bytes(fields, {reinterpret_cast<const char *>(masks + 1), 3 * sizeof(uint32_t)});
}

std::string start_record()
{
    daemon_record record = {};
    record.record_type = DAEMON_RECORD_START;
    return {reinterpret_cast<const char *>(&record), sizeof record};
}
