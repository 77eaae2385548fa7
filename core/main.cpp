// The process entry. The daemon has no orderly end: it runs until it is killed.
#include "core/start.h"

#include <cstdio>
#include <cstdlib>
#include <ctime>
#include <semaphore.h>

static void block_for_good()
{
    sem_t never;

    sem_init(&never, 0, 0);
    for (;;) {
        sem_wait(&never); // a signal may interrupt it, nothing posts it
    }
}

int main()
{
    std::setvbuf(stdout, nullptr, _IONBF, 0); // a line shows at once, and stdio allocates nothing later
    tzset();                                  // gmtime would read the time zone, and allocate, at its first call
    if (kiv_led_start() != 0) {
        return EXIT_FAILURE;
    }
    block_for_good();
}
