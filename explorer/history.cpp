#include "history.h"

#include "language/words.h"
#include "seen/observed.h"

#include <algorithm>
#include <sstream>

namespace
{
constexpr size_t COMMENT_WIDTH = 116;

struct due_timer {
    size_t kind = 0;
    size_t instance = 0;
    int64_t due_ms = INT64_MAX;
};

// The next timer to fire, of one purpose or of all.
due_timer next_due(std::optional<timer_purpose> purpose)
{
    due_timer next;
    for (size_t kind = 0; kind < known_timers().size(); kind++) {
        if (purpose && known_timers()[kind].purpose != *purpose) {
            continue;
        }
        for (size_t instance = 0; instance < TIMERS_OF_A_KIND; instance++) {
            const int64_t due_ms = timing.due_ms[kind][instance];
            if ((world.timers[kind] >> instance & 1) != 0 && due_ms < next.due_ms) {
                next = {kind, instance, due_ms};
            }
        }
    }
    return next;
}

void pass_until(int64_t end_ms)
{
    for (due_timer next = next_due({}); next.due_ms <= end_ms; next = next_due({})) {
        timing.now_ms = next.due_ms;
        fire_instance(next.kind, next.instance);
    }
    timing.now_ms = end_ms;
}

std::string as_duration(int64_t ms)
{
    return ms % 1000 == 0 ? std::to_string(ms / 1000) + "s" : std::to_string(ms) + "ms";
}

// All that is lit.
std::string as_expectation()
{
    led_looks leds;
    std::transform(world.leds.begin(), world.leds.end(), leds.begin(), look_at);
    return expect_lit(leds) + "\n";
}

// Statements one by one, each as it stands; time passes by the clock.
void play(const stimulus &what, unsigned product)
{
    for (const action &one : what.actions) {
        apply({.text = {}, .actions = {one}, .fires = {}}, product);
        if (one.what == verb::AFTER) {
            pass_until(timing.now_ms + one.number / NS_PER_MS);
        }
    }
}

bool play_timer(timer_purpose purpose, std::string &text)
{
    const due_timer next = next_due(purpose);
    if (next.due_ms == INT64_MAX) {
        return false;
    }
    text += "after " + as_duration(next.due_ms - timing.now_ms) + "\n";
    pass_until(next.due_ms);
    return true;
}

bool play_step(const stimulus &what, unsigned product, std::string &text)
{
    if (what.fires) {
        return play_timer(*what.fires, text);
    }
    text += what.text + (what.text.ends_with('\n') ? "" : "\n");
    play(what, product);
    return true;
}

bool shows(unsigned product, const breach &what)
{
    if (what.broken == NO_NOISE || what.broken == NO_TRAP) {
        return true;
    }
    if (what.broken == HEALING || what.broken == FAILURES_HEAL || what.broken == NIGHT_IS_DIM) {
        return world.leds[static_cast<size_t>(what.led)] == what.shown;
    }
    std::vector<breach> found;
    check_state(product, found);
    return std::any_of(found.begin(), found.end(), [&](const breach &here) {
        return here.broken == what.broken && here.led == what.led && here.timer == what.timer;
    });
}

unsigned timers_running()
{
    unsigned running = 0;
    for (size_t kind = 0; kind < known_timers().size(); kind++) {
        running += running_of(kind);
    }
    return running;
}

// What the properties of timers and requests look at, in a scenario's words.
std::string last_words(const breach &what)
{
    if (what.broken == TIMERS_KEPT) {
        return "expect timers " + std::to_string(timers_running()) + "\n";
    }
    return what.broken == NO_NOISE ? "expect requests " + std::to_string(happened.led_requests) + "\n" : "";
}
// A line of the device's furniture, as far as the daemon has read what it sets.
std::string needed_of(const std::string &line)
{
    std::istringstream words(line);
    std::string what;
    std::string kept;
    words >> what;
    if (what == "battery" || what == "charger") {
        return was_read("bsp/" + what) ? line + "\n" : "";
    }
    if (what != "nv") {
        return line + "\n";
    }
    for (std::string word; words >> word;) {
        kept += was_read("nv/" + word.substr(0, word.find('='))) ? " " + word : "";
    }
    return kept.empty() ? "" : what + kept + "\n";
}

std::string needed_furniture(unsigned product)
{
    std::istringstream lines(furniture(product));
    std::string needed;
    for (std::string line; std::getline(lines, line);) {
        needed += needed_of(line);
    }
    return needed;
}
} // namespace

told_history tell_history(unsigned product, const std::vector<stimulus> &alphabet, const std::vector<size_t> &history,
                          const std::string &epilogue, const breach &what)
{
    told_history told;
    bool is_played = true;
    furnish(product);
    timing = {};
    told.text = "start\n";
    apply(stimulus_of("start"), product);
    told.text += as_expectation();
    for (const size_t step : history) {
        is_played &= play_step(alphabet[step], product, told.text);
        told.text += as_expectation();
    }
    if (!epilogue.empty()) {
        happened = {};
        is_played &= play_step(stimulus_of(epilogue), product, told.text);
        told.text += as_expectation();
    }
    told.text = needed_furniture(product) + told.text + last_words(what);
    told.shows = is_played && shows(product, what);
    return told;
}

std::string as_comment(std::string_view text)
{
    std::string comment;
    while (text.size() > COMMENT_WIDTH) {
        const size_t end = text.rfind(' ', COMMENT_WIDTH);
        comment += "# " + std::string(text.substr(0, end)) + "\n";
        text.remove_prefix(end + 1);
    }
    return comment + "# " + std::string(text) + "\n";
}
