// Writes the platform calls of every case as straight code: record_calls FILE
#include "cases.h"
#include "record_platform.h"

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <string>

constexpr char HEAD[] = R"(#include "straight_calls.h"

#include "kiv/adabsp.h"
#include "kiv/ipc.h"
#include "kiv/led.h"
#include "kiv/log.h"
#include "kiv/nv.h"
#include "kiv/socket.h"

static const svc_msg answer_message = {};
[[maybe_unused]] static void callback(void *) {}

)";

static std::string record(const bench_case &which, const received_message &received)
{
    recorded.clear();
    recording = true;
    hear(which, received);
    recording = false;
    return recorded;
}

static std::string function_of(const std::string &name, const std::string &statements)
{
    return "static void " + name +
           "()\n{\n    [[maybe_unused]] int result;\n    [[maybe_unused]] char text[128];\n"
           "    [[maybe_unused]] bsp_query_result answer;\n" +
           statements + "}\n\n";
}

static bool has_led_or_query(const std::string &statements)
{
    return statements.find("kiv_bsp_") != std::string::npos || statements.find("kiv_nv") != std::string::npos ||
           statements.find("kiv_timer") != std::string::npos;
}

// Appends the case's functions and its row; false when the case is not steady or does nothing.
static bool append_case(size_t index, const bench_case &which, std::string &functions, std::string &rows)
{
    case_messages messages;
    settle(which, messages);
    const std::string first = record(which, messages[0]);
    const std::string second = record(which, messages[1]);
    const bool steady = record(which, messages[0]) == first && record(which, messages[1]) == second;
    if (!steady || !has_led_or_query(first + second)) {
        std::fprintf(stderr, "error: %s %s\n", which.name, steady ? "shows nothing" : "is not the same every time");
        return false;
    }
    const std::string both = first + second;
    const auto calls = std::count(both.begin(), both.end(), '(');
    const std::string name = "case_" + std::to_string(index);
    functions += function_of(name + "a", first) + function_of(name + "b", second);
    rows += "    straight_case{{" + name + "a, " + name + "b}, " + std::to_string(calls) + "},\n";
    return true;
}

int main(int argc, char **argv)
{
    std::string functions;
    std::string rows;
    size_t index = 0;
    for (const bench_case &which : bench_cases()) {
        if (!append_case(index++, which, functions, rows)) {
            return EXIT_FAILURE;
        }
    }
    std::FILE *file = argc == 2 ? std::fopen(argv[1], "w") : nullptr;
    if (file == nullptr) {
        std::fprintf(stderr, "error: record_calls FILE\n");
        return EXIT_FAILURE;
    }
    std::fprintf(file, "%s%sconstexpr std::array cases = {\n%s};\n\n", HEAD, functions.c_str(), rows.c_str());
    std::fprintf(file, "std::span<const straight_case> straight_cases()\n{\n    return cases;\n}\n");
    return std::fclose(file) == 0 ? EXIT_SUCCESS : EXIT_FAILURE;
}
