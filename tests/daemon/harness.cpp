#include "harness.h"

#include "core/channel.h"

#include <algorithm>
#include <cstdio>
#include <cstring>
#include <gtest/gtest.h>
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
    const char *word;
    std::vector<int> leds;
};
constexpr unsigned longest_case_s = 20;

static const group_word group_words[] = {
    {"net off",       {13, 15, 17}                        },
    {"bat off",       {0, 1, 2, 3}                        },
    {"sms off",       {49, 50}                            },
    {"voice off",     {58, 59, 60, 61}                    },
    {"voicemail off", {62, 63, 64, 65}                    },
    {"handheld off",  {0, 1, 2, 3, 13, 15, 17, 43, 49, 50}},
};

static void append(trace &lines, const std::string &line)
{
    for (const group_word &group : group_words) {
        if (line == group.word) {
            for (const int led : group.leds) {
                lines.push_back("led " + std::to_string(led) + " off");
            }
            return;
        }
    }
    // A log line begins with its level; the source is kiv_mirta_led, _SUFFIX is added to it, :NAME is another one.
    static const std::regex log_line("([06](?:/14)?)(?:(_[a-z_]+)|:([a-z0-9_]+))? (\".*)");
    std::smatch part;
    if (!std::regex_match(line, part, log_line)) {
        lines.push_back(line);
    } else {
        const std::string source = part[3].matched ? part[3].str() : "kiv_mirta_led" + part[2].str();
        lines.push_back("log " + part[1].str() + " " + source + " " + part[4].str());
    }
}

static trace lines_of(std::string text)
{
    for (size_t at = 0; (at = text.find(" |", at)) != std::string::npos;) {
        text.replace(at, 2, "\n");
    }
    trace lines;
    std::istringstream stream(text);
    for (std::string line; std::getline(stream, line);) {
        line.erase(0, std::min(line.find_first_not_of(' '), line.size()));
        if (!line.empty()) {
            append(lines, line);
        }
    }
    return lines;
}

static bool is_effect(std::string_view line)
{
    for (const char *other : {"log ", "recv ", "sensor ", "open ", "stdout "}) {
        if (line.starts_with(other)) {
            return false;
        }
    }
    return !line.starts_with("nv ") || line.starts_with("nv write ");
}

static std::string side_by_side(const trace &expected, const trace &made)
{
    std::string shown;
    for (size_t i = 0; i < std::max(expected.size(), made.size()); ++i) {
        const std::string left = i < expected.size() ? expected[i] : "-";
        const std::string right = i < made.size() ? made[i] : "-";
        shown += (left == right ? "  " : "! ") + left;
        shown += std::string(left.size() < 80 ? 80 - left.size() : 2, ' ') + right + "\n";
    }
    return shown;
}

// In the child: plays the case and sends its record through the pipe. What the daemon prints comes last in it.
[[noreturn]] static void play_and_send(script *play, int out)
{
    alarm(longest_case_s);
    const int printed = memfd_create("printed", 0);
    dup2(printed, STDOUT_FILENO);
    fake_record(true);
    play();
    std::fflush(stdout);
    char text[256] = {};
    if (pread(printed, text, sizeof text - 1, 0) > 0) {
        std::ranges::replace(text, '\n', '/');
        fake_note(std::string("stdout ") + text);
    }
    const std::string record = fake_take_record();
    const bool sent = write(out, record.data(), record.size()) == static_cast<ssize_t>(record.size());
    _exit(sent ? 0 : 1);
}

static trace played(const char *name, script *play)
{
    int ends[2];
    std::fflush(stdout);
    EXPECT_EQ(pipe(ends), 0);
    const pid_t child = fork();
    if (child == 0) {
        play_and_send(play, ends[1]);
    }
    close(ends[1]);
    std::string record;
    char part[4096];
    for (ssize_t got = 0; (got = read(ends[0], part, sizeof part)) > 0;) {
        record.append(part, static_cast<size_t>(got));
    }
    close(ends[0]);
    int status = -1;
    waitpid(child, &status, 0);
    EXPECT_EQ(status, 0) << name << ": the case ended early";
    static const std::regex thread_id("\\[[0-9]+\\]First");
    return lines_of(std::regex_replace(record, thread_id, "[thread]First"));
}

static void compare(const char *name, const std::string &expected, const trace &made)
{
    const trace wanted = lines_of(expected);
    EXPECT_TRUE(wanted == made) << name << ", expected and made:\n" << side_by_side(wanted, made);
}

void expect_calls(const char *name, const std::string &expected, script *play)
{
    compare(name, expected, played(name, play));
}

static void compare_logs(const char *name, const std::string &expected, script *play, std::string_view begin)
{
    trace made = played(name, play);
    std::erase_if(made, [begin](const std::string &line) { return !line.starts_with(begin); });
    compare(name, expected, made);
}

void expect_logs(const char *name, const std::string &expected, script *play)
{
    compare_logs(name, expected, play, "log ");
}

void expect_errors(const char *name, const std::string &expected, script *play)
{
    compare_logs(name, expected, play, "log 0 ");
}

void expect_effects(const char *name, const std::string &expected, script *play)
{
    trace made = played(name, play);
    std::erase_if(made, [](const std::string &line) { return !is_effect(line); });
    compare(name, expected, made);
}

void product_on(led_product product)
{
    led_product_type = product;
    led_enable = 1;
    led_power_state = POWER_ON;
    led_bsp_ready = 1;
}

void nv(const char *key, const char *value)
{
    fake_set_nv(key, value);
}

void forget()
{
    fake_take_record();
}

void receive(const std::string &bytes)
{
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

void notify(int source, uint32_t event, const std::string &payload)
{
    receive(message_bytes(MSG_CMD_SERVICE_NOTIFY, KIV_MODULE_LED, source, event, payload));
}

void mc(uint32_t event)
{
    notify(KIV_MODULE_MAIN, event);
}

void command(int us_cmd)
{
    receive(message_bytes(us_cmd, KIV_MODULE_LED, KIV_MODULE_MAIN, 0));
}

void at_utc(int hour, int minute)
{
    constexpr std::time_t midnight = 1700006400;
    fake_platform().clock = midnight + hour * 3600 + minute * 60;
}

void note_power()
{
    fake_note("power " + std::to_string(led_power_state) + " sleep " + std::to_string(cur_led_sleep_status));
}
