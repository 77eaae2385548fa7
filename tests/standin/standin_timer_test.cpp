#include "standin_device.h"

#include "kiv/ipc.h"

#include <atomic>
#include <condition_variable>
#include <mutex>
#include <unistd.h>

// What fired, and when.
struct recorder {
    std::mutex lock;
    std::condition_variable changed;
    std::vector<int> ids;
    std::vector<long long> times;
};

static recorder fired;
static std::atomic<int> own_handle{0};

static void record(void *argument)
{
    const std::lock_guard guard(fired.lock);
    fired.ids.push_back(*static_cast<const int *>(argument));
    fired.times.push_back(now_ms());
    fired.changed.notify_all();
}

static void record_and_delete_own(void *argument)
{
    record(argument);
    kiv_delete_timer(own_handle);
}

static void hold_service(void *argument)
{
    usleep(*static_cast<const useconds_t *>(argument));
}

static std::vector<int> wait_for(size_t count)
{
    std::unique_lock guard(fired.lock);
    fired.changed.wait_for(guard, std::chrono::seconds(10), [count] { return fired.ids.size() >= count; });
    EXPECT_GE(fired.ids.size(), count) << "timers did not fire";
    return fired.ids;
}

static void forget_fired()
{
    const std::lock_guard guard(fired.lock);
    fired.ids.clear();
    fired.times.clear();
}

struct timers : standin_device {
    void SetUp() override
    {
        standin_device::SetUp();
        forget_fired();
    }
};

static int one = 1, two = 2, three = 3;

TEST_F(timers, FireInOrderOfTheirDeadlines)
{
    const long long start = now_ms();
    EXPECT_GT(kiv_timer(record, &three, 90, 0), 0);
    EXPECT_GT(kiv_timer(record, &one, 30, 0), 0);
    EXPECT_GT(kiv_timer(record, &two, 60, 0), 0);
    EXPECT_EQ(wait_for(3), (std::vector{1, 2, 3}));
    EXPECT_GE(fired.times[0] - start, 29);
    EXPECT_GE(fired.times[2] - start, 89);
}

// Holds the service past the second tick. The late tick comes once, after the hold; how soon the next one follows.
static long long gap_after_late_tick()
{
    useconds_t hold_us = 180000;
    const long long start = now_ms();
    forget_fired();
    const int handle = kiv_timer(record, &one, 100, 1);
    EXPECT_GT(kiv_timer(hold_service, &hold_us, 95, 0), 0);
    wait_for(2);
    kiv_delete_timer(handle);
    EXPECT_GE(fired.times[1] - start, 299);
    return fired.times[1] - fired.times[0];
}

// A timer that counts from when it fired always comes a whole period later; one that keeps its phase comes sooner,
// unless the machine itself was late.
TEST_F(timers, PeriodicTimerKeepsItsPhaseWithoutABurst)
{
    long long gap = gap_after_late_tick();
    for (int attempt = 0; attempt < 9 && gap >= 95; attempt++) {
        gap = gap_after_late_tick();
    }
    EXPECT_LT(gap, 95);
}

TEST_F(timers, CallbackDeletesItsOwnTimer)
{
    own_handle = kiv_timer(record_and_delete_own, &one, 10, 1);
    EXPECT_GT(kiv_timer(record, &two, 60, 0), 0);
    EXPECT_EQ(wait_for(2), (std::vector{1, 2}));
}

TEST_F(timers, DeleteTakesOnlyItsOwnTimer)
{
    const int gone = kiv_timer(record, &one, 1, 0);
    wait_for(1);
    const int alive = kiv_timer(record, &two, 40, 0); // takes the place of the one that has fired
    const int stopped = kiv_timer(record, &three, 20, 0);
    EXPECT_NE(alive, gone);
    for (const int handle : {0, -1, 99999, gone, stopped, stopped}) {
        EXPECT_EQ(kiv_delete_timer(handle), 0) << handle;
    }
    EXPECT_EQ(wait_for(2), (std::vector{1, 2}));
}

TEST_F(timers, RefusesWhatItCannotServe)
{
    std::vector<int> handles;
    EXPECT_EQ(kiv_timer(record, &one, 0, 0), 0);
    EXPECT_EQ(kiv_timer(record, &one, -5, 1), 0);
    EXPECT_EQ(kiv_timer(nullptr, &one, 10, 1), 0);
    for (int count = 0; count < 64; count++) {
        handles.push_back(kiv_timer(record, &one, INT32_MAX, count % 2));
    }
    EXPECT_EQ(kiv_timer(record, &one, 10, 0), 0) << "the table holds 64";
    for (const int handle : handles) {
        EXPECT_GT(handle, 0);
        kiv_delete_timer(handle);
    }
    EXPECT_GT(kiv_timer(record, &two, 1, 0), 0);
    EXPECT_EQ(wait_for(1), (std::vector{2}));
}
