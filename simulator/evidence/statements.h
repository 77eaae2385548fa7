// What happened to the daemon, as the statements of a scenario.
#pragma once

#include "seen/trace.h"

// The message that a kiv_recv_msg entry handed over, byte for byte. None when the call failed or says no bytes.
std::optional<std::string> received_message(const trace_entry &entry);

// The statement that sends these bytes: start record, register, notify, command or raw.
std::string message_statement(const std::string &bytes);

// For a person, and as message_statement where that is plain enough: a kiv_recv_msg, "indication 1356" for kiv_bsp_ind.
// Empty for every other entry.
std::string stimulus_of(const trace_entry &entry);

// A request to light the LEDs again that the daemon has sent to itself.
bool is_own_relight(const trace_entry &entry);

// A word of a scenario: in quotes and with escapes where it needs them.
std::string scenario_word(const std::string &text);

std::string quoted(const std::string &text); // always

std::string printable(std::string_view text);   // without bytes that a terminal would act upon
std::string shortened(const std::string &text); // printable, to what fits on a line
