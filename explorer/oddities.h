// The places where the described behaviour itself breaks a property: known by name, told in a product owner's words.
#pragma once

#include "properties.h"

struct oddity {
    std::string_view name; // also of its scenario
    unsigned products;     // a bit for each
    unsigned breaks;       // a bit for each property
    bool (*is)(const breach &what);
    std::string_view tale; // what is seen, and why
};

std::span<const oddity> all_oddities();
const oddity *oddity_of(unsigned product, const breach &what); // null: nobody knows of it
