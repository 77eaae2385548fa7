#include "trace/calls.h"

#include "kiv/cfg.h"
#include "trace/board_names.h"
#include "trace/program.h"
#include "trace/tr181_parameters.h"

#include <algorithm>
#include <cstring>

enum { HEADER_SIZE = offsetof(svc_msg, ul_event_mask), DATA_MAX = KIV_SVC_MSG_SIZE - HEADER_SIZE };

void trace_int(trace_line &line, int argument)
{
    trace_add(line, "%d", argument);
}

void trace_ints(trace_line &line, int first, int second)
{
    trace_add(line, "%d, %d", first, second);
}

void trace_text_result(trace_line &line, int result, const char *text)
{
    trace_result(line, result);
    if (result == 0) {
        trace_add(line, ", ");
        trace_text(line, text);
    }
}

void trace_log(trace_line &line, int level, const char *file, int at_line, int log_id, const char *text)
{
    trace_add(line, "%d, ", level);
    trace_text(line, file);
    trace_add(line, ", %d, %d, ", at_line, log_id);
    trace_text_of(line, text, TRACE_LOG_MAX);
}

static bool is_daemon_record(const unsigned char *data, size_t size, daemon_record *record)
{
    if (size != sizeof *record) {
        return false;
    }
    memcpy(record, data, sizeof *record);
    return record->record_type == DAEMON_RECORD_HELLO || record->record_type == DAEMON_RECORD_START ||
           record->record_type == DAEMON_RECORD_REG_COMPLETE;
}

static bool are_zero(const unsigned char *data, size_t from, size_t size)
{
    return std::all_of(data + std::min(from, size), data + size, [](unsigned char byte) { return byte == 0; });
}

// Whether the message's words carry a record whole: behind each text there is nothing but padding.
static bool tells_record(const daemon_record &record)
{
    daemon_record told = {};
    told.record_type = record.record_type;
    memcpy(told.process_name, record.process_name, strnlen(record.process_name, sizeof told.process_name));
    memcpy(told.queue_name, record.queue_name, strnlen(record.queue_name, sizeof told.queue_name));
    return memcmp(&told, &record, sizeof told) == 0;
}

// The same of a message: zeros where nothing is told.
static bool tells_message(const unsigned char *data, size_t size)
{
    svc_msg message = {};
    size_t told = 0;
    memcpy(&message, data, std::min(size, sizeof message));
    if (size >= HEADER_SIZE && message.us_reserved1 == 0 && message.us_reserved2 == 0) {
        told = HEADER_SIZE;
    }
    if (told > 0 && message.us_cmd == MSG_CMD_SERVICE_REG && size >= HEADER_SIZE + sizeof(reg_masks)) {
        told = HEADER_SIZE + sizeof(reg_masks);
    } else if (told > 0 && size >= offsetof(svc_msg, p_data)) {
        told = offsetof(svc_msg, p_data);
        told += strnlen(message.p_data, size - told);
    }
    return are_zero(data, told, size);
}

// The bytes themselves, where the words before them do not carry all.
static void trace_raw(trace_line &line, const unsigned char *data, size_t size, bool told)
{
    if (told) {
        return;
    }
    trace_add(line, size < HEADER_SIZE ? ", raw " : " raw ");
    for (size_t at = 0; at < size; at++) {
        trace_add(line, "%02x", data[at]);
    }
}

