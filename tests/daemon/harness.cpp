#include "harness.h"

#include "boot.h"
#include "core/channel.h"

#include <algorithm>
#include <array>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <memory>
#include <regex>
#include <sstream>
#include <string_view>
#include <sys/mman.h>
#include <sys/wait.h>
#include <unistd.h>
#include <vector>

using trace = std::vector<std::string>;

struct group_word {
    std::string_view word;
    std::vector<std::string> leds;
};
constexpr unsigned LONGEST_TEST_S = 20;

static const group_word group_words[] = {
    {"rssi off",      {"rssi_red", "rssi_green", "rssi_blue", "rssi_yellow"}                    },
    {"flow off",      {"flow_red", "flow_yellow", "flow_green", "flow_blue"}                    },
    {"bat off",       {"bat_red", "bat_green", "bat_blue", "bat_yellow"}                        },
    {"net off",       {"net_red", "net_blue", "net_white"}                                      },
    {"sms off",       {"sms_green", "sms_blue"}                                                 },
    {"voice off",     {"voice_red", "voice_green", "voice_blue", "voice_yellow"}                },
    {"voicemail off", {"voicemail_red", "voicemail_green", "voicemail_blue", "voicemail_yellow"}},
    {"handheld off",
     {"bat_red", "bat_green", "bat_blue", "bat_yellow", "net_red", "net_blue", "net_white", "wifi_blue", "sms_green",
      "sms_blue"}                                                                               },
};

static std::string record;      // since the step before the last expectation
static bool is_compared = true; // the next step begins a new record

static void begin_step()
{
    if (is_compared) {
        fake_take_record();
        record.clear();
        is_compared = false;
    }
}

static trace made_since()
{
    static const std::regex thread_id("\\[[0-9]+\\]First");
    record += std::regex_replace(fake_take_record(), thread_id, "[thread]First");
    is_compared = true;

    trace lines;
    std::istringstream stream(record);
    for (std::string line; std::getline(stream, line);) {
        lines.push_back(line);
    }
    return lines;
}

static void append_group_off(trace &lines, std::string_view word)
{
    for (int bar = 0; word == "sigbar off" && bar <= LED_SIGBAR_15 - LED_SIGBAR_0; ++bar) {
        lines.push_back("sigbar_" + std::to_string(bar) + " off");
    }
    for (const group_word &group : group_words) {
        for (size_t i = 0; group.word == word && i < group.leds.size(); ++i) {
            lines.push_back(group.leds[i] + " off");
        }
    }
}

static trace expected_lines(const std::string &expected)
{
    trace lines;
    std::istringstream stream(expected);
    for (std::string line; std::getline(stream >> std::ws, line);) {
        const size_t before = lines.size();
        if (line.starts_with("only ")) {
            line.erase(0, std::strlen("only "));
            append_group_off(lines, line.substr(0, line.find('_')) + " off");
            lines.push_back(line);
            continue;
        }
        append_group_off(lines, line);
        if (lines.size() == before) {
            lines.push_back(line);
        }
    }
    return lines;
}

// The two traces as one, aligned at a longest common subsequence: "-" was expected, "+" was made.
static std::string aligned(const trace &expected, const trace &made)
{
    std::vector<std::vector<size_t>> common(expected.size() + 1, std::vector<size_t>(made.size() + 1));
    for (size_t i = expected.size(); i-- > 0;) {
        for (size_t j = made.size(); j-- > 0;) {
            common[i][j] = expected[i] == made[j] ? common[i + 1][j + 1] + 1 //
                                                  : std::max(common[i + 1][j], common[i][j + 1]);
        }
    }
    std::string shown;
    size_t i = 0;
    size_t j = 0;
    while (i < expected.size() || j < made.size()) {
        if (i < expected.size() && j < made.size() && expected[i] == made[j]) {
            shown += "  " + expected[i++] + "\n";
            ++j;
        } else if (j == made.size() || (i < expected.size() && common[i + 1][j] >= common[i][j + 1])) {
            shown += "- " + expected[i++] + "\n";
        } else {
            shown += "+ " + made[j++] + "\n";
        }
    }
    return shown;
}

static void compare(const std::string &expected, const trace &made, const source_place &where)
{
    const trace wanted = expected_lines(expected);
    if (wanted != made) {
        ADD_FAILURE_AT(where.file_name(), static_cast<int>(where.line())) << "- expected, + made\n"
                                                                          << aligned(wanted, made);
    }
}

static bool begins_with_one_of(std::string_view line, const std::vector<std::string_view> &beginnings)
{
    return std::ranges::any_of(beginnings, [line](std::string_view begin) { return line.starts_with(begin); });
}

static bool is_on_the_way(std::string_view line)
{
    return begins_with_one_of(line, {"receive ", "info kiv_mirta_led \"[info] enter messageParse",
                                     "info kiv_mirta_led \"recv_msg.", "info kiv_mirta_led \"regDecodeMsg ",
                                     "info kiv_mirta_led \"[info] msg MSG_CMD_SERVICE_NOTIFY",
                                     "info kiv_mirta_led \"[info] source msg "});
}

