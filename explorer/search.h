// A search as it goes: what looking for breaches has in common, whether every state is visited or a walk is taken.
#pragma once

#include "explore.h"
#include "healing.h"

#include <chrono>

struct searching {
    search_plan plan;
    std::vector<stimulus> alphabet;
    state_store store;
    std::vector<state_place> without_return; // no single step leads from them to a state that was found before them
    std::vector<size_t> path;                // of a walk, from the first state
    power_cycles cycles;
    search_result result;
    std::chrono::steady_clock::time_point since;
};

std::string name_of(const breach &what); // of one that nobody knows
bool is_after_failures(const searching &in);

// A breach in the state at place, or on the step from it by a stimulus.
void note(searching &in, const breach &what, state_place place, std::optional<size_t> step,
          const std::string &epilogue);
void check_here(searching &in, state_place place);
void check_healing(searching &in, state_place place);
void report_progress(const searching &in, state_place at);

void check_traps(searching &in); // when all states of a search are found
void walk(searching &in);        // everything together, at random but the same on every run