// ", record ..." or ", cmd ...", and the bytes when that is not all
static void trace_message(trace_line &line, const unsigned char *data, size_t size)
{
    daemon_record record;
    if (is_daemon_record(data, size, &record)) {
        trace_add(line, ", record %d ", record.record_type);
        trace_text_of(line, record.process_name, sizeof record.process_name);
        trace_add(line, " ");
        trace_text_of(line, record.queue_name, sizeof record.queue_name);
        trace_raw(line, data, size, tells_record(record));
        return;
    }
    uint16_t head[6];
    uint32_t masks[4] = {};
    if (size < sizeof head) {
        trace_raw(line, data, size, are_zero(data, 0, size));
        return;
    }
    memcpy(head, data, sizeof head);
    trace_add(line, ", cmd %u dest %u source %u len %u", head[0], head[2], head[3], head[4]);
    if (head[0] == MSG_CMD_SERVICE_REG && size >= sizeof head + sizeof masks) {
        memcpy(masks, data + sizeof head, sizeof masks);
        trace_add(line, " masks 0x%x 0x%x 0x%x 0x%x", masks[0], masks[1], masks[2], masks[3]);
    } else if (size >= sizeof head + sizeof masks[0]) {
        memcpy(masks, data + sizeof head, sizeof masks[0]);
        trace_add(line, " event 0x%x ", masks[0]);
        const size_t text_at = sizeof head + sizeof masks[0];
        trace_text_of(line, reinterpret_cast<const char *>(data + text_at), size - text_at);
    }
    trace_raw(line, data, size, tells_message(data, size));
}

static void trace_program(trace_line &line)
{
    char name[64];
    char version[64];
    find_program(name, sizeof name, version, sizeof version);
    trace_add(line, "%d, ", TRACE_FORMAT);
    trace_text(line, name);
    trace_add(line, ", ");
    trace_text(line, version);
}

void trace_start(trace_line &line)
{
    trace_program(line);
    trace_close(line);
}

void trace_goes_on(trace_line &line, const char *product)
{
    trace_program(line);
    trace_add(line, ", ");
    trace_text(line, product);
    trace_close(line);
}

void trace_number_result(trace_line &line, long long result)
{
    line.limit = sizeof line.text;
    trace_add(line, ") = %lld", result);
}

void trace_bytes_result(trace_line &line, int result, const void *buffer)
{
    trace_result(line, result);
    if (result > 0) {
        trace_add(line, ", ");
        trace_text_of(line, static_cast<const char *>(buffer), static_cast<size_t>(result));
    }
}

void trace_init_msg(trace_line &line, const char *queue_name)
{
    trace_text(line, queue_name);
}

void trace_init_msg_result(trace_line &line, int result, const int *handle)
{
    trace_result(line, result);
    if (result >= 0) {
        trace_add(line, ", %d", *handle);
    }
}

void trace_send_msg(trace_line &line, const char *queue_name, int length)
{
    trace_text(line, queue_name);
    trace_add(line, ", %d", length);
}

void trace_send_msg_result(trace_line &line, int result, const void *data, int length)
{
    trace_result(line, result);
    if (result == 0) {
        trace_message(line, static_cast<const unsigned char *>(data), static_cast<size_t>(length));
    }
}

void trace_recv_msg(trace_line &line, int handle, int size)
{
    trace_ints(line, handle, size);
}

void trace_recv_msg_result(trace_line &line, int result, const void *buffer)
{
    trace_result(line, result);
    if (result > 0) {
        trace_message(line, static_cast<const unsigned char *>(buffer), static_cast<size_t>(result));
    }
}

void trace_msg_send(trace_line &line, const svc_msg *message, int data_len)
{
    if (message == nullptr) {
        trace_add(line, "null, %d", data_len);
        return;
    }
    const size_t event_size = sizeof message->ul_event_mask;
    const auto data = static_cast<size_t>(std::clamp<int>(data_len, 0, DATA_MAX));
    trace_add(line, "dest %u cmd %u source %u len %u", message->us_dest_module_id, message->us_cmd,
              message->us_source_module_id, message->us_data_len);
    if (data >= event_size) {
        trace_add(line, " event 0x%x ", message->ul_event_mask);
        trace_text_of(line, message->p_data, data - event_size);
    }
    trace_add(line, ", %d", data_len);
}

void trace_reg_proc(trace_line &line, int source_module_id, const uint32_t *masks)
{
    trace_add(line, "%d, ", source_module_id);
    if (masks == nullptr) {
        trace_add(line, "null");
    } else {
        trace_add(line, "0x%x 0x%x 0x%x 0x%x", masks[0], masks[1], masks[2], masks[3]);
    }
}

