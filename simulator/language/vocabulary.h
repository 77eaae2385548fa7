// What the daemon makes of the texts that reach it: what is worth sending it, and what is probably a slip of the pen.
#pragma once

#include <cstdint>
#include <span>
#include <string>
#include <string_view>

struct nv_word {
    std::string_view key;
    std::string_view meaning;
};

struct network_word {
    std::string_view name; // a value of NV "network_type"; any other is no service
    std::string_view shown_as;
};

struct text_word {
    int module_id;
    uint32_t event;
    std::string_view meaning; // of the notification's text; of an event without a row nobody reads the text
    std::string_view only;    // the texts that mean something, between bars; empty when any number does
};

constexpr int INDICATION_FIRST = 1350;
constexpr int INDICATION_LAST = 1357;

std::span<const nv_word> nv_words(); // every key that the daemon reads or writes
std::span<const network_word> network_words();
std::span<const std::string_view> log_sources();
const text_word *find_text_word(int module_id, uint32_t event);
std::string_view indication_meaning(int id); // empty when the daemon does nothing with it

// Whether the text says something to the daemon that hears the event.
bool has_meaning(int module_id, uint32_t event, std::string_view text);
