// The scenario parser over any text. An include finds the text itself again, so that includes nest; a name with a
// folder grows with every level, until it is long and names an empty file.
#include "language/scenario.h"

#include <cstdint>
#include <cstdio>
#include <cstdlib>

extern "C" int LLVMFuzzerInitialize(int *argc, char ***argv);
extern "C" int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size);

constexpr size_t LONGEST_PATH = 10;

int LLVMFuzzerInitialize(int *, char ***)
{
    return 0;
}

int LLVMFuzzerTestOneInput(const uint8_t *data, size_t size)
{
    const std::string text(reinterpret_cast<const char *>(data), size);
    scenario story;
    std::string error;
    const bool parsed = parse_scenario(
        text, "input.scn",
        [&](const std::string &path, std::string &included) {
            included = path.size() > LONGEST_PATH ? "" : text;
            return !path.ends_with("missing.scn");
        },
        story, error);

    // Who is refused is told where and why.
    const bool located = error.find(".scn:") != std::string::npos || error.find(':') != std::string::npos;
    if (parsed != error.empty() || (!parsed && !located)) {
        std::fprintf(stderr, "parsed %d, error '%s'\n", parsed ? 1 : 0, error.c_str());
        std::abort();
    }
    return 0;
}
