#include "store.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <sys/mman.h>

namespace
{
constexpr size_t RESERVED = size_t{16} << 30;
constexpr size_t FIRST_TABLE = size_t{1} << 12;
constexpr unsigned TAG_BITS = 24;
constexpr uint64_t TAG_MASK = (uint64_t{1} << TAG_BITS) - 1;
constexpr size_t HEAD_BYTES = 10;

// How a state lies in memory, without gaps; its columns follow.
struct state_head {
    uint16_t size; // of the columns
    uint8_t stimulus;
    uint8_t parent[7]; // its place and 1; 0 for the first state
};
static_assert(sizeof(state_head) == HEAD_BYTES);

// A state's bytes in the columns, up to the last one that differs from the first state's: columns that are found later
// change nothing in it.
struct column_bytes {
    std::array<std::byte, SNAPSHOT_MAX> bytes;
    size_t size;
};

uint64_t word_at(const snapshot &of, size_t at)
{
    uint64_t word;
    memcpy(&word, of.bytes.data() + at, sizeof word);
    return word;
}

bool differs_outside_columns(const state_store &store, const snapshot &now)
{
    const size_t size = snapshot_size();
    uint64_t differing = 0;
    for (size_t at = 0; at < size; at += sizeof differing) {
        differing |= (word_at(store.first, at) ^ word_at(now, at)) & word_at(store.constant, at);
    }
    return differing != 0;
}

void add_columns(state_store &store, const snapshot &now)
{
    for (size_t at = 0; at < snapshot_size(); at++) {
        if (store.first.bytes[at] != now.bytes[at] && store.constant.bytes[at] != std::byte{0}) {
            store.constant.bytes[at] = std::byte{0};
            store.columns.push_back(static_cast<uint16_t>(at));
        }
    }
}

uint64_t hash_of(const std::byte *bytes, size_t size)
{
    uint64_t hash = size * 0x9e3779b97f4a7c15U;
    for (size_t at = 0; at < size; at += sizeof hash) {
        uint64_t word = 0;
        memcpy(&word, bytes + at, std::min(sizeof word, size - at));
        const auto product = static_cast<unsigned __int128>(word ^ hash) * 0xd6e8feb86659fd93U;
        hash = static_cast<uint64_t>(product) ^ static_cast<uint64_t>(product >> 64) ^ 0xa0761d6478bd642fU;
    }
    return hash ^ hash >> 29;
}

state_head head_at(const state_store &store, state_place place)
{
    state_head head;
    memcpy(&head, store.memory + place, sizeof head);
    return head;
}

const std::byte *columns_at(const state_store &store, state_place place)
{
    return store.memory + place + sizeof(state_head);
}

// The slot of a state, or the free one where it belongs.
uint64_t &slot_of(state_store &store, const std::byte *bytes, size_t size, uint64_t hash)
{
    const size_t mask = store.table.size() - 1;
    for (size_t at = hash >> TAG_BITS & mask;; at = (at + 1) & mask) {
        uint64_t &slot = store.table[at];
        if (slot == 0) {
            return slot;
        }
        if ((slot & TAG_MASK) == (hash & TAG_MASK)) {
            const state_place place = (slot >> TAG_BITS) - 1;
            if (head_at(store, place).size == size && memcmp(columns_at(store, place), bytes, size) == 0) {
                return slot;
            }
        }
    }
}

void grow_table(state_store &store)
{
    store.table.assign(store.table.size() * 2, 0);
    const size_t mask = store.table.size() - 1;
    for (state_place place = 0; place < store.used; place = next_state(store, place)) {
        const uint64_t hash = hash_of(columns_at(store, place), head_at(store, place).size);
        size_t at = hash >> TAG_BITS & mask;
        while (store.table[at] != 0) {
            at = (at + 1) & mask;
        }
        store.table[at] = (place + 1) << TAG_BITS | (hash & TAG_MASK);
    }
}

void take_columns(state_store &store, const snapshot &now, column_bytes &out)
{
    if (store.states == 0) {
        store.first = now;
        store.constant.bytes.fill(std::byte{0xff});
        store.columns.clear();
    }
    if (differs_outside_columns(store, now)) {
        add_columns(store, now);
    }
    out.size = store.columns.size();
    for (size_t i = 0; i < out.size; i++) {
        out.bytes[i] = now.bytes[store.columns[i]];
    }
    while (out.size > 0 && out.bytes[out.size - 1] == store.first.bytes[store.columns[out.size - 1]]) {
        out.size--;
    }
}

void append(state_store &store, state_place parent, size_t stimulus, const column_bytes &state)
{
    state_head head = {
        .size = static_cast<uint16_t>(state.size), .stimulus = static_cast<uint8_t>(stimulus), .parent = {}};
    const uint64_t from = parent + 1; // NO_STATE becomes 0
    memcpy(head.parent, &from, sizeof head.parent);
    memcpy(store.memory + store.used, &head, sizeof head);
    memcpy(store.memory + store.used + sizeof head, state.bytes.data(), state.size);
    store.used += sizeof head + state.size;
    store.states++;
}
} // namespace

