#include "language/parser.h"

#include "kiv/adabsp.h"
#include "kiv/socket.h"
#include "language/messages.h"
#include "language/names.h"

#include <array>
#include <chrono>

namespace
{

bool parse_product(statement_words &in, statement &out)
{
    std::string name;
    if (!take_text(in, product_names(), name)) {
        return false;
    }
    const product_name *product = find_product(name);
    if (!product) {
        return fail(in, "unknown product '" + name + "'; products are " + product_names());
    }
    out.files = {
        {"cfg/6000", std::string(product->cfg_text)}
    };
    return true;
}

bool add_pair(statement_words &in, std::string_view folder, const word &pair, statement &out)
{
    std::string key;
    std::string value;
    if (!split_pair(in, pair, key, value)) {
        return false;
    }
    if (!is_key(key)) {
        return fail(in, "'" + key + "' cannot be a key; keys are made of letters, digits, '_', '-' and '.'");
    }
    file_write &file = out.files.emplace_back();
    file.path = std::string(folder) + key;
    if (pair.quoted || value != "missing") {
        file.text = value;
    }
    return true;
}

bool parse_nv(statement_words &in, statement &out)
{
    if (at_end(in)) {
        return fail(in, "nv KEY=VALUE ..., or KEY=missing");
    }
    while (const word *pair = take(in)) {
        if (!add_pair(in, "nv/", *pair, out)) {
            return false;
        }
    }
    return true;
}

bool parse_cfg(statement_words &in, statement &out)
{
    const word *pair = take(in);
    if (!pair) {
        return fail(in, "cfg ITEM=VALUE, or cfg ITEM missing");
    }
    const std::string item = pair->sign ? pair->text.substr(0, *pair->sign) : pair->text;
    if (item != "531" && item != "6000") {
        return fail(in, "unknown configuration item '" + item + "'; items are 531 and 6000");
    }
    if (pair->sign) {
        return add_pair(in, "cfg/", *pair, out);
    }
    if (!take_keyword(in, "missing")) {
        return fail(in, "cfg ITEM=VALUE, or cfg ITEM missing");
    }
    out.files = {
        {"cfg/" + item, std::nullopt}
    };
    return true;
}

bool two_digits(std::string_view text, int most, int &value)
{
    const std::optional<int64_t> number = text.size() == 2 ? parse_number(text, 0, most) : std::nullopt;
    value = static_cast<int>(number.value_or(0));
    return number.has_value();
}

// HH:MM or HH:MM:SS as seconds of the day.
std::optional<int64_t> time_of_day(std::string_view text)
{
    int hour = 0;
    int minute = 0;
    int second = 0;
    if ((text.size() != 5 && text.size() != 8) || text[2] != ':' || !two_digits(text.substr(0, 2), 23, hour) ||
        !two_digits(text.substr(3, 2), 59, minute)) {
        return std::nullopt;
    }
    if (text.size() == 8 && (text[5] != ':' || !two_digits(text.substr(6, 2), 59, second))) {
        return std::nullopt;
    }
    return hour * 3600 + minute * 60 + second;
}

// YYYY-MM-DD as seconds since 1970.
std::optional<int64_t> date(std::string_view text)
{
    int month = 0;
    int day = 0;
    if (text.size() != 10 || text[4] != '-' || text[7] != '-') {
        return std::nullopt;
    }
    const std::optional<int64_t> year = parse_number(text.substr(0, 4), 1970, 2037);
    if (!year || !two_digits(text.substr(5, 2), 12, month) || !two_digits(text.substr(8, 2), 31, day)) {
        return std::nullopt;
    }
    const std::chrono::year_month_day ymd{std::chrono::year(static_cast<int>(*year)),
                                          std::chrono::month(static_cast<unsigned>(month)),
                                          std::chrono::day(static_cast<unsigned>(day))};
    if (!ymd.ok()) {
        return std::nullopt;
    }
    return std::chrono::sys_days(ymd).time_since_epoch().count() * int64_t{86400};
}

bool parse_jump(statement_words &in, statement &out)
{
    const word *amount = take(in);
    const std::string_view text = amount ? std::string_view(amount->text) : std::string_view();
    const std::optional<int64_t> ns = text.empty() ? std::nullopt : parse_duration(text.substr(1));
    if (!ns || (text[0] != '+' && text[0] != '-')) {
        return fail(in, "clock jump +TIME or -TIME, such as -1d");
    }
    out.what = verb::JUMP;
    out.number = text[0] == '-' ? -*ns : *ns;
    return true;
}

bool parse_clock(statement_words &in, statement &out)
{
    const std::string usage = "clock HH:MM[:SS], clock YYYY-MM-DD HH:MM[:SS] (1970 to 2037), or clock jump +TIME";
    if (take_keyword(in, "jump")) {
        return parse_jump(in, out);
    }
    const word *first = take(in);
    if (!first) {
        return fail(in, usage);
    }
    const std::optional<int64_t> day = date(first->text);
    const word *time = day ? take(in) : first;
    const std::optional<int64_t> seconds = time ? time_of_day(time->text) : std::nullopt;
    if (!seconds) {
        return fail(in, usage);
    }
    out.what = day ? verb::DATE : verb::TIME_OF_DAY;
    out.number = day.value_or(0) + *seconds;
    return true;
}

// Nothing follows the word of these.
bool parse_launch(statement_words &, statement &out)
{
    out.what = verb::LAUNCH;
    return true;
}

bool parse_go(statement_words &, statement &out)
{
    out.what = verb::SEND;
    out.bytes = start_record();
    return true;
}

bool parse_start(statement_words &, statement &out)
{
    out.what = verb::START;
    out.bytes = start_record();
    return true;
}

bool parse_kill(statement_words &, statement &out)
{
    out.what = verb::KILL;
    return true;
}

bool parse_sensor(statement_words &in, statement &out)
{
    int64_t sensor = 0;
    int64_t value = 0;
    if (!take_number(in, "a sensor", 0, BSP_SENSOR_COUNT - 1, sensor)) {
        return false;
    }
    file_write &file = out.files.emplace_back();
    file.path = "bsp/sensor_" + std::to_string(sensor);
    if (take_keyword(in, "missing")) {
        return true;
    }
    if (!take_number(in, "a temperature or 'missing'", INT32_MIN, INT32_MAX, value)) {
        return false;
    }
    file.text = std::to_string(value);
    return true;
}

// The answer alone, or the query's result and the answer.
bool parse_query(statement_words &in, statement &out)
{
    file_write &file = out.files.emplace_back();
    file.path = "bsp/" + in.words[0].text;
    if (take_keyword(in, "missing")) {
        return true;
    }
    std::string answer;
    do {
        int64_t value = 0;
        if (!take_number(in, "an answer or 'missing'", INT32_MIN, INT32_MAX, value)) {
            return false;
        }
        answer += (answer.empty() ? "" : " ") + std::to_string(value);
    } while (!at_end(in) && in.next < 3);
    file.text = answer;
    return true;
}

bool parse_sys(statement_words &in, statement &out)
{
    std::string led;
    int64_t value = 0;
    if (!take_text(in, "a folder of /sys/class/leds", led)) {
        return false;
    }
    if (!led.starts_with("led:") || !is_key(led.substr(4))) {
        return fail(in, "'" + led + "' is no folder of /sys/class/leds; sys led:NAME NUMBER, or sys led:NAME missing");
    }
    file_write &file = out.files.emplace_back();
    file.path = "leds/" + led + "/brightness";
    if (take_keyword(in, "missing")) {
        return true;
    }
    if (!take_number(in, "a brightness or 'missing'", 0, 255, value)) {
        return false;
    }
    file.text = std::to_string(value);
    return true;
}

bool parse_fail(statement_words &in, statement &out)
{
    int64_t result = 0;
    int64_t times = 0;
    std::string match;
    if (!take_text(in, "a platform call", out.key) || !take_text(in, "a piece of its arguments or *", match)) {
        return false;
    }
    if (!is_platform_call(out.key)) {
        return fail(in, "'" + out.key + "' is no platform call; did you mean " + nearest_platform_call(out.key) + "?");
    }
    if (match.find_first_of("'\n") != std::string::npos) {
        return fail(in, "a piece of arguments cannot hold a single quote or a line end");
    }
    if (!take_number(in, "a result", INT32_MIN, INT32_MAX, result)) {
        return false;
    }
    out.what = verb::FAIL;
    out.bytes = "'" + match + "' " + std::to_string(result);
    if (at_end(in)) {
        return true;
    }
    if (!take_number(in, "how many times", 1, 1'000'000, times)) {
        return false;
    }
    out.bytes += " " + std::to_string(times);
    return true;
}

bool parse_repair(statement_words &in, statement &out)
{
    if (!take_text(in, "a platform call or 'all'", out.key)) {
        return false;
    }
    if (out.key != "all" && !is_platform_call(out.key)) {
        return fail(in, "'" + out.key + "' is no platform call; did you mean " + nearest_platform_call(out.key) + "?");
    }
    out.what = verb::REPAIR;
    if (out.key == "all") {
        out.key.clear();
    }
    return true;
}

bool parse_after(statement_words &in, statement &out)
{
    const word *time = take(in);
    const std::optional<int64_t> ns = time ? parse_duration(time->text) : std::nullopt;
    if (!ns) {
        return fail(in, "after TIME, such as 500ms, 10s, 2m, 3h or 1d, up to 1000 days");
    }
    out.what = verb::AFTER;
    out.number = *ns;
    return true;
}

bool parse_repeat(statement_words &in, statement &out)
{
    out.what = verb::REPEAT;
    return take_number(in, "how many times", 1, 1'000'000, out.number);
}

bool parse_expect(statement_words &in, statement &out)
{
    out.what = verb::EXPECT;
    return parse_expectation(in, out.wanted);
}

struct statement_row {
    std::string_view keyword;
    bool (*parse)(statement_words &in, statement &out);
};

constexpr std::array statement_rows = {
    statement_row{"product",    parse_product   },
    statement_row{"cfg",        parse_cfg       },
    statement_row{"nv",         parse_nv        },
    statement_row{"clock",      parse_clock     },
    statement_row{"start",      parse_start     },
    statement_row{"launch",     parse_launch    },
    statement_row{"register",   parse_register  },
    statement_row{"go",         parse_go        },
    statement_row{"kill",       parse_kill      },
    statement_row{"notify",     parse_notify    },
    statement_row{"command",    parse_command   },
    statement_row{"raw",        parse_raw       },
    statement_row{"indication", parse_indication},
    statement_row{"sensor",     parse_sensor    },
    statement_row{"charger",    parse_query     },
    statement_row{"battery",    parse_query     },
    statement_row{"sys",        parse_sys       },
    statement_row{"fail",       parse_fail      },
    statement_row{"repair",     parse_repair    },
    statement_row{"after",      parse_after     },
    statement_row{"repeat",     parse_repeat    },
    statement_row{"expect",     parse_expect    },
};

std::string keywords()
{
    std::string list;
    for (const statement_row &row : statement_rows) {
        list += std::string(row.keyword) + ", ";
    }
    return list + "end and include";
}
} // namespace

bool parse_statement(const std::vector<word> &words, statement &out, std::string &error)
{
    statement_words in = {words, 1, {}};
    for (const statement_row &row : statement_rows) {
        if (row.keyword != words[0].text) {
            continue;
        }
        out.what = verb::WRITE;
        if (row.parse(in, out) && !at_end(in)) {
            fail(in, "'" + words[in.next].text + "' is too much");
        }
        error = in.error;
        return error.empty();
    }
    error = "unknown statement '" + words[0].text + "'; statements are " + keywords();
    return false;
}
