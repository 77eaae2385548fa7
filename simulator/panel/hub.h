// Between the device's thread and those of the connections: what the pages ask for, one after the other, and the
// batches of news, which every page gets.
#pragma once

#include <condition_variable>
#include <cstdint>
#include <deque>
#include <functional>
#include <mutex>
#include <optional>
#include <string>

using question = std::function<std::string()>; // runs on the device's thread

struct hub {
    std::mutex guard;
    std::condition_variable asked;
    std::condition_variable told;
    std::deque<std::function<void()>> questions;
    std::deque<std::string> batches;
    uint64_t next_batch = 0; // the number of the first that is not there yet
    bool closed = false;
};

// Any thread: runs it on the device's thread and waits for the answer. None when too many wait, or the panel closes.
std::optional<std::string> ask(hub &h, const question &what);

// The device's thread: runs what has been asked for; waits for it that long. True when there was something.
bool answer(hub &h, int wait_ms);

void publish(hub &h, std::string batch);

// Any thread: the batch of that number; waits a while for one that is still to come. None when there is none yet;
// missed is set when it is gone already.
std::optional<std::string> wait_for_batch(hub &h, uint64_t number, bool &missed);

void close_hub(hub &h); // nobody waits any longer
