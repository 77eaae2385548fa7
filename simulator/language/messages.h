// The bytes that the other programs of the device put on the bus.
#pragma once

#include <cstdint>
#include <string>
#include <string_view>

struct message_fields {
    uint16_t cmd = 0;
    uint16_t dest = 0;
    uint16_t source = 0;
    uint16_t len = 0;
    uint32_t event = 0;
};

// A message of 16 bytes and the text; the terminator is the caller's to add.
std::string message_bytes(const message_fields &fields, std::string_view text);

// As a well-behaved module sends it: with a terminator when there is a text.
std::string notification(int module_id, uint32_t event, std::string_view text);
std::string command(int cmd);
std::string registration(int module_id, const uint32_t masks[4]);
std::string start_record();
