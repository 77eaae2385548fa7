#include "standin_device.h"

#include "kiv/reg.h"
#include "kiv/socket.h"
#include "standin.h"

#include <array>
#include <cerrno>
#include <csignal>
#include <cstring>
#include <filesystem>
#include <sys/wait.h>
#include <thread>
#include <unistd.h>

struct bus : standin_device {
};

TEST_F(bus, KeepsMessageBoundaries)
{
    struct {
        int sent;
        int room;
        int received;
    } const rows[] = {
        {1,    1036, 1   },
        {12,   1036, 12  },
        {104,  1036, 104 },
        {1036, 1036, 1036},
        {1036, 12,   12  }, // cut; the rest must not turn up as the next message
        {16,   1036, 16  },
    };
    const int handle = open_queue("MSG_ID_LED");
    const std::string data(1036, 'm');
    for (const auto &row : rows) {
        ASSERT_EQ(kiv_send_msg("MSG_ID_LED", data.data(), row.sent), 0) << row.sent;
    }
    for (const auto &row : rows) {
        std::string buffer(1040, '.');
        EXPECT_EQ(kiv_recv_msg(handle, buffer.data(), row.room), row.received) << row.sent;
        const auto length = static_cast<size_t>(row.received);
        EXPECT_EQ(buffer, std::string(length, 'm') + std::string(1040 - length, '.')) << "bytes behind the message";
    }
}

TEST_F(bus, RefusesWhatCannotBeSent)
{
    struct {
        const char *queue;
        int length;
    } const rows[] = {
        {"MSG_ID_LED",        0   },
        {"MSG_ID_LED",        -1  },
        {"MSG_ID_LED",        1037},
        {"MSG_ID_NOBODY",     104 },
        {"",                  104 },
        {"../bus/MSG_ID_LED", 104 },
        {"MSG_ID_LED.lock",   104 },
        {nullptr,             104 },
    };
    const std::string data(2000, 'm');
    open_queue("MSG_ID_LED");
    for (const auto &row : rows) {
        EXPECT_EQ(kiv_send_msg(row.queue, data.data(), row.length), -1) << (row.queue ? row.queue : "null");
    }
    EXPECT_EQ(kiv_send_msg("MSG_ID_LED", nullptr, 104), -1);
    EXPECT_EQ(kiv_recv_msg(-1, const_cast<char *>(data.data()), 10), -1);
}

TEST_F(bus, FullQueueWaitsThenFailsAndLosesNothing)
{
    const int handle = open_queue("MSG_ID_LED");
    int accepted = 0;
    while (standin_send("MSG_ID_LED", &accepted, sizeof accepted, 0) == 0) {
        accepted++;
    }
    ASSERT_GT(accepted, 0);

    const long long start = now_ms();
    EXPECT_EQ(standin_send("MSG_ID_LED", &accepted, sizeof accepted, 60), -EAGAIN);
    EXPECT_GE(now_ms() - start, 59);

    // Room that appears while a sender waits is used.
    std::vector<int> received;
    std::thread reader([&] {
        usleep(50000);
        for (int value = -1; received.size() <= static_cast<size_t>(accepted);) {
            ASSERT_EQ(kiv_recv_msg(handle, &value, sizeof value), static_cast<int>(sizeof value));
            received.push_back(value);
        }
    });
    EXPECT_EQ(kiv_send_msg("MSG_ID_LED", &accepted, sizeof accepted), 0);
    reader.join();
    for (int value = 0; value <= accepted; value++) {
        EXPECT_EQ(received[static_cast<size_t>(value)], value);
    }
}

TEST_F(bus, RoutesByModuleId)
{
    struct {
        uint16_t module_id;
        const char *queue;
    } const rows[] = {
        {1,  "MSG_ID_MAIN"  },
        {3,  "MSG_ID_PPP"   },
        {5,  "MSG_ID_SMS"   },
        {10, "MSG_ID_WLAN"  },
        {16, "MSG_ID_MDM"   },
        {23, "MSG_ID_NWINFO"},
        {24, "MSG_ID_DST"   },
        {27, "MSG_ID_SLEEP" },
        {38, "MSG_ID_LED"   },
        {43, "MSG_ID_VOICE" },
    };
    svc_msg message{};
    for (const auto &row : rows) {
        svc_msg received{};
        const int handle = open_queue(row.queue);
        message.us_dest_module_id = row.module_id;
        ASSERT_EQ(kiv_msg_send(&message, 8), 0) << row.queue;
        EXPECT_EQ(kiv_recv_msg(handle, &received, sizeof received), 20) << row.queue;
        EXPECT_EQ(received.us_dest_module_id, row.module_id);
    }
    for (const int data_len : {-1, 1025, INT32_MAX}) {
        EXPECT_EQ(kiv_msg_send(&message, data_len), -1) << data_len;
    }
    EXPECT_EQ(kiv_msg_send(&message, 0), 0);
    EXPECT_EQ(kiv_msg_send(&message, 1024), 0);
    for (const int nobody : {0, 2, 37, 39, 65535}) {
        message.us_dest_module_id = static_cast<uint16_t>(nobody);
        EXPECT_EQ(kiv_msg_send(&message, 8), -1) << nobody;
    }
}

