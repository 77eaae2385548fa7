#include "oddities.h"
#include "search.h"

#include <algorithm>
#include <random>

namespace
{
bool has_unknown(unsigned product, const std::vector<breach> &found, const std::string &name)
{
    return std::any_of(found.begin(), found.end(), [&](const breach &what) {
        return oddity_of(product, what) == nullptr && name_of(what) == name;
    });
}

// Whether a history leads to something that nobody knows under that name.
bool leads_to(searching &in, const std::vector<size_t> &history, const snapshot &start, const std::string &name)
{
    static snapshot end;
    std::vector<breach> found;
    put_back(start);
    for (const size_t step : history) {
        apply(in.alphabet[step], in.plan.product);
    }
    check_state(in.plan.product, found);
    bool leads = has_unknown(in.plan.product, found, name);
    take_snapshot(end);
    for (const power_cycle &cycle : in.cycles.ways) {
        switch_off(in.cycles, cycle);
        std::vector<breach> unhealed = switch_on(in.cycles, cycle);
        for (breach &what : unhealed) {
            what.broken = is_after_failures(in) ? FAILURES_HEAL : HEALING;
        }
        leads |= has_unknown(in.plan.product, unhealed, name);
        put_back(end);
    }
    return leads;
}

// Leaves out every step that is not needed.
void shorten(searching &in, std::vector<size_t> &history, const snapshot &start, const std::string &name)
{
    for (size_t at = history.size(); at-- > 0;) {
        std::vector<size_t> shorter = history;
        shorter.erase(shorter.begin() + static_cast<std::ptrdiff_t>(at));
        if (leads_to(in, shorter, start, name)) {
            history = std::move(shorter);
        }
    }
}

void walk_from(searching &in, const snapshot &start, std::mt19937 &random)
{
    constexpr uint64_t STEPS = 2000;
    constexpr uint64_t STEPS_BETWEEN_POWER_CYCLES = 50;
    put_back(start);
    in.path.clear();
    while (in.path.size() < STEPS) {
        const size_t step = random() % in.alphabet.size();
        if (!apply(in.alphabet[step], in.plan.product)) {
            continue;
        }
        in.path.push_back(step);
        if (!is_after_failures(in)) {
            check_here(in, NO_STATE);
        }
        if (in.path.size() % STEPS_BETWEEN_POWER_CYCLES == 0) {
            check_healing(in, NO_STATE);
        }
    }
    in.result.transitions += STEPS;
}

} // namespace

// Walks from the first state.
void walk(searching &in)
{
    static snapshot start;
    std::mt19937 random(in.plan.product);
    take_snapshot(start);
    while (in.result.transitions < in.plan.steps && is_interrupted == 0) {
        walk_from(in, start, random);
        report_progress(in, in.store.used);
    }
    for (auto &[name, entry] : in.result.findings) {
        shorten(in, entry.history, start, name);
    }
}
