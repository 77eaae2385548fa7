// A person, or the system, wants an end: what waits on the wall clock returns early.
#pragma once

#include <atomic>
#include <csignal>

// SIGTERM or SIGHUP once one has come, otherwise SIGINT; 0: none.
extern std::atomic<int> interrupt_signal;

void catch_interrupts();        // from now on; otherwise they end the process
bool take_keyboard_interrupt(); // true once for a SIGINT, which is then forgotten
