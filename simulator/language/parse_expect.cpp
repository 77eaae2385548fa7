#include "language/names.h"
#include "language/parser.h"

#include <array>

namespace
{
bool take_brightness(statement_words &in, led_look &look)
{
    int64_t value = 0;
    if (!take_number(in, "a brightness", 0, 4, value)) {
        return false;
    }
    look.brightness = static_cast<int>(value);
    return true;
}

bool take_blink_times(statement_words &in, led_look &look)
{
    std::string times;
    if (!take_text(in, "blink times such as 800/1200", times)) {
        return false;
    }
    const size_t slash = times.find('/');
    const std::string_view text = times;
    const auto first = parse_number(text.substr(0, slash), 0, 1'000'000);
    const auto second = slash == std::string::npos ? std::nullopt : parse_number(text.substr(slash + 1), 0, 1'000'000);
    if (!first || !second) {
        return fail(in, "'" + times + "' is not blink times such as 800/1200");
    }
    look.blink_time1 = static_cast<int>(*first);
    look.blink_time2 = static_cast<int>(*second);
    return true;
}

bool take_led_state(statement_words &in, std::vector<led_wanted> &looks)
{
    led_wanted &wanted = looks.emplace_back();
    std::string name;
    if (!take_text(in, "an LED", name)) {
        return false;
    }
    const std::optional<int> led = find_led(name);
    if (!led) {
        return fail(in, "unknown LED '" + name + "'; LEDs are " + led_names());
    }
    wanted.led = *led;
    if (take_keyword(in, "off")) {
        return true;
    }
    if (take_keyword(in, "on")) {
        wanted.look.mode = led_mode::ON;
        return take_brightness(in, wanted.look);
    }
    if (!take_keyword(in, "blink")) {
        return fail(in, name + " can be 'on BRIGHTNESS', 'off' or 'blink MS/MS BRIGHTNESS'");
    }
    wanted.look.mode = led_mode::BLINK;
    return take_blink_times(in, wanted.look) && take_brightness(in, wanted.look);
}

bool parse_only(statement_words &in, expectation &wanted)
{
    wanted.what = subject::ONLY;
    do {
        if (!take_led_state(in, wanted.looks)) {
            return false;
        }
    } while (take_keyword(in, "and"));
    return true;
}

bool parse_dark(statement_words &, expectation &wanted)
{
    wanted.what = subject::ONLY;
    return true;
}

bool parse_nothing(statement_words &in, expectation &wanted)
{
    wanted.what = subject::NO_CHANGE;
    return take_keyword(in, "changed") || fail(in, "expect nothing changed");
}

bool parse_requests(statement_words &in, expectation &wanted)
{
    wanted.what = subject::REQUESTS;
    return take_number(in, "a number of requests", 0, 1'000'000'000, wanted.number);
}

bool parse_log(statement_words &in, expectation &wanted)
{
    wanted.what = subject::LOG;
    if (!take_text(in, "a text", wanted.text)) {
        return false;
    }
    return !take_keyword(in, "level") || take_number(in, "a level", 0, 7, wanted.number);
}

bool parse_no(statement_words &in, expectation &wanted)
{
    if (take_keyword(in, "request")) {
        wanted.what = subject::REQUESTS;
        wanted.number = 0;
        return true;
    }
    wanted.what = subject::NO_LOG;
    return take_keyword(in, "log") ? take_text(in, "a text", wanted.text)
                                   : fail(in, "expect no log \"TEXT\", or expect no request");
}

bool parse_sent(statement_words &in, expectation &wanted)
{
    std::string name;
    wanted.what = subject::SENT;
    if (!take_text(in, "a module", name)) {
        return false;
    }
    const module_row *module = find_module(name);
    if (!module) {
        return fail(in, "unknown module '" + name + "'; modules are " + module_names());
    }
    wanted.number = module->module_id;
    return take_text(in, "a text", wanted.text);
}

bool parse_nv(statement_words &in, expectation &wanted)
{
    wanted.what = take_keyword(in, "written") ? subject::NV_WRITTEN : subject::NV;
    const word *pair = take(in);
    if (!pair) {
        return fail(in, "expect nv KEY=VALUE, expect nv KEY=missing, or expect nv written KEY=VALUE");
    }
    if (!split_pair(in, *pair, wanted.key, wanted.text)) {
        return false;
    }
    if (!is_key(wanted.key)) {
        return fail(in, "'" + wanted.key + "' cannot be a key");
    }
    if (wanted.what == subject::NV && !pair->quoted && wanted.text == "missing") {
        wanted.what = subject::NV_MISSING;
    }
    return true;
}

bool parse_timer(statement_words &in, expectation &wanted)
{
    wanted.what = subject::TIMER;
    if (!take_number(in, "a period in ms", 1, INT32_MAX, wanted.number)) {
        return false;
    }
    wanted.repeats = take_keyword(in, "repeat");
    return wanted.repeats || take_keyword(in, "once") || fail(in, "expect timer MS once, or expect timer MS repeat");
}

bool parse_timers(statement_words &in, expectation &wanted)
{
    wanted.what = subject::TIMER_COUNT;
    return take_number(in, "a number of timers", 0, 64, wanted.number);
}

bool parse_deleted(statement_words &in, expectation &wanted)
{
    wanted.what = subject::TIMER_DELETED;
    return take_keyword(in, "timer") || fail(in, "expect deleted timer");
}

bool parse_ran(statement_words &in, expectation &wanted)
{
    wanted.what = subject::RAN;
    return take_text(in, "a piece of a shell command", wanted.text);
}

bool parse_tr181(statement_words &in, expectation &wanted)
{
    wanted.what = subject::TR181;
    if (!take_text(in, "a record such as DEV.LEDS.LED1", wanted.key)) {
        return false;
    }
    if (!is_key(wanted.key)) {
        return fail(in, "'" + wanted.key + "' cannot be a record");
    }
    return take_text(in, "a text", wanted.text);
}

bool parse_stdout(statement_words &in, expectation &wanted)
{
    wanted.what = subject::OUTPUT;
    return take_text(in, "a text", wanted.text);
}

bool parse_alive(statement_words &, expectation &wanted)
{
    wanted.what = subject::ALIVE;
    return true;
}

bool parse_ended(statement_words &, expectation &wanted)
{
    wanted.what = subject::ENDED;
    return true;
}

struct expect_row {
    std::string_view keyword;
    bool (*parse)(statement_words &in, expectation &wanted);
};

constexpr std::array expect_rows = {
    expect_row{"only",     parse_only    },
    expect_row{"dark",     parse_dark    },
    expect_row{"nothing",  parse_nothing },
    expect_row{"requests", parse_requests},
    expect_row{"log",      parse_log     },
    expect_row{"no",       parse_no      },
    expect_row{"sent",     parse_sent    },
    expect_row{"nv",       parse_nv      },
    expect_row{"timer",    parse_timer   },
    expect_row{"timers",   parse_timers  },
    expect_row{"deleted",  parse_deleted },
    expect_row{"ran",      parse_ran     },
    expect_row{"tr181",    parse_tr181   },
    expect_row{"stdout",   parse_stdout  },
    expect_row{"alive",    parse_alive   },
    expect_row{"ended",    parse_ended   },
};
} // namespace

bool parse_expectation(statement_words &in, expectation &wanted)
{
    std::string list;
    if (at_end(in)) {
        return fail(in, "expect what?");
    }
    const std::string &first = in.words[in.next].text;
    for (const expect_row &row : expect_rows) {
        if (take_keyword(in, row.keyword)) {
            return row.parse(in, wanted);
        }
        list += std::string(row.keyword) + ", ";
    }
    if (!find_led(first)) {
        return fail(in, "unknown expectation '" + first + "'; expect " + list + "or an LED: " + led_names());
    }
    wanted.what = subject::LED;
    return take_led_state(in, wanted.looks);
}
