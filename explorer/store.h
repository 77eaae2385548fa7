// The visited states, kept exactly: each as its difference from the first one, in one stretch of memory and in the
// order in which they were found, so that reading on from a state is exploring breadth first.
#pragma once

#include "daemon.h"

#include <vector>

// Where a state lies. The first one lies at 0.
using state_place = uint64_t;
constexpr state_place NO_STATE = UINT64_MAX;

struct state_store {
    std::byte *memory = nullptr; // reserved address space; only what is written takes memory
    size_t used = 0;
    std::vector<uint64_t> table; // open addressing: place and a tag of the hash; 0 is free
    uint64_t states = 0;
    snapshot first;
};

struct found_state {
    state_place place;
    bool is_new;
};

void open_store(state_store &store); // empty. Aborts when no address space is to be had
void close_store(state_store &store);
uint64_t bytes_of(const state_store &store);

// Looks the world and the daemon as they stand now up, or adds them: reached from parent by a stimulus. The first
// state that is added is the one from which all differences are taken.
found_state add_state(state_store &store, state_place parent, size_t stimulus);

// The place of the state as it stands now, or NO_STATE.
state_place find_state(state_store &store);

void read_state(const state_store &store, state_place place, snapshot &into);
state_place next_state(const state_store &store, state_place place); // store.used behind the last
state_place parent_of(const state_store &store, state_place place);  // NO_STATE for the first
size_t stimulus_into(const state_store &store, state_place place);

// A mark that a pass over the states may leave.
bool is_marked(const state_store &store, state_place place);
void mark(state_store &store, state_place place);
