#include "ubox/uloop.h"

#include <gtest/gtest.h>

#include <atomic>
#include <thread>
#include <unistd.h>

static std::atomic<int> bytes_read{0};
static std::atomic<bool> saw_eof{false};

static void read_byte(uloop_fd *source, unsigned int)
{
    char byte = 0;
    if (read(source->fd, &byte, 1) == 1) {
        bytes_read++;
    }
    saw_eof = source->eof;
    if (byte == 'e' || source->eof) {
        uloop_end();
    }
}

struct uloop : testing::Test {
    int ends[2] = {-1, -1};
    uloop_fd source{};

    void SetUp() override
    {
        ASSERT_EQ(pipe(ends), 0);
        ASSERT_EQ(uloop_init(), 0);
        source.fd = ends[0];
        source.cb = read_byte;
        bytes_read = 0;
    }
    void TearDown() override
    {
        uloop_fd_delete(&source);
        close(ends[0]);
        close(ends[1]);
        uloop_done();
    }
};

TEST_F(uloop, TakesADescriptorWhileAnotherThreadWaits)
{
    std::thread loop([] { uloop_run(); });
    usleep(20000); // the loop waits by now, or finds the descriptor when it starts
    EXPECT_EQ(uloop_fd_add(&source, ULOOP_READ), 0);
    EXPECT_EQ(write(ends[1], "abe", 3), 3);
    loop.join();
    EXPECT_EQ(bytes_read, 3);
}

TEST_F(uloop, EndFromAnotherThreadWakesIt)
{
    std::thread loop([] { uloop_run(); });
    usleep(20000);
    uloop_end();
    loop.join();
    EXPECT_EQ(uloop_fd_add(&source, ULOOP_READ), 0);
    EXPECT_EQ(write(ends[1], "e", 1), 1);
    uloop_run();
    EXPECT_EQ(bytes_read, 1) << "the end of one run must not end the next";
}

TEST_F(uloop, ClosedPeerIsReportedOnceAndDeletedStaysQuiet)
{
    EXPECT_EQ(uloop_fd_add(&source, ULOOP_READ), 0);
    EXPECT_EQ(uloop_fd_delete(&source), 0);
    EXPECT_EQ(write(ends[1], "x", 1), 1);
    EXPECT_EQ(uloop_run_timeout(0), 0);
    EXPECT_EQ(bytes_read, 0);
    EXPECT_EQ(uloop_fd_add(&source, ULOOP_READ), 0);
    EXPECT_EQ(uloop_run_timeout(0), 0);
    EXPECT_EQ(bytes_read, 1);
    close(ends[1]);
    EXPECT_EQ(uloop_run(), 0);
    EXPECT_TRUE(saw_eof);
    EXPECT_FALSE(source.registered);
}
