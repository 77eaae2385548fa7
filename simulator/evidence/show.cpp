#include "evidence/show.h"

#include "evidence/statements.h"
#include "seen/timeline.h"

namespace
{
constexpr int64_t MOMENT_US = 20'000; // what a stimulus does at once takes a real device less than that

// A process begins with its head, or, in a trace without heads, with the first line.
bool begins_process(const recording &trace, size_t at)
{
    return at == 0 || is_head(trace.entries[at]);
}

void put_stimulus(timeline &line, observed &state, const trace_entry &entry, const std::string &text)
{
    timeline_flush(line, state);
    timeline_stimulus(line, entry.time_us, shortened(text));
    line.moment_us = entry.time_us;
}

// What stands in the timeline for an entry; empty for most.
std::string text_for(const recording &trace, size_t at, int64_t begun_us)
{
    const trace_entry &entry = trace.entries[at];
    if (begins_process(trace, at)) {
        return "start";
    }
    const std::string text = is_own_relight(entry) ? "" : stimulus_of(entry);
    return text == "go" && entry.time_us - begun_us < MOMENT_US ? "" : text;
}
} // namespace

void show_recording(const recording &trace, const show_options &options, FILE *out)
{
    timeline line;
    observed state;
    int64_t begun_us = 0;
    line.out = out;
    line.every_request = options.every_request;
    line.moment_length_us = MOMENT_US;
    for (size_t at = 0; at < trace.entries.size(); at++) {
        const trace_entry &entry = trace.entries[at];
        begun_us = begins_process(trace, at) ? entry.time_us : begun_us;
        const std::string text = text_for(trace, at, begun_us);
        if (!text.empty()) {
            put_stimulus(line, state, entry, text);
            state.step.clear();
        }
        timeline_entry(line, state, entry);
        observe(state, entry);
    }
    timeline_flush(line, state);
    fprintf(out, "%zu lines%s, to %s\n", trace.entries.size(), trace.cut ? " and half a one" : "",
            moment(trace.entries.back().time_us).c_str());
}
