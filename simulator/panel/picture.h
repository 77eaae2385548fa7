// A run as a picture: a row for each LED that changes, and what happened to the device above them.
#pragma once

#include "seen/timeline.h"

#include <string>
#include <vector>

enum class mark_kind { STIMULUS, HELD, FAILED };

// Much can happen at one time of the device: what comes after each other then stands beside each other.
struct picture_place {
    int64_t time_us = 0;
    int step = 0; // grows with the time

    auto operator<=>(const picture_place &) const = default;
};

struct picture_mark {
    mark_kind kind = mark_kind::STIMULUS;
    picture_place place;
    std::string text;
};

struct picture_change {
    picture_place place;
    int led = 0;
    led_look look;
};

struct run_picture {
    std::string title;
    std::vector<picture_mark> marks;
    std::vector<picture_change> changes; // in the order of their places
    int64_t end_us = 0;
};

// The picture as SVG. Idle stretches are shortened, with a visible break.
std::string draw_run(const run_picture &run);
