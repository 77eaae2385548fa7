// The platform calls of every case as straight code, one function a message; written by record_calls.
#pragma once

#include <array>
#include <span>

struct straight_case {
    std::array<void (*)(), 2> messages;
    int calls; // of both messages
};

std::span<const straight_case> straight_cases(); // in the order of bench_cases
