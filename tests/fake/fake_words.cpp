#include "fake_words.h"

#include "kiv/tr181.h"
#include "platform/trace/board_names.h"

#include <algorithm>
#include <cstdio>
#include <cstring>

constexpr size_t LONG_RUN = 20; // from here on a run of one character is shown as x{20}

std::string quoted(std::string_view text)
{
    std::string shown = "\"";
    for (size_t i = 0; i < text.size();) {
        const size_t end = std::min(text.find_first_not_of(text[i], i), text.size());
        const unsigned char c = static_cast<unsigned char>(text[i]);
        char one[8];
        std::snprintf(one, sizeof one, c == '\n' ? "\\n" : c < ' ' || c > '~' ? "\\x%02x" : "%c", c);
        if (end - i >= LONG_RUN) {
            shown += one + ("{" + std::to_string(end - i) + "}");
            i = end;
        } else {
            shown += one;
            ++i;
        }
    }
    return shown + "\"";
}

std::string word_of_module(int module)
{
    const auto found = std::ranges::find(module_rows, module, &module_row::module_id);
    return found == module_rows.end() ? std::to_string(module) : found->name;
}

// The bytes that are not zero, by offset: whatever else a message should hold shows up here.
std::string words_of_bytes(const void *data, size_t size)
{
    const char *bytes = static_cast<const char *>(data);
    std::string shown;
    for (size_t i = 0; i < size; ++i) {
        if (bytes[i] == 0) {
            continue;
        }
        const std::string_view run(bytes + i, strnlen(bytes + i, size - i));
        shown += " " + std::to_string(i) + ":" + quoted(run);
        i += run.size();
    }
    return shown;
}

std::string words_of(const led_request &request)
{
    static constexpr std::array<const char *, 3> operations = {"on", "off", "blink"};
    const char *name = find_led_name(request.led_id);
    const size_t operation = static_cast<size_t>(request.led_operation);
    std::string words = name == nullptr ? std::to_string(request.led_id) : name;

    words += std::string(" ") + operations.at(operation);
    const bool blinks = request.blink_time1 != 0 || request.blink_time2 != 0;
    if (blinks) {
        words += " " + std::to_string(request.blink_time1) + "/" + std::to_string(request.blink_time2);
    }
    if (operation != LED_OP_OFF || request.brightness != 0) {
        words += " " + std::to_string(request.brightness);
    }
    return words;
}

std::string words_of_message(const svc_msg &message)
{
    const std::string_view text(message.p_data, strnlen(message.p_data, sizeof message.p_data));
    svc_msg rest = message;
    rest.us_dest_module_id = 0;
    rest.us_source_module_id = 0;
    rest.us_cmd = 0;
    rest.us_data_len = 0;
    rest.ul_event_mask = 0;
    std::memset(rest.p_data, 0, text.size());

    char header[80];
    std::snprintf(header, sizeof header, " cmd %d source %d len %d event 0x%x ", message.us_cmd,
                  message.us_source_module_id, message.us_data_len, message.ul_event_mask);
    return word_of_module(message.us_dest_module_id) + header + quoted(text) + words_of_bytes(&rest, sizeof rest);
}

// A field's bytes taken out of a record: what stays is not to be there.
static std::string take_text(std::string &bytes, size_t at, size_t size)
{
    const size_t length = strnlen(bytes.data() + at, size);
    const std::string text = quoted(std::string_view(bytes).substr(at, length));

    std::memset(bytes.data() + at, 0, length);
    return text;
}

static int take_number(std::string &bytes, size_t at)
{
    int32_t number = 0;

    std::memcpy(&number, bytes.data() + at, sizeof number);
    std::memset(bytes.data() + at, 0, sizeof number);
    return number;
}

// A parameter whose flag is set.
static std::string take_parameter(std::string &bytes, size_t flag_at, size_t at, bool is_number)
{
    uint16_t flag = 0;

    std::memcpy(&flag, bytes.data() + flag_at, sizeof flag);
    if (flag != 1) {
        return "";
    }
    std::memset(bytes.data() + flag_at, 0, sizeof flag);
    return " " + (is_number ? std::to_string(take_number(bytes, at)) : take_text(bytes, at, KIV_TR181_PATH_SIZE));
}

std::string words_of_tr181(int table_id, const void *record)
{
    std::string bytes(static_cast<const char *>(record), KIV_TR181_RECORD_SIZE);
    std::string words = take_text(bytes, KIV_TR181_PATH, KIV_TR181_PATH_SIZE);

    words += " instance " + std::to_string(take_number(bytes, KIV_TR181_INSTANCE)) + ":";
    words += take_parameter(bytes, KIV_TR181_PARAM1_FLAG, KIV_TR181_PARAM1, table_id == KIV_TR181_TBL_LEDS);
    words += take_parameter(bytes, KIV_TR181_PARAM2_FLAG, KIV_TR181_PARAM2, false);
    words += take_parameter(bytes, KIV_TR181_PARAM3_FLAG, KIV_TR181_PARAM3, false);
    return words + words_of_bytes(bytes.data(), bytes.size());
}
