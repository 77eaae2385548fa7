#include "search.h"

#include <queue>

namespace
{
// Whether some way of these stimuli leads to a state that was found before this one. Looks first at what is most like
// the first state, and at no more than so many.
bool leads_back_by(searching &in, state_place place, const std::vector<stimulus> &alphabet, uint64_t most_states)
{
    struct way_on {
        size_t cost; // the steps so far, and as many as bytes differ from the first state
        size_t steps;
        state_place place;
        bool operator<(const way_on &other) const { return cost > other.cost; }
    };
    static snapshot now;
    static snapshot from;
    std::priority_queue<way_on> ahead;
    state_store beyond;
    bool is_back = false;
    open_store(beyond);
    read_state(in.store, place, now);
    ahead.push({0, 0, add_state(beyond, now, NO_STATE, 0).place});
    while (!is_back && !ahead.empty() && beyond.states < most_states) {
        const way_on here = ahead.top();
        ahead.pop();
        read_state(beyond, here.place, from);
        for (const stimulus &what : alphabet) {
            put_back(from);
            if (!apply(what, in.plan.product)) {
                continue;
            }
            take_snapshot(now);
            is_back |= find_state(in.store, now) < place;
            const found_state reached = add_state(beyond, now, NO_STATE, 0);
            if (reached.is_new) {
                const size_t steps = here.steps + 1;
                ahead.push({steps + differing_bytes(in.store, now), steps, reached.place});
            }
        }
    }
    close_store(beyond);
    return is_back;
}

// Most ways back are short. The long ones are of few families, which are tried by themselves first.
bool leads_back(searching &in, state_place place)
{
    constexpr uint64_t FEW_STATES = 1'000;
    constexpr uint64_t MANY_STATES = 200'000;
    const unsigned families = in.plan.families & ~unsigned{POWER};
    unsigned some = 0;
    bool is_back = leads_back_by(in, place, in.alphabet, FEW_STATES);
    do {
        is_back = is_back || leads_back_by(in, place, alphabet_of(in.plan.product, some), MANY_STATES);
        some = (some - families) & families; // the next set of them
    } while (!is_back && some != 0 && is_interrupted == 0);
    return is_back;
}
} // namespace

// When each state leads to one that was found before it, each leads back to the first one.
void check_traps(searching &in)
{
    for (const state_place place : in.without_return) {
        if (!leads_back(in, place) && is_interrupted == 0) {
            note(in, {.broken = NO_TRAP}, place, {}, "");
            return; // it is the first one, and the others may take as long
        }
    }
}
