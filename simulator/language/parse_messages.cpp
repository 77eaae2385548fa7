#include "kiv/socket.h"
#include "language/messages.h"
#include "language/names.h"
#include "language/parser.h"

#include <array>

namespace
{
constexpr size_t MAX_RAW_BYTES = 4096;

bool take_module(statement_words &in, int &module_id)
{
    std::string name;
    if (!take_text(in, "a module", name)) {
        return false;
    }
    if (const module_row *module = find_module(name)) {
        module_id = module->module_id;
        return true;
    }
    const std::optional<int64_t> number = parse_number(name, 0, 0xffff);
    if (!number) {
        return fail(in, "unknown module '" + name + "'; modules are " + module_names() + " or a number to 65535");
    }
    module_id = static_cast<int>(*number);
    return true;
}

// A module with a single event needs no event word: notify SLEEP 1 carries the text 1.
bool take_event(statement_words &in, int module_id, uint32_t &event)
{
    const std::optional<uint32_t> only = only_event(module_id);
    const word *next = in.next < in.words.size() ? &in.words[in.next] : nullptr;
    const std::optional<uint32_t> named = next && !next->quoted ? find_event(module_id, next->text) : std::nullopt;
    if (only && !named) {
        event = *only;
        return true;
    }
    std::string name;
    if (!take_text(in, "an event", name)) {
        return false;
    }
    const std::optional<int64_t> number = parse_number(name, 0, 0xffffffff);
    if (!named && !number) {
        return fail(in, "unknown event '" + name + "'; events of this module are " + event_names(module_id) +
                            " or a number to 0xffffffff");
    }
    event = named ? *named : static_cast<uint32_t>(*number);
    return true;
}

bool parse_raw_length(statement_words &in, statement &out)
{
    int64_t length = 0;
    int64_t fill = 0;
    if (!take_number(in, "a length", 1, MAX_RAW_BYTES, length)) {
        return false;
    }
    if (!take_keyword(in, "fill")) {
        return fail(in, "raw length N fill BYTE");
    }
    if (!take_number(in, "a byte", 0, 0xff, fill)) {
        return false;
    }
    out.bytes.assign(static_cast<size_t>(length), static_cast<char>(fill));
    return true;
}

struct raw_field {
    std::string_view name;
    int64_t most;
    int64_t *value;
};

bool parse_raw_fields(statement_words &in, statement &out)
{
    int64_t cmd = 0, dest = 0, source = 0, event = 0, len = 0, times = 1, cut = -1;
    const std::array fields = {
        raw_field{"cmd",    0xffff,        &cmd   },
        raw_field{"dest",   0xffff,        &dest  },
        raw_field{"source", 0xffff,        &source},
        raw_field{"event",  0xffffffff,    &event },
        raw_field{"len",    0xffff,        &len   },
        raw_field{"times",  MAX_RAW_BYTES, &times },
        raw_field{"cut",    MAX_RAW_BYTES, &cut   }
    };
    std::string piece;
    std::string payload;
    while (const word *pair = take(in)) {
        std::string key;
        std::string value;
        if (!split_pair(in, *pair, key, value)) {
            return false;
        }
        if (key == "text") {
            piece = value;
            continue;
        }
        bool known = false;
        for (const raw_field &field : fields) {
            if (field.name != key) {
                continue;
            }
            const std::optional<int64_t> number = parse_number(value, 0, field.most);
            if (!number) {
                return fail(in, key + " takes a number to " + std::to_string(field.most));
            }
            *field.value = *number;
            known = true;
        }
        if (!known) {
            return fail(in,
                        "unknown field '" + key + "'; fields are cmd, dest, source, event, len, text, times and cut");
        }
    }
    for (; times > 0 && payload.size() <= MAX_RAW_BYTES; times--) {
        payload += piece;
    }
    out.bytes = message_bytes({static_cast<uint16_t>(cmd), static_cast<uint16_t>(dest), static_cast<uint16_t>(source),
                               static_cast<uint16_t>(len), static_cast<uint32_t>(event)},
                              payload);
    if (cut >= 0 && static_cast<size_t>(cut) < out.bytes.size()) {
        out.bytes.resize(static_cast<size_t>(cut));
    }
    return true;
}

bool parse_raw_hex(statement_words &in, statement &out)
{
    while (const word *digits = take(in)) {
        for (size_t at = 0; at < digits->text.size(); at += 2) {
            const std::string_view pair = std::string_view(digits->text).substr(at, 2);
            const std::optional<int64_t> byte =
                pair.size() == 2 ? parse_number("0x" + std::string(pair), 0, 0xff) : std::nullopt;
            if (!byte) {
                return fail(in, "'" + digits->text + "' is not bytes of two hexadecimal digits");
            }
            out.bytes += static_cast<char>(*byte);
        }
    }
    return true;
}
} // namespace

bool parse_register(statement_words &in, statement &out)
{
    int module_id = 0;
    uint32_t masks[4] = {};
    if (!take_module(in, module_id)) {
        return false;
    }
    for (uint32_t &mask : masks) {
        int64_t value = 0;
        if (!take_number(in, "a mask", 0, 0xffffffff, value)) {
            return false;
        }
        mask = static_cast<uint32_t>(value);
    }
    out.what = verb::SEND;
    out.bytes = registration(module_id, masks);
    return true;
}

bool parse_notify(statement_words &in, statement &out)
{
    int module_id = 0;
    uint32_t event = 0;
    const bool unregistered = take_keyword(in, "unregistered");
    if (!take_module(in, module_id) || !take_event(in, module_id, event)) {
        return false;
    }
    const word *text = take(in);
    if (text && text->text.size() >= KIV_SVC_MSG_TEXT_SIZE) {
        return fail(in, "the text is longer than a message holds, which is 1019 characters");
    }
    out.what = verb::SEND;
    out.module_id = unregistered ? 0 : module_id;
    out.event = event;
    out.bytes = notification(module_id, event, text ? std::string_view(text->text) : std::string_view());
    return true;
}

bool parse_command(statement_words &in, statement &out)
{
    std::string name;
    if (!take_text(in, "a command", name)) {
        return false;
    }
    const std::optional<int> named = find_command(name);
    const std::optional<int64_t> number = parse_number(name, 0, 0xffff);
    if (!named && !number) {
        return fail(in, "unknown command '" + name + "'; commands are " + command_names() + " or a number to 65535");
    }
    out.what = verb::SEND;
    out.bytes = command(named ? *named : static_cast<int>(*number));
    return true;
}

bool parse_raw(statement_words &in, statement &out)
{
    out.what = verb::SEND;
    if (at_end(in)) {
        return fail(in, "raw BYTES, raw length N fill BYTE, or raw cmd=N dest=N source=N event=N len=N "
                        "text=\"...\" times=N cut=N");
    }
    const bool fields = in.words[in.next].sign.has_value();
    const bool parsed = take_keyword(in, "length") ? parse_raw_length(in, out)
                        : fields                   ? parse_raw_fields(in, out)
                                                   : parse_raw_hex(in, out);
    if (parsed && (out.bytes.empty() || out.bytes.size() > MAX_RAW_BYTES)) {
        return fail(in, "a message has 1 to 4096 bytes");
    }
    return parsed;
}

bool parse_indication(statement_words &in, statement &out)
{
    int64_t id = 0;
    if (!take_number(in, "an indication", 0, INT32_MAX, id)) {
        return false;
    }
    out.what = verb::INDICATE;
    out.bytes = std::to_string(id);
    if (take_keyword(in, "null")) {
        out.bytes += " null";
    }
    return true;
}
