// Preloaded into the daemon: counts its heap allocations in a file that the watcher reads, and makes its waits a
// hundred times shorter when it is asked to, so that every timer of a day fires within seconds.
#include <atomic>
#include <cstddef>
#include <cstdint>
#include <cstdlib>
#include <dlfcn.h>
#include <fcntl.h>
#include <malloc.h>
#include <sys/mman.h>
#include <time.h>
#include <unistd.h>

extern "C" {
void *__libc_malloc(size_t size);
void *__libc_calloc(size_t count, size_t size);
void *__libc_realloc(void *old, size_t size);
void *__libc_memalign(size_t alignment, size_t size);
int kiv_timer(void (*callback)(void *), void *argument, int period_ms, int repeat);
}

// What the watcher maps, too: the count, and the addresses that asked for the first of them as text.
struct heap_report {
    std::atomic<uint32_t> allocations;
    std::atomic<uint32_t> armed; // written by the watcher: from now on callers are recorded
    std::atomic<uint32_t> recorded;
    uint32_t unused;
    char callers[16][112];
};

static heap_report unseen; // counts until the file is mapped, and without one
static heap_report *report = &unseen;
static unsigned hurry = 1; // how many times faster time passes

using timer_function = int(void (*)(void *), void *, int, int);
static timer_function *real_timer;

static void copy_text(char *to, size_t size, const char *from)
{
    size_t at = 0;

    for (; from != nullptr && from[at] != '\0' && at + 1 < size; at++) {
        to[at] = from[at];
    }
    to[at] = '\0';
}

static void record_caller(void *address)
{
    const uint32_t index = report->recorded.fetch_add(1);
    Dl_info where = {};

    if (index >= 16 || dladdr(address, &where) == 0) {
        return;
    }
    copy_text(report->callers[index], 80, where.dli_fname);
    copy_text(report->callers[index] + 80, 32, where.dli_sname);
}

static void count(void *caller)
{
    report->allocations.fetch_add(1);
    if (report->armed != 0) {
        record_caller(caller);
    }
}

[[gnu::constructor]] static void set_up()
{
    const char *path = std::getenv("KIV_HEAP_REPORT");
    const char *times = std::getenv("KIV_HURRY");
    const int file = path == nullptr ? -1 : open(path, O_RDWR | O_CLOEXEC);

    if (file >= 0) {
        void *mapped = mmap(nullptr, sizeof(heap_report), PROT_READ | PROT_WRITE, MAP_SHARED, file, 0);
        if (mapped != MAP_FAILED) {
            report = static_cast<heap_report *>(mapped);
        }
        close(file);
    }
    if (times != nullptr) {
        hurry = static_cast<unsigned>(std::strtoul(times, nullptr, 10));
    }
    real_timer = reinterpret_cast<timer_function *>(dlsym(RTLD_NEXT, "kiv_timer"));
    unsetenv("LD_PRELOAD"); // the shell that the daemon starts is not watched
}

extern "C" void *malloc(size_t size)
{
    count(__builtin_return_address(0));
    return __libc_malloc(size);
}

extern "C" void *calloc(size_t items, size_t size)
{
    count(__builtin_return_address(0));
    return __libc_calloc(items, size);
}

extern "C" void *realloc(void *old, size_t size)
{
    count(__builtin_return_address(0));
    return __libc_realloc(old, size);
}

extern "C" void *memalign(size_t alignment, size_t size)
{
    count(__builtin_return_address(0));
    return __libc_memalign(alignment, size);
}

extern "C" void *aligned_alloc(size_t alignment, size_t size)
{
    count(__builtin_return_address(0));
    return __libc_memalign(alignment, size);
}

extern "C" unsigned sleep(unsigned seconds)
{
    const timespec wait = {static_cast<time_t>(seconds / hurry),
                           static_cast<long>(seconds % hurry) * (1000000000L / static_cast<long>(hurry))};

    nanosleep(&wait, nullptr);
    return 0;
}

extern "C" int kiv_timer(void (*callback)(void *), void *argument, int period_ms, int repeat)
{
    const int period = period_ms / static_cast<int>(hurry);

    return real_timer(callback, argument, period > 0 ? period : 1, repeat);
}
