// The C library as the daemon sees it in the tests. The linker leads the daemon's calls here (--wrap); what the fake
// device has nothing to say about goes on to the real functions.
#include "fake_platform.h"

#include <cerrno>
#include <cstdarg>
#include <cstring>
#include <ctime>
#include <fcntl.h>
#include <pthread.h>
#include <sys/mman.h>
#include <unistd.h>

extern "C" {

int __real_open(const char *path, int flags, ...);
std::time_t __real_time(std::time_t *out);
int __real_pthread_create(pthread_t *thread, const pthread_attr_t *attributes, void *(*body)(void *), void *argument);

static int open_rolling_leds()
{
    fake_device &device = fake_platform();
    if (device.rolling_leds.empty()) {
        errno = ENOENT;
        return -1;
    }
    const std::string content = device.rolling_leds.front();
    if (device.rolling_leds.size() > 1) {
        device.rolling_leds.pop_front();
    }
    const int file = memfd_create("rolling_leds", MFD_CLOEXEC);
    if (write(file, content.data(), content.size()) < 0) {
        return -1;
    }
    lseek(file, 0, SEEK_SET);
    return file;
}

int __wrap_open(const char *path, int flags, ...)
{
    if (std::strcmp(path, "/sys/class/leds/led:rolling_leds/brightness") == 0) {
        fake_note("open led:rolling_leds");
        return open_rolling_leds();
    }
    va_list arguments;
    va_start(arguments, flags);
    const mode_t mode = (flags & O_CREAT) != 0 ? va_arg(arguments, mode_t) : 0;
    va_end(arguments);
    return __real_open(path, flags, mode);
}

int __wrap_system(const char *command)
{
    fake_note(std::string("shell ") + command);
    return -1;
}

unsigned __wrap_sleep(unsigned seconds)
{
    fake_note("sleep " + std::to_string(seconds) + " s");
    return 0;
}

int __wrap_usleep(useconds_t microseconds)
{
    fake_note("sleep " + std::to_string(microseconds) + " us");
    return 0;
}

std::time_t __wrap_time(std::time_t *out)
{
    const std::optional<std::time_t> &clock = fake_platform().clock;
    return clock ? *clock : __real_time(out);
}

int __wrap_pthread_create(pthread_t *thread, const pthread_attr_t *attributes, void *(*body)(void *), void *argument)
{
    const fake_device &device = fake_platform();
    const auto known = device.threads.find(body);
    if (known == device.threads.end()) {
        return __real_pthread_create(thread, attributes, body, argument);
    }
    fake_note("thread " + known->second + (attributes == nullptr && argument == nullptr ? "" : " with arguments"));
    return known->second == device.failing_thread ? EAGAIN : 0;
}
}
