#include "trace/line.h"

#include <atomic>
#include <cstdio>
#include <unistd.h>

static thread_local char label[12];
static std::atomic<int> other_threads{0};
static std::atomic<bool> receiver_known{false};

static bool is_main_thread()
{
    return gettid() == getpid();
}

void trace_label(const char *name)
{
    if (!is_main_thread()) {
        snprintf(label, sizeof label, "%s", name);
    }
}

void trace_label_receiver()
{
    if (!is_main_thread() && !receiver_known.exchange(true)) {
        trace_label("receive");
    }
}

const char *trace_thread()
{
    if (label[0] != '\0') {
        return label;
    }
    if (is_main_thread()) {
        snprintf(label, sizeof label, "main");
    } else {
        snprintf(label, sizeof label, "t%d", ++other_threads);
    }
    return label;
}
