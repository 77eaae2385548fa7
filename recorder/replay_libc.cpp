// The C library as the replay's front: what the daemon observes of the device through it is answered by the recording,
// and where it would block it waits for its turn.
#include "replay.h"

#include "kiv/mem.h"
#include "seen/trace.h"

#include <algorithm>
#include <cerrno>
#include <cstdarg>
#include <cstdlib>
#include <cstring>
#include <link.h>
#include <semaphore.h>

// Also before the constructors of this library: others' call the C library too.
const next_functions &next()
{
    static constinit next_functions found = {};
    return find_next(found);
}

namespace
{
constexpr const char *KERNEL_LEDS = "/sys/class/leds/";

struct address_range {
    ElfW(Addr) begin = ~ElfW(Addr){0};
    ElfW(Addr) end = 0;
};

// The first object of the list is the main program.
int take_main_program(dl_phdr_info *info, size_t, void *found)
{
    auto *range = static_cast<address_range *>(found);
    for (int i = 0; i < info->dlpi_phnum; i++) {
        const ElfW(Phdr) &segment = info->dlpi_phdr[i];
        if (segment.p_type == PT_LOAD) {
            range->begin = std::min<ElfW(Addr)>(range->begin, info->dlpi_addr + segment.p_vaddr);
            range->end = std::max<ElfW(Addr)>(range->end, info->dlpi_addr + segment.p_vaddr + segment.p_memsz);
        }
    }
    return 1;
}

bool is_daemon(const void *caller)
{
    static const address_range program = [] {
        address_range range;
        dl_iterate_phdr(take_main_program, &range);
        return range;
    }();
    const auto at = reinterpret_cast<ElfW(Addr)>(caller);
    return at >= program.begin && at < program.end;
}

int led_file = -1; // as the recording numbers it; one thread runs at a time

const std::string &take(const char *call, auto write)
{
    trace_line line;
    trace_begin(line, call);
    write(line);
    return replay_take(line);
}

void no_arguments(trace_line &) {}

long long take_number(const char *call)
{
    return strtoll(take(call, no_arguments).c_str() + strlen(") = "), nullptr, 10);
}

void take_sleep(const char *call, unsigned amount)
{
    take(call, [&](trace_line &line) { trace_add(line, "%u", amount); });
    replay_wait_for_turn();
}

int take_text(const char *call, const char *text)
{
    return parse_answer(take(call, [&](trace_line &line) { trace_text(line, text); })).result;
}
} // namespace

#define IS_DAEMON is_daemon(__builtin_return_address(0))

extern "C" {

time_t time(time_t *result) noexcept
{
    if (!IS_DAEMON) {
        return next().time(result);
    }
    const auto now = static_cast<time_t>(take_number("time"));
    if (result) {
        *result = now;
    }
    return now;
}

unsigned sleep(unsigned seconds)
{
    take_sleep("sleep", seconds);
    return 0;
}

int usleep(useconds_t microseconds)
{
    take_sleep("usleep", microseconds);
    return 0;
}

pthread_t pthread_self() noexcept
{
    return IS_DAEMON ? static_cast<pthread_t>(take_number("pthread_self")) : next().pthread_self();
}

int open(const char *path, int flags, ...)
{
    va_list arguments;
    va_start(arguments, flags);
    const int mode = flags & O_CREAT ? va_arg(arguments, int) : 0;
    va_end(arguments);
    if (strncmp(path, KERNEL_LEDS, strlen(KERNEL_LEDS)) != 0 || !IS_DAEMON) {
        return next().open(path, flags, mode);
    }
    led_file = take_text("open", path);
    return led_file;
}

ssize_t read(int fd, void *buffer, size_t size)
{
    if (fd != led_file || !IS_DAEMON) {
        return next().read(fd, buffer, size);
    }
    const answer told = parse_answer(take("read", [&](trace_line &line) { trace_add(line, "%d, %zu", fd, size); }));
    const std::vector<std::string> texts = quoted_texts(told.rest);
    if (!texts.empty()) {
        memcpy(buffer, texts[0].data(), std::min(texts[0].size(), size));
    }
    return told.result;
}

int close(int fd)
{
    if (fd == led_file && IS_DAEMON) {
        led_file = -1;
        return 0;
    }
    return next().close(fd);
}

int system(const char *command)
{
    return take_text("system", command);
}

int pthread_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *), void *argument) noexcept
{
    if (!IS_DAEMON) {
        return next().pthread_create(id, attributes, body, argument);
    }
    if (replay_next_is("pthread_create")) {
        return parse_answer(take("pthread_create", no_arguments)).result;
    }
    return replay_create(id, attributes, body, argument);
}

// The lock went to the thread whose calls come first in the recording.
int pthread_mutex_lock(pthread_mutex_t *mutex) noexcept
{
    if (IS_DAEMON) {
        replay_wait_for_turn();
    }
    return next().pthread_mutex_lock(mutex);
}

int sem_wait(sem_t *)
{
    replay_rest();
}

int pause()
{
    replay_rest();
}

int uloop_run_timeout(int)
{
    replay_serve_loop();
}

void uloop_run()
{
    replay_serve_loop();
}

void kiv_mem_set(void *dest, int value, size_t size)
{
    memset(dest, value, size);
}

void kiv_mem_cpy(void *dest, const void *src, size_t size)
{
    memcpy(dest, src, size);
}
}
