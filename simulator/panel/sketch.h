// A run on its way to its picture.
#pragma once

#include "evidence/show.h"
#include "panel/picture.h"
#include "player.h"

struct sketch {
    run_picture picture;
    int step = 0;
    bool step_is_seen = false; // something has come of it, or was expected
};

// Adds a statement that has been played, in the order of the run.
void add_to_sketch(sketch &s, const statement &what, const played &did);

// The picture of a trace, which knows no expectations.
run_picture picture_of(const std::vector<shown_step> &steps, const std::string &title);
