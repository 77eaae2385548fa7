// What stands in a recorded line behind its arguments, handed out again.
#include "replay.h"

#include "evidence/statements.h"
#include "language/words.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>

namespace
{
constexpr const char *RESULT_MARK = ") = ";

// The first text in quotes. None when the line hands out none.
std::optional<std::string> told_text(const answer &told)
{
    const std::vector<std::string> texts = quoted_texts(told.rest);
    return texts.empty() ? std::nullopt : std::optional(texts[0]);
}
} // namespace

answer parse_answer(const std::string &tail)
{
    if (!tail.starts_with(RESULT_MARK)) {
        return {0, ""};
    }
    char *rest = nullptr;
    const long long result = strtoll(tail.c_str() + strlen(RESULT_MARK), &rest, 10);
    return {result, rest};
}

void put_handle(const answer &told, int *handle)
{
    if (handle && told.rest[0] == ',') {
        *handle = atoi(told.rest + 1);
    }
}

void put_message(const answer &told, void *buffer, int size)
{
    trace_entry entry;
    entry.result = std::to_string(told.result) + told.rest;
    const std::optional<std::string> bytes = received_message(entry);
    if (bytes && size > 0) {
        memcpy(buffer, bytes->data(), std::min(bytes->size(), static_cast<size_t>(size)));
    }
}

void put_text(const answer &told, void *buffer, int size)
{
    const std::optional<std::string> text = told_text(told);
    if (text && size > 0) {
        memcpy(buffer, text->c_str(), std::min(text->size() + 1, static_cast<size_t>(size)));
    }
}

void put_bytes(const answer &told, void *buffer, size_t size)
{
    const std::optional<std::string> text = told_text(told);
    if (text) {
        memcpy(buffer, text->data(), std::min(text->size(), size));
    }
}

void put_item(const answer &told, int item, void *buffer, int size)
{
    if (item != KIV_CFG_9X15_LED_ID) {
        put_text(told, buffer, size);
    } else if (told.rest[0] == ',') {
        *static_cast<uint8_t *>(buffer) = static_cast<uint8_t>(atoi(told.rest + 1));
    }
}

void put_query(const answer &told, bsp_query_result *result)
{
    bsp_query_result answered = {};
    if (result && sscanf(told.rest, ", %d %d", &answered.ret, &answered.data) == 2) {
        *result = answered;
    }
}

void put_temperature(const answer &told, bsp_sensor_temp *temp)
{
    if (temp && told.rest[0] == ',') {
        *temp = {0, atoi(told.rest + 1)};
    }
}
