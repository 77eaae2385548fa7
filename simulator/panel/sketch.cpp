#include "panel/sketch.h"

#include "language/words.h"

#include <algorithm>

namespace
{
void draw_changes(run_picture &picture, int step, const std::vector<led_event> &changes)
{
    for (const led_event &change : changes) {
        picture.changes.push_back({
            {change.time_us, step},
            change.led, change.look
        });
        picture.end_us = std::max(picture.end_us, change.time_us);
    }
}

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
    draw_changes(s.picture, s.step, did.changes);
    s.step_is_seen |= what.what == verb::EXPECT || !did.changes.empty();
    s.picture.end_us = did.end_ns / NS_PER_US;
}

run_picture picture_of(const std::vector<shown_step> &steps, const std::string &title)
{
    run_picture picture;
    picture.title = title;
    for (size_t at = 0; at < steps.size(); at++) {
        const int step = static_cast<int>(at);
        picture.end_us = std::max(picture.end_us, steps[at].time_us);
        picture.marks.push_back({
            mark_kind::STIMULUS, {steps[at].time_us, step},
             steps[at].stimulus
        });
        draw_changes(picture, step, steps[at].changes);
    }
    return picture;
}
