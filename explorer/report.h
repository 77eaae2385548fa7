// What many searches have found, together: the document, the scenarios and the words for a terminal.
#pragma once

#include "explore.h"

#include <cstdio>

// What is found of an oddity in all searches.
struct known_oddity {
    std::string name;
    search_plan plan; // of the shortest history
    const finding *shortest = nullptr;
    uint64_t times = 0;
};

struct report {
    std::vector<search_result> results; // in the order in which they were planned
};

bool all_hold(const report &all); // nothing but known oddities broke a property

std::vector<known_oddity> oddities_in(const report &all);
std::string scenario_of(const known_oddity &known); // whole, with the product owner's words

std::string document_of(const report &all);
void print_row(FILE *out, const search_result &result);
void print_unknown(FILE *out, const report &all); // with their histories, as scenarios
