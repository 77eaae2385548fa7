#include "panel/sketch.h"

#include "language/words.h"

namespace
{
void mark(sketch &s, const statement &what, const played &did)
{
    const picture_place place = {did.begin_ns / NS_PER_US, s.step};
    if (did.result != PLAY_HELD) {
        const std::string shown = did.shown.empty() ? "" : ", shown: " + did.shown;
        s.picture.marks.push_back({mark_kind::FAILED, place, what.text + shown});
    } else if (what.what != verb::AFTER) {
        s.picture.marks.push_back(
            {what.what == verb::EXPECT ? mark_kind::HELD : mark_kind::STIMULUS, place, what.text});
    }
}
} // namespace

// Before the daemon is there, the scenario only furnishes the device; time that passes shows by itself.
void add_to_sketch(sketch &s, const statement &what, const played &did)
{
    const bool starts = what.what == verb::START || what.what == verb::LAUNCH;
    if (s.picture.marks.empty() && !starts && did.result == PLAY_HELD) {
        return;
    }
    if (what.what != verb::EXPECT && s.step_is_seen) {
        s.step++;
        s.step_is_seen = false;
    }
    mark(s, what, did);
    for (const led_event &change : did.changes) {
        s.picture.changes.push_back({
            {change.time_us, s.step},
            change.led, change.look
        });
    }
    s.step_is_seen |= what.what == verb::EXPECT || !did.changes.empty();
    s.picture.end_us = did.end_ns / NS_PER_US;
}
