#include "ground/timer.h"

#include "kiv/ipc.h"

bool kiv_led_start_timer(led_word &timer, void (*procedure)(void *), void *argument, int period_ms)
{
    if (timer != 0) {
        return false;
    }
    const int created = kiv_timer(procedure, argument, period_ms, 1);
    const int meanwhile = timer.word.exchange(created, std::memory_order_relaxed);

    if (meanwhile != 0) { // a set-up on another thread was as quick
        kiv_delete_timer(meanwhile);
    }
    return created != 0;
}

int kiv_led_take_timer(led_word &timer)
{
    return timer.word.exchange(0, std::memory_order_relaxed);
}

void kiv_led_end_timer(led_word &timer)
{
    const int handle = kiv_led_take_timer(timer);

    if (handle != 0) {
        kiv_delete_timer(handle);
    }
}