void open_store(state_store &store)
{
    void *memory = mmap(nullptr, RESERVED, PROT_READ | PROT_WRITE, MAP_PRIVATE | MAP_ANONYMOUS | MAP_NORESERVE, -1, 0);
    if (memory == MAP_FAILED) {
        perror("kiv_led_explore: no address space for the states");
        abort();
    }
    madvise(memory, RESERVED, MADV_HUGEPAGE); // looking states up is reading at random
    store.memory = static_cast<std::byte *>(memory);
    store.used = 0;
    store.states = 0;
    store.table.assign(FIRST_TABLE, 0);
}

void close_store(state_store &store)
{
    munmap(store.memory, RESERVED);
    store.memory = nullptr;
    store.table = {};
}

uint64_t bytes_of(const state_store &store)
{
    return store.used + store.table.size() * sizeof(uint64_t);
}

found_state add_state(state_store &store, const snapshot &now, state_place parent, size_t stimulus)
{
    static column_bytes state;
    take_columns(store, now, state);
    const uint64_t hash = hash_of(state.bytes.data(), state.size);
    uint64_t &slot = slot_of(store, state.bytes.data(), state.size, hash);
    if (slot != 0) {
        return {(slot >> TAG_BITS) - 1, false};
    }
    const state_place place = store.used;
    slot = (place + 1) << TAG_BITS | (hash & TAG_MASK);
    append(store, parent, stimulus, state);
    if (store.states * 2 > store.table.size()) {
        grow_table(store);
    }
    return {place, true};
}

state_place find_state(state_store &store, const snapshot &now)
{
    static column_bytes state;
    take_columns(store, now, state);
    const uint64_t hash = hash_of(state.bytes.data(), state.size);
    const uint64_t slot = slot_of(store, state.bytes.data(), state.size, hash);
    return slot == 0 ? NO_STATE : (slot >> TAG_BITS) - 1;
}

size_t differing_bytes(const state_store &store, const snapshot &now)
{
    return static_cast<size_t>(std::count_if(store.columns.begin(), store.columns.end(),
                                             [&](uint16_t at) { return now.bytes[at] != store.first.bytes[at]; }));
}

void read_state(const state_store &store, state_place place, snapshot &into)
{
    const std::byte *bytes = columns_at(store, place);
    const size_t size = head_at(store, place).size;
    memcpy(into.bytes.data(), store.first.bytes.data(), snapshot_size());
    for (size_t i = 0; i < size; i++) {
        into.bytes[store.columns[i]] = bytes[i];
    }
}

state_place next_state(const state_store &store, state_place place)
{
    return place + sizeof(state_head) + head_at(store, place).size;
}

state_place parent_of(const state_store &store, state_place place)
{
    uint64_t from = 0;
    const state_head head = head_at(store, place);
    memcpy(&from, head.parent, sizeof head.parent);
    return from - 1; // 0 becomes NO_STATE
}

size_t stimulus_into(const state_store &store, state_place place)
{
    return head_at(store, place).stimulus;
}
