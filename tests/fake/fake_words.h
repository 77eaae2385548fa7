// How the fake writes calls down: in the words of scenarios and traces.
#pragma once

#include "kiv/adabsp.h"
#include "kiv/socket.h"

#include <string>
#include <string_view>

// In double quotes, with C escapes; a run of 20 or more of one character as x{20}.
std::string quoted(std::string_view text);

std::string word_of_module(int module);

// The runs of bytes that are not zero, by offset: whatever else a record should hold shows up here.
std::string words_of_bytes(const void *data, size_t size);

// All five fields: what is not shown is 0.
std::string words_of(const led_request &request);

// Every byte: what is not shown is 0.
std::string words_of_message(const svc_msg &message);
std::string words_of_tr181(int table_id, const void *record);
