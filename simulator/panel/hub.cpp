#include "panel/hub.h"

#include <chrono>
#include <future>
#include <memory>

namespace
{
constexpr size_t QUESTIONS_MAX = 32;
constexpr size_t BATCHES_MAX = 100;
constexpr std::chrono::seconds SIGN_OF_LIFE{2};
} // namespace

std::optional<std::string> ask(hub &h, const question &what)
{
    auto answered = std::make_shared<std::promise<std::string>>();
    std::future<std::string> result = answered->get_future();
    {
        const std::lock_guard lock(h.guard);
        if (h.closed || h.questions.size() >= QUESTIONS_MAX) {
            return std::nullopt;
        }
        h.questions.emplace_back([answered, what] { answered->set_value(what()); });
    }
    h.asked.notify_one();
    return result.get();
}

bool answer(hub &h, int wait_ms)
{
    std::deque<std::function<void()>> due;
    {
        std::unique_lock lock(h.guard);
        h.asked.wait_for(lock, std::chrono::milliseconds(wait_ms), [&] { return !h.questions.empty(); });
        due.swap(h.questions);
    }
    for (const std::function<void()> &one : due) {
        one();
    }
    return !due.empty();
}

void publish(hub &h, std::string batch)
{
    const std::lock_guard lock(h.guard);
    h.batches.push_back(std::move(batch));
    h.next_batch++;
    if (h.batches.size() > BATCHES_MAX) {
        h.batches.pop_front();
    }
    h.told.notify_all();
}

std::optional<std::string> wait_for_batch(hub &h, uint64_t number, bool &missed)
{
    std::unique_lock lock(h.guard);
    h.told.wait_for(lock, SIGN_OF_LIFE, [&] { return h.closed || h.next_batch > number; });
    const uint64_t first = h.next_batch - h.batches.size();
    missed = number < first;
    if (missed || number >= h.next_batch || h.closed) {
        return std::nullopt;
    }
    return h.batches[number - first];
}

void close_hub(hub &h)
{
    {
        const std::lock_guard lock(h.guard);
        h.closed = true;
    }
    h.told.notify_all();
    while (answer(h, 0)) {
        continue;
    }
}