void trace_reg_func(trace_line &line, int source_module_id, int dest_module_id, const reg_masks *masks)
{
    uint32_t words[4] = {};
    if (masks != nullptr) {
        memcpy(words, masks, sizeof words);
    }
    trace_add(line, "%d, ", source_module_id);
    trace_reg_proc(line, dest_module_id, masks != nullptr ? words : nullptr);
}

void trace_nv_read(trace_line &line, const char *key, int size)
{
    trace_text(line, key);
    trace_add(line, ", %d", size);
}

void trace_nv_write(trace_line &line, const char *key, const char *value, int length)
{
    trace_text(line, key);
    trace_add(line, ", ");
    trace_text_of(line, value, length > 0 ? static_cast<size_t>(length) : 0);
    trace_add(line, ", %d", length);
}

void trace_cfg_get(trace_line &line, int item, int size)
{
    trace_ints(line, item, size);
}

// Everything but -1 is success.
void trace_cfg_get_result(trace_line &line, int result, int item, const void *buffer, int size)
{
    trace_result(line, result);
    if (result == -1) {
        return;
    }
    trace_add(line, ", ");
    if (item == KIV_CFG_9X15_LED_ID) {
        trace_int(line, *static_cast<const uint8_t *>(buffer));
    } else {
        trace_text_of(line, static_cast<const char *>(buffer), static_cast<size_t>(size));
    }
}

void trace_led_request(trace_line &line, const led_request &request)
{
    const char *name = find_led_name(request.led_id);
    if (name != nullptr) {
        trace_add(line, "%s", name);
    } else {
        trace_add(line, "%d", request.led_id);
    }
    switch (request.led_operation) {
    case LED_OP_ON:
        trace_add(line, " on %d", request.brightness);
        break;
    case LED_OP_OFF:
        trace_add(line, " off %d", request.brightness);
        break;
    case LED_OP_BLINK:
        trace_add(line, " blink %d", request.brightness);
        break;
    default:
        trace_add(line, " operation %d %d", request.led_operation, request.brightness);
        break;
    }
    if (request.led_operation == LED_OP_BLINK || request.blink_time1 != 0 || request.blink_time2 != 0) {
        trace_add(line, " %d/%d", request.blink_time1, request.blink_time2);
    }
}

void trace_query_result(trace_line &line, int result, const bsp_query_result *answer)
{
    trace_result(line, result);
    if (result == 0) {
        trace_add(line, ", %d %d", answer->ret, answer->data);
    }
}

void trace_sensor_result(trace_line &line, int result, const bsp_sensor_temp *temp)
{
    trace_result(line, result);
    if (result == 0) {
        trace_add(line, ", %d", temp->temperature);
    }
}

void trace_indication(trace_line &line, int event_id, bool has_record)
{
    trace_add(line, "%d%s", event_id, has_record ? "" : ", null");
    trace_close(line);
}

void trace_timer(trace_line &line, int period_ms, int repeat)
{
    trace_add(line, "%d, %s", period_ms, repeat != 0 ? "repeat" : "once");
}

void trace_timer_fire(trace_line &line, int handle)
{
    trace_int(line, handle);
    trace_close(line);
}

static void trace_record(trace_line &line, int table_id, const char *record)
{
    trace_text_of(line, record + KIV_TR181_PATH, KIV_TR181_PATH_SIZE);
    for (const tr181_parameter &parameter : tr181_parameters) {
        if (parameter.table_id != table_id || !tr181_is_set(record, parameter)) {
            continue;
        }
        trace_add(line, " %s ", parameter.name);
        if (parameter.size == 0) {
            trace_int(line, tr181_int(record, parameter.value_at));
        } else {
            trace_text_of(line, record + parameter.value_at, parameter.size);
        }
    }
}

void trace_set_tbl(trace_line &line, int table_id, const void *record, int arg3, int arg4)
{
    trace_add(line, "%d, ", table_id);
    if (record == nullptr) {
        trace_add(line, "null");
    } else {
        trace_record(line, table_id, static_cast<const char *>(record));
    }
    trace_add(line, ", ");
    trace_ints(line, arg3, arg4);
}
