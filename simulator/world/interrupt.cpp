#include "world/interrupt.h"

#include <array>

std::atomic<int> interrupt_signal{0};

static void note(int signal)
{
    int none = 0;
    if (signal != SIGINT) {
        interrupt_signal = signal;
    } else {
        interrupt_signal.compare_exchange_strong(none, SIGINT);
    }
}

void catch_interrupts()
{
    struct sigaction action = {};
    action.sa_handler = note;
    sigemptyset(&action.sa_mask);
    for (const int signal : std::array{SIGINT, SIGTERM, SIGHUP}) {
        sigaction(signal, &action, nullptr);
    }
}

bool take_keyboard_interrupt()
{
    int waits = SIGINT;
    return interrupt_signal.compare_exchange_strong(waits, 0);
}
