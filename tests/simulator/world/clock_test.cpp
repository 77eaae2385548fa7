#include "language/words.h"
#include "world/daemon_process.h"
#include "world/device.h"

#include <cstdlib>
#include <filesystem>
#include <gtest/gtest.h>
#include <unistd.h>

namespace
{
struct child {
    std::string device;
    daemon_process process;
    int64_t now_ns = 0;
};

void start(child &c)
{
    std::string error;
    daemon_options options;
    // A shell would take every one of its bytes for something else.
    const std::string folder = testing::TempDir() + "it's \"$(touch here)\" `x` \\" + std::to_string(getpid());
    std::filesystem::create_directory(folder);
    setenv("TMPDIR", folder.c_str(), 1);
    options.daemon = CLOCK_CHILD;
    options.clock = CLOCK_LIBRARY;
    c.device = make_device(error);
    ASSERT_TRUE(write_device_file(c.device, {"leds/led:test/brightness", "7"}, error)) << error;
    ASSERT_TRUE(launch(c.process, options, c.device, "", 0, 0, error)) << error;
    ASSERT_EQ(wait_until_idle(c.process, c.now_ns), run_result::IDLE);
}

std::string finish(child &c)
{
    std::string printed;
    kill_daemon(c.process);
    read_file(c.device + "/stdout", printed);
    remove_device(c.device);
    std::filesystem::remove(getenv("TMPDIR"));
    unsetenv("TMPDIR");
    return printed;
}

// A whole day, with the wall clock set twice on the way.
std::string run_a_day(child &c)
{
    constexpr int64_t hour = 3600 * NS_PER_S;
    start(c);
    run_until(c.process, 10 * NS_PER_S, 0, c.now_ns);
    run_until(c.process, 10 * NS_PER_S, 11 * hour, c.now_ns);
    run_until(c.process, 50 * NS_PER_S, 12 * hour - 70 * NS_PER_S, c.now_ns);
    run_until(c.process, 24 * hour, 12 * hour - 70 * NS_PER_S, c.now_ns);
    return finish(c);
}

constexpr const char *A_DAY = "0.000 t1 started\n"
                              "0.000 t2 received one\n"
                              "0.001 t3 signalled\n"
                              "0.050 t2 received two\n"
                              "0.251 t1 poll 0\n"
                              "1.001 t1 epoll 0\n"
                              "2.001 t1 not yet\n"
                              "3.001 t1 worker done\n"
                              "20.000 t3 tick 1\n"
                              "40.000 t3 tick 2\n"
                              "70.000 t4 noon at 43200\n"
                              "70.000 t1 joined\n"
                              "70.000 t1 fopen found\n"
                              "70.000 t1 access 0, stat 0\n"
                              "7\n7\n7\na \"/tmp/sys/class/leds/led:test/brightness\npreload=\n"
                              "70.000 t1 shell 0\n"
                              "70.001 t6 through\n"
                              "70.001 t7 through\n"
                              "70.001 t8 through\n"
                              "71.001 t1 past a shared lock\n"
                              "72.001 t1 past call_once\n"
                              "73.001 t1 past a static\n"
                              "74.001 t1 past an atomic\n"
                              "75.001 t13 wrote 1\n"
                              "75.001 t1 read 1\n"
                              "75.001 t1 past a pipe\n"
                              "76.001 t1 select 0\n"
                              "77.001 t1 recv -1\n"
                              "77.001 t1 deadlock\n"
                              "77.001 t1 wall clock 43207\n"
                              "40000.000 t3 tick 2000\n"
                              "86400.000 t3 tick 4320\n";
} // namespace

TEST(Clock, OrdersEveryThreadByVirtualTime)
{
    child c;
    EXPECT_EQ(run_a_day(c), A_DAY);
    EXPECT_EQ(c.now_ns, 86'400 * NS_PER_S);
}

TEST(Clock, TellsTheNextRunNothingNew)
{
    child c;
    start(c);
    // Nothing is due yet, so time stands still however often it is asked.
    for (int round = 0; round < 3; round++) {
        ASSERT_EQ(run_until(c.process, 0, 0, c.now_ns), run_result::IDLE);
    }
    EXPECT_EQ(finish(c), "0.000 t1 started\n0.000 t2 received one\n");
}

TEST(Clock, ReportsTheEndOfTheProcess)
{
    child c;
    start(c);
    kill(c.process.pid, SIGTERM);
    EXPECT_EQ(run_until(c.process, NS_PER_S, 0, c.now_ns), run_result::ENDED);
    EXPECT_EQ(c.process.end, "was ended by signal 15 (Terminated)");
    finish(c);
}

TEST(Clock, RefusesByNameWhatItDoesNotCover)
{
    child c;
    std::string errors;
    setenv("CLOCK_CHILD_TIMERFD", "1", 1);
    start(c);
    EXPECT_EQ(run_until(c.process, 24 * 3600 * NS_PER_S, 0, c.now_ns), run_result::ENDED);
    unsetenv("CLOCK_CHILD_TIMERFD");
    read_file(c.device + "/stderr", errors);
    EXPECT_EQ(errors, "the clock of the simulator does not cover timerfd_create\n");
    finish(c);
}

#if defined(__SANITIZE_THREAD__)
TEST(Clock, HidesNoRaceFromThreadSanitizer)
{
    child c;
    std::string errors;
    setenv("CLOCK_CHILD_RACES", "1", 1);
    start(c);
    EXPECT_EQ(run_until(c.process, 60 * NS_PER_S, 0, c.now_ns), run_result::ENDED);
    unsetenv("CLOCK_CHILD_RACES");
    read_file(c.device + "/stderr", errors);
    EXPECT_NE(errors.find("data race"), std::string::npos) << errors;
    finish(c);
}
#endif
