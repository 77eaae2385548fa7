#include "explore.h"

#include "history.h"
#include "oddities.h"

#include "ground/led_ctx.h"
#include "kiv/adabsp.h"

#include <algorithm>
#include <chrono>
#include <cstring>
#include <random>
#include <unistd.h>
#include <unordered_map>

volatile sig_atomic_t is_interrupted;

namespace
{
constexpr uint64_t STATES_BETWEEN_REPORTS = 1 << 16;

struct searching {
    search_plan plan;
    std::vector<stimulus> alphabet;
    state_store store;
    search_result result;
    std::unordered_map<std::string, led_picture> healed; // by NV and clock: the picture after a power cycle
    std::chrono::steady_clock::time_point since;
};

std::vector<size_t> history_of(const searching &in, state_place place)
{
    std::vector<size_t> history;
    for (; parent_of(in.store, place) != NO_STATE; place = parent_of(in.store, place)) {
        history.push_back(stimulus_into(in.store, place));
    }
    std::reverse(history.begin(), history.end());
    return history;
}

std::string name_of(const breach &what)
{
    return "unknown " + std::to_string(what.broken) + " " + subject_of(what);
}

// A breach in the state at place, or on the step from it by a stimulus.
void note(searching &in, const breach &what, state_place place, std::optional<size_t> step, const std::string &epilogue)
{
    const oddity *known = oddity_of(in.plan.product, what);
    const bool after_failures = (in.plan.families & FAULTS) != 0;
    if (after_failures && what.broken != FAILURES_HEAL && what.broken != NO_TRAP) {
        return; // what a refused request leaves unlit or lit is no breach until a power cycle has left it so
    }
    finding &entry = in.result.findings[known != nullptr ? std::string(known->name) : name_of(what)];
    if (entry.times++ > 0) {
        return;
    }
    entry.what = what;
    entry.oddity = known != nullptr ? known->name : "";
    entry.history = history_of(in, place);
    if (step) {
        entry.history.push_back(*step);
    }
    entry.epilogue = epilogue;
}

// The LEDs that stand differently from the picture, in the given places.
void compare_pictures(const led_picture &wanted, property broken, unsigned product, std::vector<breach> &found)
{
    for (size_t led = 0; led < wanted.size(); led++) {
        if (world.leds[led] != wanted[led] && !is_told_by_notification(product, static_cast<int>(led))) {
            found.push_back(
                {.broken = broken, .led = static_cast<int>(led), .shown = world.leds[led], .due = wanted[led]});
        }
    }
}

std::string nv_and_clock()
{
    std::string key(reinterpret_cast<const char *>(world.texts.data()), world.texts.size());
    key += static_cast<char>(world.hour);
    return key;
}

// The picture that NV and the clock lead to: the first history that comes by says which.
void check_healed(searching &in, state_place place, const std::string &epilogue)
{
    const auto [known, is_first] = in.healed.try_emplace(nv_and_clock(), world.leds);
    if (is_first) {
        return;
    }
    std::vector<breach> found;
    const bool after_failures = (in.plan.families & FAULTS) != 0;
    compare_pictures(known->second, after_failures ? FAILURES_HEAL : HEALING, in.plan.product, found);
    for (const breach &what : found) {
        note(in, what, place, {}, epilogue);
    }
}

void check_healing(searching &in, state_place place, const snapshot &state)
{
    restart_and_switch_on(in.plan.product);
    check_healed(in, place, text_of_restarting(in.plan.product));
    put_back(state);
    if (has_power_events(in.plan.product)) {
        switch_off_and_on(in.plan.product);
        check_healed(in, place, text_of_switching(in.plan.product));
        put_back(state);
    }
}

void check_new_state(searching &in, state_place place)
{
    static snapshot state;
    std::vector<breach> found;
    check_state(in.plan.product, found);
    for (const breach &what : found) {
        note(in, what, place, {}, "");
    }
    take_snapshot(state);
    check_healing(in, place, state);
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
    restart_and_switch_on(in.plan.product);
    const led_picture wanted = world.leds;
    put_back(morning);
    for (size_t led = 0; led < seen.size(); led++) {
        if (is_gated_at_night(static_cast<int>(led)) && seen[led] != wanted[led]) {
            note(in, {.broken = NIGHT_IS_DIM, .led = static_cast<int>(led), .shown = seen[led], .due = wanted[led]},
                 from, step, "after 20s\n");
        }
    }
}

void take_step(searching &in, state_place from, size_t step)
{
    const stimulus &what = in.alphabet[step];
    const bool was_night = is_night();
    if (!apply(what, in.plan.product)) {
        return;
    }
    if (was_night && !is_night() && is_on_and_awake() && world.refused == 0 && !is_reminding()) {
        check_morning(in, from, step);
    }
    in.result.transitions++;
    const found_state reached = add_state(in.store, from, step);
    if (what.indication) {
        check_repetition(in, from, step);
    }
    if (reached.is_new) {
        check_new_state(in, reached.place);
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

void explore_state(searching &in, state_place place)
{
    static snapshot from;
    read_state(in.store, place, from);
    for (size_t step = 0; step < in.alphabet.size(); step++) {
        put_back(from);
        take_step(in, place, step);
    }
}

bool leads_to_a_mark(searching &in, state_place place)
{
    static snapshot from;
    read_state(in.store, place, from);
    for (size_t step = in.alphabet.size(); step-- > 0;) {
        put_back(from);
        if (apply(in.alphabet[step], in.plan.product) && is_marked(in.store, find_state(in.store))) {
            return true;
        }
    }
    return false;
}

// Marks every state that leads back to the first one; passes over the states until none is added.
void check_traps(searching &in)
{
    bool added = true;
    mark(in.store, 0);
    while (added && is_interrupted == 0) {
        added = false;
        for (state_place at = 0; at < in.store.used; at = next_state(in.store, at)) {
            if (!is_marked(in.store, at) && leads_to_a_mark(in, at)) {
                mark(in.store, at);
                added = true;
            }
        }
    }
    for (state_place at = 0; at < in.store.used && is_interrupted == 0; at = next_state(in.store, at)) {
        if (!is_marked(in.store, at)) {
            note(in, {.broken = NO_TRAP}, at, {}, "");
        }
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
        return last != nullptr && last->what == act::TELL && last->module != 0 && last->module != KIV_MODULE_SLEEP &&
               !is_registered(last->module, last->event);
    });
}

// Whether a history leads to something that nobody knows under that name.
bool leads_to(searching &in, const std::vector<size_t> &history, const snapshot &start, const std::string &name)
{
    std::vector<breach> found;
    put_back(start);
    for (const size_t step : history) {
        apply(in.alphabet[step], in.plan.product);
    }
    check_state(in.plan.product, found);
    return std::any_of(found.begin(), found.end(), [&](const breach &what) {
        return oddity_of(in.plan.product, what) == nullptr && name_of(what) == name;
    });
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

// Known oddities are left to the searches, which find their shortest histories.
void check_walk(searching &in, const std::vector<size_t> &path, const snapshot &start)
{
    static snapshot here;
    std::vector<breach> found;
    check_state(in.plan.product, found);
    for (const breach &what : found) {
        if (oddity_of(in.plan.product, what) != nullptr) {
            continue;
        }
        const std::string name = name_of(what);
        finding &entry = in.result.findings[name];
        if (entry.times++ == 0) {
            take_snapshot(here);
            entry.what = what;
            entry.history = path;
            shorten(in, entry.history, start, name);
            put_back(here);
        }
    }
}

// Everything together, at random but the same on every run: walks from the first state.
void walk(searching &in)
{
    constexpr uint64_t WALK_STEPS = 2000;
    std::mt19937 random(in.plan.product);
    std::vector<size_t> path;
    snapshot start;
    take_snapshot(start);
    while (in.result.transitions < in.plan.steps && is_interrupted == 0) {
        put_back(start);
        path.clear();
        while (path.size() < WALK_STEPS) {
            const size_t step = random() % in.alphabet.size();
            happened = {};
            if (apply(in.alphabet[step], in.plan.product)) {
                path.push_back(step);
                check_walk(in, path, start);
            }
        }
        in.result.transitions += path.size();
        report_progress(in, in.store.used);
    }
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
    searching in = {.plan = plan, .alphabet = {}, .store = {}, .result = {}, .healed = {}, .since = {}};
    in.since = std::chrono::steady_clock::now();
    in.alphabet = alphabet_of(plan.product, plan.families);
    open_store(in.store);
    furnish(plan.product);
    apply(stimulus_of("start"), plan.product);
    drop_unheard(in.alphabet);
    check_new_state(in, add_state(in.store, NO_STATE, 0).place);
    if (plan.steps != 0) {
        walk(in);
    } else {
        in.result.complete = explore_all(in);
    }
    if (in.result.complete) {
        check_traps(in);
    }
    in.result.plan = plan;
    in.result.stimuli = in.alphabet.size();
    in.result.interrupted = is_interrupted != 0;
    in.result.states = in.store.states;
    tell_findings(in);
    in.result.bytes = in.store.used + in.store.table.size() * sizeof(uint64_t);
    in.result.seconds = std::chrono::duration<double>(std::chrono::steady_clock::now() - in.since).count();
    close_store(in.store);
    return in.result;
}
