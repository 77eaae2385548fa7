#include "standin_device.h"

#include "kiv/adabsp.h"
#include "kiv/cfg.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/log.h"
#include "kiv/nv.h"
#include "kiv/reg.h"
#include "kiv/socket.h"
#include "kiv/tr181.h"
#include "standin.h"

#include <csignal>
#include <cstring>
#include <fcntl.h>
#include <fstream>
#include <regex>
#include <thread>
#include <unistd.h>

struct traces : standin_device {
};

TEST_F(traces, OneLineACall)
{
    char buffer[1036] = "";
    int result = 0;
    const int LED_QUEUE = open_queue("MSG_ID_LED");
    const int main_queue = open_queue("MSG_ID_MAIN");
    const std::string led_text = std::to_string(LED_QUEUE);
    daemon_record hello{};
    strcpy(hello.process_name, "kiv_mirta_led");
    strcpy(hello.queue_name, "MSG_ID_LED");
    svc_msg notice{};
    notice.us_cmd = MSG_CMD_SERVICE_NOTIFY;
    notice.us_dest_module_id = KIV_MODULE_MAIN;
    notice.us_source_module_id = KIV_MODULE_LED;
    notice.us_data_len = 8;
    notice.ul_event_mask = 0x20000000;
    strcpy(notice.p_data, "4096");
    const reg_masks masks = {0xfe2, 0x40004610, 0, 0};
    bsp_query_result query{};
    write("cfg/531", "1\n");
    write("cfg/6000", "DRIVER_UFI\n");
    write("nv/odd", "a\"b\\c\x01\xc3\td\n\n");
    write("bsp/charger", "1\n");
    trace_to_file();

    kiv_syslog_append(0, "kiv_mirta_led", 88, 31, "%s start!\n", "led");
    kiv_reg_table_init(38);
    kiv_init_msg("a/b", &result);
    kiv_send_msg("MSG_ID_LED", &hello, 104);
    kiv_recv_msg(LED_QUEUE, buffer, 1036);
    kiv_send_msg("MSG_ID_LED", "short", 5);
    kiv_recv_msg(LED_QUEUE, buffer, 1036);
    kiv_msg_send(&notice, 8);
    kiv_recv_msg(main_queue, buffer, 1036);
    kiv_reg_func(1, 38, &masks);
    kiv_recv_msg(main_queue, buffer, 1036);
    kiv_reg_proc(1, &masks.mask1);
    kiv_cfg_get_item(531, buffer, 1);
    kiv_cfg_get_item(6000, buffer, 128);
    kiv_nvconfig_read("odd", buffer, 64);
    kiv_nvconfig_read("missing", buffer, 64);
    kiv_nvconfig_write("is_night_mode", "0", 1);
    kiv_bsp_set_leds_sync({LED_BAT_GREEN, LED_OP_BLINK, 4, 800, 1200}, &result);
    kiv_bsp_set_leds_sync({LED_NET_14, LED_OP_OFF, 0, 0, 0}, &result);
    kiv_bsp_set_leds_sync({7, LED_OP_ON, 4, 0, 0}, &result);
    kiv_bsp_get_charger_connect_status_sync(&query);
    kiv_bsp_get_sensor_temp_sync(0, nullptr);
    kiv_delete_timer(0);
    kiv_lib_led_relight_msg();
    kiv_recv_msg(LED_QUEUE, buffer, 1036);
    libkiv_tr181_Init();

    const std::vector<std::string> expected = {
        "main kiv_syslog_append(0, \"kiv_mirta_led\", 88, 31, \"led start!\\n\")",
        "main kiv_reg_table_init(38) = 0",
        "main kiv_init_msg(\"a/b\") = -1",
        "main kiv_send_msg(\"MSG_ID_LED\", 104) = 0, record 0 \"kiv_mirta_led\" \"MSG_ID_LED\"",
        "main kiv_recv_msg(" + led_text + ", 1036) = 104, record 0 \"kiv_mirta_led\" \"MSG_ID_LED\"",
        "main kiv_send_msg(\"MSG_ID_LED\", 5) = 0, raw 73686f7274",
        "main kiv_recv_msg(" + led_text + ", 1036) = 5, raw 73686f7274",
        "main kiv_msg_send(dest 1 cmd 12034 source 38 len 8 event 0x20000000 \"4096\", 8) = 0",
        "main kiv_recv_msg(" + std::to_string(main_queue) +
            ", 1036) = 20, cmd 12034 dest 1 source 38 len 8 event 0x20000000 \"4096\"",
        "main kiv_reg_func(1, 38, 0xfe2 0x40004610 0x0 0x0) = 0",
        "main kiv_recv_msg(" + std::to_string(main_queue) +
            ", 1036) = 28, cmd 12033 dest 1 source 38 len 16 masks 0xfe2 0x40004610 0x0 0x0",
        "main kiv_reg_proc(1, 0xfe2 0x40004610 0x0 0x0) = 1",
        "main kiv_cfg_get_item(531, 1) = 0, 1",
        "main kiv_cfg_get_item(6000, 128) = 0, \"DRIVER_UFI\"",
        "main kiv_nvconfig_read(\"odd\", 64) = 0, \"a\\\"b\\\\c\\x01\\xc3\\td\\n\"",
        "main kiv_nvconfig_read(\"missing\", 64) = -1",
        "main kiv_nvconfig_write(\"is_night_mode\", \"0\", 1) = 0",
        "main kiv_bsp_set_leds_sync(bat_green blink 4 800/1200) = 0",
        "main kiv_bsp_set_leds_sync(net_14 off 0) = 0",
        "main kiv_bsp_set_leds_sync(7 on 4) = -22",
        "main kiv_bsp_get_charger_connect_status_sync() = 0, 0 1",
        "main kiv_bsp_get_sensor_temp_sync(0) = -1",
        "main kiv_delete_timer(0) = 0",
        "main kiv_lib_led_relight_msg() = 0",
        "main kiv_recv_msg(" + led_text + ", 1036) = 12, cmd 6934 dest 38 source 38 len 0",
        "main libkiv_tr181_Init() = 0",
    };
    EXPECT_EQ(trace(), expected);
}

