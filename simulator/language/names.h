// The words that a scenario and the trace use for LEDs, modules, events, commands and products.
#pragma once

#include "trace/board_names.h"

#include <cstdint>
#include <optional>
#include <span>
#include <string>
#include <string_view>

struct event_name {
    int module_id;
    std::string_view full_name;
    uint32_t value;
};

struct command_name {
    std::string_view name;
    int value;
};

// Products as a set.
namespace product_set
{
constexpr unsigned UFI = 1;
constexpr unsigned DATA_CARD = 2;
constexpr unsigned PAPER_KITE = 4;
constexpr unsigned MODULE = 8;
constexpr unsigned UNI_CORE_CPE = 16;
constexpr unsigned EVERY_PRODUCT = 31;
} // namespace product_set

struct product_name {
    std::string_view name;
    std::string_view cfg_text; // configuration item 6000
    unsigned mask;             // its bit in a product_set
};

std::span<const product_name> all_products();
std::span<const event_name> all_events();
std::span<const command_name> all_commands();

std::string_view led_name(int led_id); // empty for an id that no LED has
std::optional<int> find_led(std::string_view name);
std::string led_names();

const module_row *find_module(std::string_view name); // none for the daemon itself
std::string module_names();

// By the constant's full name or by any tail of it that begins a word, such as NEW_SMS or SMS_NEW_SMS.
std::optional<uint32_t> find_event(int module_id, std::string_view name);
// The event of a module that has just one.
std::optional<uint32_t> only_event(int module_id);
std::string event_names(int module_id);
// The shortest name of an event, such as NEW_SMS. Empty for a value that has none.
std::string event_word(int module_id, uint32_t value);

std::optional<int> find_command(std::string_view name);
std::string command_names();
std::string_view command_name_of(int command); // empty for a command without a name

// The platform calls that a scenario can make fail.
bool is_platform_call(std::string_view name);
std::string nearest_platform_call(std::string_view name);

// The one of them that takes the fewest letters put in, taken out or changed.
std::string nearest(std::string_view name, std::span<const std::string_view> known);

const product_name *find_product(std::string_view name);
std::string product_names();
