#include "evidence/show.h"

#include "evidence/statements.h"

#include <utility>

namespace
{
constexpr int64_t MOMENT_US = 20'000; // what a stimulus does at once takes a real device less than that

// A process begins with its head, or, in a trace without heads, with the first line.
bool begins_process(const recording &trace, size_t at)
{
    return at == 0 || is_head(trace.entries[at]);
}

void end_step(timeline &line, const observed &state, std::vector<shown_step> &steps)
{
    timeline_flush(line, state);
    if (!steps.empty()) {
        steps.back().changes = std::move(line.changes);
    }
    line.changes.clear();
    line.requests.clear();
}

void put_stimulus(timeline &line, const trace_entry &entry, const std::string &text, std::vector<shown_step> &steps)
{
    timeline_stimulus(line, entry.time_us, text);
    line.moment_us = entry.time_us;
    steps.push_back({.time_us = entry.time_us, .stimulus = text, .changes = {}});
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

std::vector<shown_step> show_recording(const recording &trace, const show_options &options, FILE *out)
{
    timeline line;
    observed state;
    std::vector<shown_step> steps;
    int64_t begun_us = 0;
    line.out = out;
    line.every_request = options.every_request;
    line.moment_length_us = MOMENT_US;
    for (size_t at = 0; at < trace.entries.size(); at++) {
        const trace_entry &entry = trace.entries[at];
        begun_us = begins_process(trace, at) ? entry.time_us : begun_us;
        const std::string text = text_for(trace, at, begun_us);
        if (!text.empty()) {
            end_step(line, state, steps);
            put_stimulus(line, entry, shortened(text), steps);
            state.step.clear();
        }
        timeline_entry(line, state, entry);
        observe(state, entry);
    }
    end_step(line, state, steps);
    fprintf(out, "%zu lines%s, to %s\n", trace.entries.size(), trace.cut ? " and half a one" : "",
            moment(trace.entries.back().time_us).c_str());
    return steps;
}
