#include "search.h"

#include "oddities.h"

#include <algorithm>
#include <unistd.h>

std::string name_of(const breach &what)
{
    return "unknown " + std::to_string(what.broken) + " " + subject_of(what);
}

bool is_after_failures(const searching &in)
{
    return (in.plan.families & FAILURES) != 0;
}

static std::vector<size_t> history_of(const searching &in, state_place place)
{
    std::vector<size_t> history;
    for (; parent_of(in.store, place) != NO_STATE; place = parent_of(in.store, place)) {
        history.push_back(stimulus_into(in.store, place));
    }
    std::reverse(history.begin(), history.end());
    return history;
}

void note(searching &in, const breach &what, state_place place, std::optional<size_t> step, const std::string &epilogue)
{
    const oddity *known = oddity_of(in.plan.product, what);
    const bool is_walk = in.plan.steps != 0;
    if (is_after_failures(in) && what.broken != FAILURES_HEAL && what.broken != NO_TRAP) {
        return; // what a refused request leaves unlit or lit is no breach until a power cycle has left it so
    }
    if (is_walk && known != nullptr) {
        return; // the searches find its shortest history
    }
    finding &entry = in.result.findings[known != nullptr ? std::string(known->name) : name_of(what)];
    if (entry.times++ > 0) {
        return;
    }
    entry.what = what;
    entry.oddity = known != nullptr ? known->name : "";
    entry.history = is_walk ? in.path : history_of(in, place);
    if (step) {
        entry.history.push_back(*step);
    }
    entry.epilogue = epilogue;
}

void check_here(searching &in, state_place place)
{
    std::vector<breach> found;
    check_state(in.plan.product, found);
    for (const breach &what : found) {
        note(in, what, place, {}, "");
    }
}

// Most states are the same once they are switched off; each of those is switched on once.
void check_healing(searching &in, state_place place)
{
    static snapshot state;
    static snapshot off;
    take_snapshot(state);
    for (const power_cycle &cycle : in.cycles.ways) {
        switch_off(in.cycles, cycle);
        take_snapshot(off);
        if (add_state(in.cycles.switched_off, off, NO_STATE, 0).is_new) {
            for (breach what : switch_on(in.cycles, cycle)) {
                what.broken = is_after_failures(in) ? FAILURES_HEAL : HEALING;
                note(in, what, place, {}, text_of(cycle, is_after_failures(in)));
            }
        }
        put_back(state);
    }
}

void report_progress(const searching &in, state_place at)
{
    if (isatty(STDERR_FILENO) == 0) {
        return;
    }
    const std::chrono::duration<double> took = std::chrono::steady_clock::now() - in.since;
    fprintf(stderr, "\r%s, %s: %lu states, depth %u, %.0f %% of them explored, %.2f million transitions a second ",
            std::string(all_products()[in.plan.product].name).c_str(), family_names(in.plan.families).c_str(),
            in.store.states, in.result.depth, 100.0 * static_cast<double>(at) / static_cast<double>(in.store.used),
            static_cast<double>(in.result.transitions) / took.count() / 1e6);
}