void expect_trace(const std::string &expected, source_place where)
{
    compare(expected, made_since(), where);
}

void expect_calls(const std::string &expected, source_place where)
{
    trace made = made_since();
    std::erase_if(made, is_on_the_way);
    compare(expected, made, where);
}

void expect_effects(const std::string &expected, source_place where)
{
    trace made = made_since();
    std::erase_if(made, [](const std::string &line) {
        const bool only_reads = begins_with_one_of(
            line, {"info", "error", "receive ", "fill ", "copy ", "cfg ", "nv ", "sensor ", "query ", "open "});
        return only_reads && !line.starts_with("nv written");
    });
    compare(expected, made, where);
}

void expect_errors(const std::string &expected, source_place where)
{
    trace made = made_since();
    std::erase_if(made, [](const std::string &line) { return !line.starts_with("error"); });
    compare(expected, made, where);
}

void expect_log(const std::string &source, const std::string &expected, source_place where)
{
    trace made = made_since();
    std::erase_if(made, is_on_the_way);
    for (std::string &line : made) {
        const std::string level = line.substr(0, line.find(' '));
        const bool is_of_source = (level == "info" || level == "error") && line.starts_with(level + " " + source + " ");
        line = is_of_source ? level + line.substr(level.size() + 1 + source.size()) : "";
    }
    std::erase(made, "");
    compare(expected, made, where);
}

// In the child. What the daemon prints ends up in a file, so that standard output is left to the test's failures.
[[noreturn]] static void play_and_exit(const std::function<void()> &play)
{
    alarm(LONGEST_TEST_S);
    setenv("TZ", "IST-05:30", 1); // a device that is not in London
    tzset();
    fake_record(true);
    play();
    std::fflush(stdout);
    _exit(testing::Test::HasFailure() ? 1 : 0);
}

void on_a_fresh_device(const std::string &name, const std::function<void()> &play)
{
    std::fflush(stdout);
    const pid_t child = fork();
    if (child == 0) {
        play_and_exit(play);
    }
    int status = -1;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0) << name << ": it failed as shown above, or ended early";
}

void start(const std::string &product_type, char led_function)
{
    begin_step();
    fake_note("returned " + std::to_string(boot(product_type, led_function)));
}

void switched_on(led_product product)
{
    led_product_type = product;
    led_enable = 1;
    led_power_state = POWER_ON;
    led_bsp_ready = 1;
}

void nv(const std::string &key, const std::string &value)
{
    fake_set_nv(key, value);
}

void utc(int hour, int minute)
{
    constexpr std::time_t MIDNIGHT = 1700006400;
    fake_platform().clock = MIDNIGHT + hour * 3600 + minute * 60;
}

void forget()
{
    is_compared = true;
}

void step(const std::function<void()> &calls)
{
    begin_step();
    calls();
}

void receive(const std::string &bytes)
{
    begin_step();
    fake_deliver(bytes);
    const auto received = std::make_unique<received_message>(); // on the heap, where a sanitizer guards its ends
    std::memset(received.get(), 'x', sizeof *received);         // as a longer message before it leaves it
    kiv_led_receive_message(*received);
}

std::string message_bytes(int us_cmd, int dest, int source, uint32_t event, const std::string &payload)
{
    svc_msg message = {};
    message.us_cmd = static_cast<uint16_t>(us_cmd);
    message.us_dest_module_id = static_cast<uint16_t>(dest);
    message.us_source_module_id = static_cast<uint16_t>(source);
    message.ul_event_mask = event;
    return std::string(reinterpret_cast<const char *>(&message), offsetof(svc_msg, p_data)) + payload;
}

void notify(int module, uint32_t event, const std::string &payload)
{
    receive(message_bytes(MSG_CMD_SERVICE_NOTIFY, KIV_MODULE_LED, module, event, payload));
}

void command(int us_cmd)
{
    receive(message_bytes(us_cmd, KIV_MODULE_LED, KIV_MODULE_MAIN, 0));
}

void fire_timers(int period_ms)
{
    begin_step();
    for (const auto &[handle, timer] : fake_timers()) {
        if (timer.period_ms == period_ms) {
            fake_fire(handle);
        }
    }
}

fake_timer running_timer(int period_ms)
{
    for (const auto &[handle, timer] : fake_timers()) {
        if (timer.period_ms == period_ms) {
            return timer;
        }
    }
    ADD_FAILURE() << "no timer of " << period_ms << " ms runs";
    return {[](void *) {}, nullptr, period_ms, false};
}

void indicate(int event_id)
{
    char record_of_board[1] = {};
    begin_step();
    ASSERT_NE(fake_platform().indication, nullptr) << "the daemon registered for none";
    fake_platform().indication(event_id, 0, record_of_board);
}
