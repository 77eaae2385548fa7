// The visited states, kept exactly: of each the bytes that are not the same in all of them, in one stretch of memory
// and in the order in which they were found, so that reading on from a state is exploring breadth first.
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
    snapshot constant;             // all bits set in each byte in which no state differs from the first one so far
    std::vector<uint16_t> columns; // the other bytes, in the order in which they were seen to differ
};

struct found_state {
    state_place place;
    bool is_new;
};

void open_store(state_store &store); // empty. Aborts when no address space is to be had
void close_store(state_store &store);
uint64_t bytes_of(const state_store &store);

// Looks a state up, or adds it: reached from parent by a stimulus.
found_state add_state(state_store &store, const snapshot &now, state_place parent, size_t stimulus);
state_place find_state(state_store &store, const snapshot &now); // NO_STATE when it is not there

size_t differing_bytes(const state_store &store, const snapshot &now); // from the first state

void read_state(const state_store &store, state_place place, snapshot &into);
state_place next_state(const state_store &store, state_place place); // store.used behind the last
state_place parent_of(const state_store &store, state_place place);  // NO_STATE for the first
size_t stimulus_into(const state_store &store, state_place place);
