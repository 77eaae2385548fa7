// Everything that reads a trace or a log, over any text.
#include "evidence/from_log.h"
#include "evidence/show.h"
#include "evidence/story.h"
#include "evidence/why.h"

#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerInitialize(int *argc, char ***argv);
extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size);

constexpr size_t LED_STEP = 12;
static FILE *nowhere;

int LLVMFuzzerInitialize(int *, char ***)
{
    nowhere = std::fopen("/dev/null", "we");
    return nowhere == nullptr ? 1 : 0;
}

// A few LEDs for each input, which ones depends on its size.
static void explain(const history &told, size_t size)
{
    for (size_t at = size % LED_STEP; at < led_rows.size(); at += LED_STEP) {
        const int led = led_rows[at].led_id;
        if (why(told, led, told.trace->entries.size()).empty() || why_always(told, led).empty()) {
            std::abort();
        }
    }
}

int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string text(reinterpret_cast<const char *>(data), size);
    recording trace;
    log_history log;
    std::string error;
    if (parse_log(text, "input", log, error)) {
        explain(log.told, size);
    }
    if (!parse_recording(text, "input", trace, error)) {
        return error.starts_with("input:") ? 0 : (std::abort(), 1);
    }
    show_recording(trace, {.every_request = size % 2 == 0}, nowhere);
    story_of(trace);
    explain(history_of(trace), size);
    return 0;
}
