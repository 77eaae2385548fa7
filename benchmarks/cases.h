// The notifications that are measured, per product, and the state in which each one is handled in full.
#pragma once

#include "core/channel.h"
#include "core/dispatch.h"
#include "ground/led_ctx.h"

#include <array>
#include <cstddef>
#include <cstdint>
#include <span>

struct bench_case {
    const char *name;
    led_product product;
    uint16_t module;
    uint32_t event;
    const char *payload = "";
    const char *payload2 = nullptr; // sent in turn with payload; nullptr: the same again
    led_word *word = nullptr;       // set before each message, so that it is news every time
    int value = 0;
    uint16_t cmd = MSG_CMD_SERVICE_NOTIFY;
};

using case_messages = std::array<received_message, 2>;

std::span<const bench_case> bench_cases();

// A device of the case's product, on and awake, that has heard the case's messages a few times.
void settle(const bench_case &which, case_messages &messages);

inline void hear(const bench_case &which, const received_message &received)
{
    if (which.word != nullptr) {
        *which.word = which.value;
    }
    messageParse(&received.message);
}
