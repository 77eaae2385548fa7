#include "standin_device.h"

#include "kiv/led.h"
#include "kiv/socket.h"
#include "standin.h"

struct relight : standin_device {
};

enum { RELIGHTS = 20 };

TEST_F(relight, ReachesTheDaemon)
{
    EXPECT_EQ(kiv_lib_led_relight_msg(), -1) << "there is no daemon";
    const int handle = open_queue("MSG_ID_LED");
    const uint16_t expected[] = {6934, 0, 38, 38, 0, 0};
    uint16_t received[518] = {};
    EXPECT_EQ(kiv_lib_led_relight_msg(), 0);
    ASSERT_EQ(kiv_recv_msg(handle, received, sizeof received), 12);
    for (size_t word = 0; word < 6; word++) {
        EXPECT_EQ(received[word], expected[word]) << word;
    }
}

TEST_F(relight, NeitherBlocksNorIsLostWhileTheQueueIsFull)
{
    const int handle = open_queue("MSG_ID_LED");
    int filler = 0;
    while (standin_send("MSG_ID_LED", "filler", 6, 0) == 0) {
        filler++;
    }

    const long long start = now_ms();
    for (int count = 0; count < RELIGHTS; count++) {
        EXPECT_EQ(kiv_lib_led_relight_msg(), 0);
    }
    EXPECT_LT(now_ms() - start, STANDIN_SEND_WAIT_MS) << "a call waited for room";

    int relights = 0;
    for (int count = 0; count < filler + RELIGHTS; count++) {
        svc_msg message{};
        const int length = kiv_recv_msg(handle, &message, sizeof message);
        relights += length == 12 && message.us_cmd == 6934 ? 1 : 0;
    }
    EXPECT_EQ(relights, RELIGHTS);
}
