#include "evidence/statements.h"

#include "kiv/socket.h"
#include "language/messages.h"
#include "language/names.h"
#include "language/words.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstring>

namespace
{
constexpr size_t SHORT_ENOUGH = 100;
constexpr std::string_view PLAIN = "abcdefghijklmnopqrstuvwxyzABCDEFGHIJKLMNOPQRSTUVWXYZ0123456789_-.,:/%+*";

std::string hex(const std::string &bytes)
{
    std::string text;
    for (const char byte : bytes) {
        std::array<char, 3> digits;
        snprintf(digits.data(), digits.size(), "%02x", static_cast<unsigned char>(byte));
        text += digits.data();
    }
    return text;
}

std::optional<std::string> from_hex(std::string_view digits)
{
    std::string bytes;
    for (size_t at = 0; at + 1 < digits.size(); at += 2) {
        const auto byte = parse_number("0x" + std::string(digits.substr(at, 2)), 0, 0xff);
        if (!byte) {
            return std::nullopt;
        }
        bytes += static_cast<char>(*byte);
    }
    return bytes;
}

std::string sized(std::string bytes, size_t size)
{
    bytes.resize(size);
    return bytes;
}

std::string record_bytes(int type, const std::vector<std::string> &texts)
{
    daemon_record record = {};
    record.record_type = type;
    memcpy(record.process_name, texts[0].data(), std::min(texts[0].size(), sizeof record.process_name));
    memcpy(record.queue_name, texts[1].data(), std::min(texts[1].size(), sizeof record.queue_name));
    return {reinterpret_cast<const char *>(&record), sizeof record};
}

// What stands behind the size in the result, as far as words and texts can carry a message.
std::string told_bytes(const std::string &told)
{
    const std::vector<std::string> texts = quoted_texts(told);
    unsigned cmd = 0, dest = 0, source = 0, len = 0;
    uint32_t masks[4] = {};
    int type = 0;
    if (sscanf(told.c_str(), ", record %d", &type) == 1 && texts.size() >= 2) {
        return record_bytes(type, texts);
    }
    if (sscanf(told.c_str(), ", cmd %u dest %u source %u len %u", &cmd, &dest, &source, &len) != 4) {
        return {};
    }
    std::string text = texts.empty() ? std::string() : texts[0];
    if (const size_t at = told.find(" masks "); at != std::string::npos) {
        sscanf(told.c_str() + at, " masks %x %x %x %x", masks, masks + 1, masks + 2, masks + 3);
        text.assign(reinterpret_cast<const char *>(masks + 1), 3 * sizeof masks[0]);
    } else if (const size_t event = told.find(" event "); event != std::string::npos) {
        sscanf(told.c_str() + event, " event %x", masks);
    }
    return message_bytes({static_cast<uint16_t>(cmd), static_cast<uint16_t>(dest), static_cast<uint16_t>(source),
                          static_cast<uint16_t>(len), masks[0]},
                         text);
}

struct message_head {
    uint16_t cmd;
    uint16_t source;
    uint32_t event;
    uint32_t masks[4];
};

message_head head_of(const std::string &bytes)
{
    svc_msg message = {};
    message_head head = {};
    memcpy(&message, bytes.data(), std::min(bytes.size(), sizeof message));
    head.cmd = message.us_cmd;
    head.source = message.us_source_module_id;
    head.event = message.ul_event_mask;
    memcpy(head.masks, &message.ul_event_mask, sizeof head.masks);
    return head;
}

std::string module_word(int id)
{
    for (const module_row &row : module_rows) {
        if (row.module_id == id && find_module(row.name)) {
            return row.name;
        }
    }
    return std::to_string(id);
}

std::string hex_number(uint32_t number)
{
    std::array<char, 16> text;
    snprintf(text.data(), text.size(), "0x%x", number);
    return text.data();
}

std::string text_word(const std::string &text)
{
    return text.empty() ? "" : " " + scenario_word(text);
}

std::string text_of(const std::string &bytes)
{
    const size_t text_at = offsetof(svc_msg, p_data);
    return bytes.size() > text_at ? bytes.c_str() + text_at : "";
}

// Empty for an event that the language cannot say.
std::string notify_statement(const message_head &head, const std::string &text)
{
    const std::string name = event_word(head.source, head.event);
    if (name.empty() && only_event(head.source)) {
        return {};
    }
    const bool only = only_event(head.source) && !text.empty() && !find_event(head.source, text);
    const std::string event = only ? "" : " " + (name.empty() ? hex_number(head.event) : name);
    return "notify " + module_word(head.source) + event + text_word(text);
}

// A notification that was not sent as a well-behaved module does it, but says the same.
std::string notify_words(const std::string &bytes)
{
    const message_head head = head_of(bytes);
    const bool whole = bytes.size() >= offsetof(svc_msg, p_data);
    const std::string words = notify_statement(head, text_of(bytes));
    return whole && head.cmd == MSG_CMD_SERVICE_NOTIFY && !words.empty() ? words + " (in other bytes)" : "";
}

std::string command_word(int cmd)
{
    const std::string_view name = command_name_of(cmd);
    return name.empty() ? std::to_string(cmd) : std::string(name);
}

std::string register_statement(const message_head &head)
{
    std::string text = "register " + module_word(head.source);
    for (const uint32_t mask : head.masks) {
        text += " " + hex_number(mask);
    }
    return text;
}
} // namespace

