// Visits every state of one product under one alphabet, and checks the properties in each.
#pragma once

#include "properties.h"
#include "store.h"

#include <csignal>
#include <map>

struct search_plan {
    unsigned product = UFI;
    unsigned families = POWER;
    uint64_t most_states = 0; // the level that exceeds them is the last; 0: all
    uint64_t steps = 0;       // of a walk at random in place of a search; 0: a search
};

// Where a property broke: the first time is the shortest history.
struct finding {
    breach what;
    std::string oddity;          // by which it is known; empty: it is not
    std::vector<size_t> history; // stimuli of the alphabet, from the start
    std::string epilogue;        // lines that follow the history for it to be seen
    uint64_t times = 0;
    std::string scenario; // the history, played by the clock
    bool shows = false;   // there, too
};

struct search_result {
    search_plan plan;
    uint64_t states = 0;
    uint64_t transitions = 0;
    size_t stimuli = 0;
    unsigned depth = 0;       // levels that are explored whole
    bool complete = false;    // to the fixed point
    bool interrupted = false; // by the user
    uint64_t bytes = 0;
    double seconds = 0;
    std::map<std::string, finding> findings; // by the name of what broke
};

search_result search(const search_plan &plan);

// Set by Ctrl-C: searches come to an end.
extern volatile sig_atomic_t is_interrupted;