TEST_F(traces, ThreadsHaveNames)
{
    const int handle = open_queue("MSG_ID_LED");
    char byte = 0;
    trace_to_file();
    kiv_send_msg("MSG_ID_LED", "xy", 1);
    std::thread([&] {
        kiv_delete_timer(0);
        kiv_recv_msg(handle, &byte, 1);
    }).join();
    std::thread([] { kiv_delete_timer(0); }).join();
    static std::atomic<int> handle_fired{0};
    const int timer = kiv_timer([](void *) { handle_fired = 1; }, nullptr, 1, 0);
    while (handle_fired == 0) {
        usleep(1000);
    }
    const std::string number = std::to_string(handle);
    const std::string fire = "timer kiv_timer_fire(" + std::to_string(timer) + ")";
    std::vector<std::string> lines = trace();
    // The timer may fire before its starter has written its own line.
    std::erase(lines, "main kiv_timer(1, once) = " + std::to_string(timer));
    EXPECT_EQ(lines, (std::vector<std::string>{
                         "main kiv_send_msg(\"MSG_ID_LED\", 1) = 0, raw 78", "t1 kiv_delete_timer(0) = 0",
                         "receive kiv_recv_msg(" + number + ", 1) = 1, raw 78", "t2 kiv_delete_timer(0) = 0", fire}));
}