std::string scenario_word(const std::string &text)
{
    const bool plain = !text.empty() && text.find_first_not_of(PLAIN) == std::string::npos;
    return plain ? text : quoted(text);
}

std::string quoted(const std::string &text)
{
    std::string words = "\"";
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        const bool printable = byte >= 0x20 && byte < 0x7f && c != '"' && c != '\\';
        words += printable ? std::string(1, c) : "\\x" + hex(std::string(1, c));
    }
    return words + "\"";
}

std::string printable(std::string_view text)
{
    std::string shown(text);
    std::replace_if(
        shown.begin(), shown.end(), [](unsigned char c) { return c < 0x20 || c == 0x7f; }, '?');
    return shown;
}

std::string shortened(const std::string &text)
{
    const std::string shown = printable(text);
    return shown.size() <= SHORT_ENOUGH ? shown : shown.substr(0, SHORT_ENOUGH) + " ...";
}

std::optional<std::string> received_message(const trace_entry &entry)
{
    const auto size = parse_number(entry.result.substr(0, entry.result.find(',')), 0, KIV_SVC_MSG_SIZE);
    if (!size) {
        return std::nullopt;
    }
    const std::string told = entry.result.substr(std::min(entry.result.find(','), entry.result.size()));
    if (const size_t raw = told.rfind(" raw "); raw != std::string::npos && told.find('"', raw) == std::string::npos) {
        return from_hex(std::string_view(told).substr(raw + 5));
    }
    return sized(told_bytes(told), static_cast<size_t>(*size));
}

std::string message_statement(const std::string &bytes)
{
    const message_head head = head_of(bytes);
    if (bytes == start_record()) {
        return "go";
    }
    if (bytes == registration(head.source, head.masks)) {
        return register_statement(head);
    }
    if (bytes == command(head.cmd)) {
        return "command " + command_word(head.cmd);
    }
    const std::string text = text_of(bytes);
    const std::string notify =
        bytes == notification(head.source, head.event, text) ? notify_statement(head, text) : std::string();
    return notify.empty() ? "raw " + hex(bytes) : notify;
}

bool is_own_relight(const trace_entry &entry)
{
    return entry.call == "kiv_recv_msg" && entry.result == "12, cmd 6934 dest 38 source 38 len 0";
}

std::string stimulus_of(const trace_entry &entry)
{
    if (entry.call == "kiv_bsp_ind") {
        const bool null = entry.arguments.ends_with(", null");
        return "indication " + entry.arguments.substr(0, entry.arguments.find(',')) + (null ? " null" : "");
    }
    if (entry.call != "kiv_recv_msg") {
        return {};
    }
    const std::optional<std::string> bytes = received_message(entry);
    const std::string statement = bytes ? message_statement(*bytes) : std::string();
    const std::string words = statement.starts_with("raw ") ? notify_words(*bytes) : std::string();
    return words.empty() ? statement : words;
}