// A child that holds the queue until it is killed.
static pid_t start_holder()
{
    int ready[2];
    char byte = 0;
    EXPECT_EQ(pipe(ready), 0);
    const pid_t child = fork();
    if (child == 0) {
        int handle = -1;
        if (kiv_init_msg("MSG_ID_LED", &handle) < 0 || ::write(ready[1], "r", 1) != 1) {
            _exit(1);
        }
        for (;;) {
            pause();
        }
    }
    close(ready[1]);
    EXPECT_EQ(::read(ready[0], &byte, 1), 1) << "the holder could not open the queue";
    close(ready[0]);
    return child;
}

TEST_F(bus, SecondReaderIsRefusedAndKilledOneReplaced)
{
    const pid_t child = start_holder();
    int handle = -7;
    testing::internal::CaptureStderr();
    EXPECT_LT(kiv_init_msg("MSG_ID_LED", &handle), 0);
    EXPECT_LT(kiv_init_msg("MSG_ID_LED", &handle), 0);
    EXPECT_EQ(testing::internal::GetCapturedStderr(),
              "platform: bus/MSG_ID_LED is already held by process " + std::to_string(child) + "\n");
    EXPECT_EQ(handle, -7);

    kill(child, SIGKILL);
    waitpid(child, nullptr, 0);
    ASSERT_TRUE(std::filesystem::exists(path("bus/MSG_ID_LED"))) << "nothing left to take over";
    char byte = 0;
    EXPECT_GE(kiv_init_msg("MSG_ID_LED", &handle), 0);
    EXPECT_EQ(kiv_send_msg("MSG_ID_LED", "x", 1), 0);
    EXPECT_EQ(kiv_recv_msg(handle, &byte, 1), 1);
}

// Whoever owns a module's queue owns its table: a second instance takes nothing from the first.
TEST_F(bus, SecondInstanceLeavesTheTableAlone)
{
    const uint32_t masks[] = {1, 2, 3, 4};
    int handle = -1;
    EXPECT_EQ(kiv_reg_table_init(KIV_MODULE_LED), 0);
    EXPECT_EQ(kiv_init_msg("MSG_ID_LED", &handle), 0);
    EXPECT_LT(kiv_init_msg("MSG_ID_LED", &handle), 0) << "one reader in a process, too";
    EXPECT_EQ(kiv_reg_proc(KIV_MODULE_SMS, masks), 1);

    const pid_t second = fork();
    if (second == 0) {
        standin_own_nothing();
        _exit(kiv_reg_table_init(KIV_MODULE_LED) == -1 && kiv_init_msg("MSG_ID_LED", &handle) < 0 ? 0 : 1);
    }
    int status = -1;
    waitpid(second, &status, 0);
    EXPECT_EQ(status, 0);
    EXPECT_EQ(read("reg/5"), "0x1 0x2 0x3 0x4\n");
}

TEST_F(bus, WorksUnderAPathTooLongForASocket)
{
    const std::string deep = path(std::string(200, 'd') + "/" + std::string(50, 'e'));
    char byte = 0;
    set("KIV_DEVICE_DIR", deep);
    const int handle = open_queue("MSG_ID_LED");
    EXPECT_EQ(kiv_send_msg("MSG_ID_LED", "x", 1), 0);
    EXPECT_EQ(kiv_recv_msg(handle, &byte, 1), 1);
    EXPECT_TRUE(std::filesystem::is_socket(deep + "/bus/MSG_ID_LED"));
}

TEST_F(bus, RegistrationRequestGoesToItsSource)
{
    const int handle = open_queue("MSG_ID_MAIN");
    const reg_masks masks = {0xfe2, 0x40004610, 0, 0x80000000};
    const std::array<uint16_t, 14> expected = {12033, 0, 1, 38, 16, 0, 0xfe2, 0, 0x4610, 0x4000, 0, 0, 0, 0x8000};
    std::array<uint16_t, 518> received{};
    EXPECT_EQ(kiv_reg_func(1, 38, &masks), 0);
    ASSERT_EQ(kiv_recv_msg(handle, received.data(), 1036), 28);
    EXPECT_EQ(memcmp(received.data(), expected.data(), 28), 0);
    EXPECT_EQ(kiv_reg_func(3, 38, &masks), -1) << "nobody reads MSG_ID_PPP";
    EXPECT_EQ(kiv_reg_func(1, 38, nullptr), -1);
}

TEST_F(bus, RegistrationTableIsKept)
{
    const uint32_t masks[] = {0x2, 0x40000010, 0, 0xffffffff};
    const uint32_t later[] = {0x4, 0, 0, 0};
    write("reg/5", "left over\n");
    ASSERT_EQ(kiv_reg_table_init(38), 0);
    EXPECT_EQ(read("reg/5"), "(missing)") << "the table starts empty";
    EXPECT_EQ(kiv_reg_proc(1, masks), 1);
    EXPECT_EQ(read("reg/1"), "0x2 0x40000010 0x0 0xffffffff\n");
    EXPECT_EQ(kiv_reg_proc(1, later), 1);
    EXPECT_EQ(read("reg/1"), "0x4 0x0 0x0 0x0\n");
    EXPECT_NE(kiv_reg_proc(0, masks), 1);
    EXPECT_NE(kiv_reg_proc(3, nullptr), 1);
    for (int module_id = 100; module_id < 163; module_id++) {
        ASSERT_EQ(kiv_reg_proc(module_id, masks), 1) << module_id;
    }
    EXPECT_NE(kiv_reg_proc(200, masks), 1) << "the table is full";
}
