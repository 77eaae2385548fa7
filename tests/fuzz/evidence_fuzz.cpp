// Everything that reads a trace, over any text.
#include "evidence/show.h"
#include "evidence/story.h"
#include "evidence/why.h"

#include <cstdint>
#include <cstdlib>

extern "C" int LLVMFuzzerInitialize(int *argc, char ***argv);
extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size);

static FILE *nowhere;

int LLVMFuzzerInitialize(int *, char ***)
{
    nowhere = std::fopen("/dev/null", "we");
    return nowhere == nullptr ? 1 : 0;
}

int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string text(reinterpret_cast<const char *>(data), size);
    recording trace;
    std::string error;
    if (!parse_recording(text, "input", trace, error)) {
        return error.starts_with("input:") ? 0 : (std::abort(), 1);
    }
    show_recording(trace, {}, nowhere);
    story_of(trace);
    const history told = history_of(trace);
    for (int led = 0; led < LED_ID_COUNT; led++) {
        if (!led_name(led).empty() && why(told, led, trace.entries.size()).empty()) {
            std::abort();
        }
        why_always(told, led);
    }
    return 0;
}
