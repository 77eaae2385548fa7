#include "explore.h"

#include "history.h"
#include "search.h"

#include "ground/led_ctx.h"
#include "kiv/adabsp.h"

#include <algorithm>
#include <chrono>
#include <cstring>

volatile sig_atomic_t is_interrupted;

namespace
{
constexpr uint64_t STATES_BETWEEN_REPORTS = 1 << 16;

void check_new_state(searching &in, state_place place)
{
    check_here(in, place);
    check_healing(in, place);
}

bool same_snapshot(const snapshot &one, const snapshot &other)
{
    return memcmp(one.bytes.data(), other.bytes.data(), snapshot_size()) == 0;
}

// The indication again, in the state to which it has just led.
void check_repetition(searching &in, state_place from, size_t step)
{
    static snapshot once;
    static snapshot twice;
    take_snapshot(once);
    happened = {};
    apply(in.alphabet[step], in.plan.product);
    take_snapshot(twice);
    if (!same_snapshot(once, twice) || happened.led_requests > 0) {
        note(in, {.broken = NO_NOISE, .said = in.alphabet[step].text}, from, step, in.alphabet[step].text + "\n");
    }
    put_back(once);
}

// The night has just ended: what it gated stands as in a device that has just been switched on.
void check_morning(searching &in, state_place from, size_t step)
{
    static snapshot morning;
    take_snapshot(morning);
    fire_timer_of(timer_purpose::TEMPERATURE);
    const led_picture seen = world.leds;
    restart_and_switch_on(in.cycles);
    const led_picture wanted = world.leds;
    put_back(morning);
    for (size_t led = 0; led < seen.size(); led++) {
        if (is_gated_at_night(static_cast<int>(led)) && seen[led] != wanted[led]) {
            note(in, {.broken = NIGHT_IS_DIM, .led = static_cast<int>(led), .shown = seen[led], .due = wanted[led]},
                 from, step, "after 20s\n");
        }
    }
}

// Most stimuli change nothing: then there is no need to look the state up.
found_state reach(searching &in, state_place place, const snapshot &from, size_t step)
{
    static snapshot now;
    take_snapshot(now);
    return same_snapshot(now, from) ? found_state{place, false} : add_state(in.store, now, place, step);
}

// Where the step leads; NO_STATE when it cannot be taken.
state_place take_step(searching &in, state_place place, const snapshot &from, size_t step)
{
    const stimulus &what = in.alphabet[step];
    const bool was_night = is_night();
    if (!apply(what, in.plan.product)) {
        return NO_STATE;
    }
    if (was_night && !is_night() && is_on_and_awake() && world.refused == 0 && !is_reminding()) {
        check_morning(in, place, step);
    }
    in.result.transitions++;
    const bool is_quiet = happened.led_requests == 0;
    const found_state reached = reach(in, place, from, step);
    if (what.indication && !(is_quiet && reached.place == place)) {
        check_repetition(in, place, step);
    }
    if (reached.is_new) {
        check_new_state(in, reached.place);
    }
    return reached.place;
}

void explore_state(searching &in, state_place place)
{
    static snapshot from;
    state_place earliest = NO_STATE;
    read_state(in.store, place, from);
    for (size_t step = 0; step < in.alphabet.size(); step++) {
        put_back(from);
        earliest = std::min(earliest, take_step(in, place, from, step));
    }
    if (earliest >= place && place != 0) {
        in.without_return.push_back(place);
    }
}

// Level by level. True at the fixed point.
bool explore_all(searching &in)
{
    state_place level_end = in.store.used;
    uint64_t explored = 0;
    for (state_place at = 0; at < in.store.used; at = next_state(in.store, at)) {
        if (at == level_end) {
            in.result.depth++;
            level_end = in.store.used;
            if (in.plan.most_states != 0 && in.store.states > in.plan.most_states) {
                return false;
            }
        }
        if (is_interrupted != 0) {
            return false;
        }
        explore_state(in, at);
        if (++explored % STATES_BETWEEN_REPORTS == 0) {
            report_progress(in, at);
        }
    }
    return true;
}
// What the product never hears of is not part of its world. Nobody registers for sleep, and everybody is told.
void drop_unheard(std::vector<stimulus> &alphabet)
{
    std::erase_if(alphabet, [](const stimulus &what) {
        const action *last = what.actions.empty() ? nullptr : &what.actions.back();
        return last != nullptr && last->what == verb::SEND && last->module != 0 && last->module != KIV_MODULE_SLEEP &&
               !is_registered(last->module, last->event);
    });
}

void tell_findings(searching &in)
{
    for (auto &[name, entry] : in.result.findings) {
        const told_history told = tell_history(in.plan.product, in.alphabet, entry.history, entry.epilogue, entry.what);
        entry.scenario = told.text;
        entry.shows = told.shows;
    }
}
} // namespace

search_result search(const search_plan &plan)
{
    searching in;
    in.plan = plan;
    in.since = std::chrono::steady_clock::now();
    in.alphabet = alphabet_of(plan.product, plan.families);
    open_store(in.store);
    open_power_cycles(in.cycles, plan.product);
    furnish(plan.product);
    apply(stimulus_of("start"), plan.product);
    drop_unheard(in.alphabet);
    static snapshot first;
    take_snapshot(first);
    check_new_state(in, add_state(in.store, first, NO_STATE, 0).place);
    if (plan.steps != 0) {
        walk(in);
    } else {
        in.result.complete = explore_all(in);
        check_traps(in);
    }
    in.result.plan = plan;
    in.result.stimuli = in.alphabet.size();
    in.result.interrupted = is_interrupted != 0;
    in.result.states = in.store.states;
    tell_findings(in);
    in.result.bytes = bytes_of(in.store) + bytes_of(in.cycles.switched_off);
    in.result.seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - in.since).count();
    close_store(in.store);
    close_store(in.cycles.switched_off);
    return in.result;
}