// Nothing that comes off the bus or out of a caller may grow a line beyond its buffer or split it.
TEST_F(traces, HostileTextStaysOnOneBoundedLine)
{
    const int handle = open_queue("MSG_ID_LED");
    const std::string bytes(1036, '\xff');
    const std::string endless(100000, '\n');
    std::string buffer(1036, '.');
    trace_to_file();
    EXPECT_EQ(kiv_send_msg("MSG_ID_LED", bytes.data(), 1036), 0);
    EXPECT_EQ(kiv_recv_msg(handle, buffer.data(), 1036), 1036);
    EXPECT_EQ(kiv_nvconfig_read(endless.c_str(), buffer.data(), 10), -1);
    kiv_syslog_append(6, "f", 1, 31, "%s", endless.c_str());
    std::vector<std::string> lines = trace();
    ASSERT_EQ(lines.size(), 4U);
    EXPECT_NE(lines[1].find("\\xff\\xff\" raw ffff"), std::string::npos) << "the whole message is shown";
    EXPECT_TRUE(lines[2].ends_with(") = -1")) << "a cut line keeps its result";
    for (const std::string &line : lines) {
        EXPECT_LT(line.size(), 9000U);
    }
}

TEST_F(traces, LogLineIsOneLineOfTheSink)
{
    struct {
        int level;
        const char *text;
        const char *line;
    } const rows[] = {
        {0, "plain",             "ERROR file:7 plain"             },
        {6, "newline\n",         "INFO file:7 newline"            },
        {6, "two\n\n",           "INFO file:7 two"                },
        {6, "in\nside\x1b[2J\n", "INFO file:7 in\\x0aside\\x1b[2J"},
        {6, "",                  "INFO file:7 "                   },
    };
    const std::regex shape("^20[0-9]{2}-[0-9]{2}-[0-9]{2} [0-9]{2}:[0-9]{2}:[0-9]{2}\\.[0-9]{3} (.*)$");
    set("KIV_LOG", path("log"));
    for (const auto &row : rows) {
        kiv_syslog_append(row.level, "file", 7, 31, "%s", row.text);
    }
    kiv_syslog_append(6, "file", 7, 31, "%5000d", 1); // cut
    std::ifstream log(path("log"));
    std::string line;
    for (const auto &row : rows) {
        std::smatch match;
        ASSERT_TRUE(std::getline(log, line));
        ASSERT_TRUE(std::regex_match(line, match, shape)) << line;
        EXPECT_EQ(match[1], row.line);
    }
    ASSERT_TRUE(std::getline(log, line));
    EXPECT_LT(line.size(), 1200U);
    EXPECT_FALSE(std::getline(log, line));
    set("KIV_LOG", "none");
    const std::string before = read("log");
    kiv_syslog_append(6, "file", 7, 31, "unseen");
    EXPECT_EQ(read("log"), before);
}

// What is not in the trace did not happen, so nothing goes on without it.
TEST_F(traces, LostByteEndsTheProcess)
{
    EXPECT_EXIT((set("KIV_TRACE", "/dev/full"), kiv_delete_timer(0)), testing::ExitedWithCode(74),
                "platform: the trace cannot be written: No space left on device");
    EXPECT_EXIT((set("KIV_TRACE", path("missing/trace")), kiv_delete_timer(0)), testing::ExitedWithCode(74),
                "platform: KIV_TRACE=.*: No such file or directory");
}

TEST_F(traces, BrokenStandardErrorStopsNobody)
{
    int pipe_fds[2];
    const int standard_error = dup(STDERR_FILENO);
    ASSERT_EQ(pipe2(pipe_fds, O_CLOEXEC), 0);
    dup2(pipe_fds[1], STDERR_FILENO);
    close(pipe_fds[0]);
    close(pipe_fds[1]);
    set("KIV_TRACE", "-");
    set("KIV_LOG", "-");
    kiv_syslog_append(0, "file", 7, 31, "to nobody");
    standin_error("to nobody");
    EXPECT_EQ(kiv_delete_timer(0), 0);
    dup2(standard_error, STDERR_FILENO);
    close(standard_error);
    sigset_t pending;
    sigpending(&pending);
    EXPECT_EQ(sigismember(&pending, SIGPIPE), 0);
}
