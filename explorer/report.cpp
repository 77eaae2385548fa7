#include "report.h"

#include "history.h"
#include "oddities.h"

#include <algorithm>
#include <cinttypes>
#include <cstring>

namespace
{
std::string product_of(const search_plan &plan)
{
    return std::string(all_products()[plan.product].name);
}

std::string extent_of(const search_result &result)
{
    if (result.plan.steps != 0) {
        return "at random";
    }
    return result.complete ? "every state" : "to depth " + std::to_string(result.depth);
}

std::string with_commas(uint64_t number)
{
    const std::string digits = std::to_string(number);
    std::string text;
    for (size_t at = 0; at < digits.size(); at++) {
        if (at > 0 && (digits.size() - at) % 3 == 0) {
            text += ',';
        }
        text += digits[at];
    }
    return text;
}

bool breaks(const oddity &row, unsigned which)
{
    return (row.breaks >> which & 1) != 0;
}

const oddity *find_oddity(std::string_view name)
{
    for (const oddity &row : all_oddities()) {
        if (row.name == name) {
            return &row;
        }
    }
    return nullptr;
}

// A history that the clock can play is the better one; then the shorter.
bool is_better(const finding &one, const finding &other)
{
    return one.shows != other.shows ? one.shows : one.history.size() < other.history.size();
}

std::string table_of_searches(const report &all)
{
    std::string text = "| product | what happens, beside power, sleep, night, heat and restarts | stimuli | explored | "
                       "states | transitions |\n| --- | --- | ---: | --- | ---: | ---: |\n";
    for (const search_result &result : all.results) {
        text += "| " + product_of(result.plan) + " | " + family_names(result.plan.families) + " | " +
                std::to_string(result.stimuli) + " | " + extent_of(result) + " | " + with_commas(result.states) +
                " | " + with_commas(result.transitions) + " |\n";
    }
    return text;
}

std::string properties_and_oddities(const report &all)
{
    const std::vector<known_oddity> found = oddities_in(all);
    std::string text;
    for (unsigned which = ONE_COLOUR; which < PROPERTY_COUNT; which++) {
        std::string names;
        for (const known_oddity &known : found) {
            if (breaks(*find_oddity(known.name), which)) {
                names += (names.empty() ? "" : ", ") + ("`" + known.name + "`");
            }
        }
        text += std::to_string(which) + ". " + std::string(property_text(which)) +
                (names.empty() ? ": holds everywhere.\n" : ": holds but for " + names + ".\n");
    }
    return text;
}

std::string list_of_oddities(const report &all)
{
    std::string text;
    for (const known_oddity &known : oddities_in(all)) {
        text += "- `" + known.name + "` (" + product_of(known.plan) + ", " +
                std::to_string(known.shortest->history.size()) +
                " steps): " + std::string(find_oddity(known.name)->tale) + "\n";
    }
    return text;
}
} // namespace

bool all_hold(const report &all)
{
    return std::all_of(all.results.begin(), all.results.end(), [](const search_result &result) {
        return std::all_of(result.findings.begin(), result.findings.end(),
                           [](const auto &entry) { return !entry.second.oddity.empty(); });
    });
}

std::vector<known_oddity> oddities_in(const report &all)
{
    std::vector<known_oddity> found;
    for (const oddity &row : all_oddities()) {
        known_oddity known = {.name = std::string(row.name), .plan = {}};
        for (const search_result &result : all.results) {
            const auto at = result.findings.find(known.name);
            if (at == result.findings.end()) {
                continue;
            }
            known.times += at->second.times;
            if (known.shortest == nullptr || is_better(at->second, *known.shortest)) {
                known.shortest = &at->second;
                known.plan = result.plan;
            }
        }
        if (known.shortest != nullptr) {
            found.push_back(known);
        }
    }
    return found;
}

std::string scenario_of(const known_oddity &known)
{
    return as_comment(find_oddity(known.name)->tale) + known.shortest->scenario;
}

std::string document_of(const report &all)
{
    return "# Every reachable state\n\n"
           "`kiv_led_explore` visits the states that the daemon and its device can reach and checks ten properties in "
           "each. It has written this page; a test keeps it current.\n\n"
           "## The properties\n\n" +
           properties_and_oddities(all) +
           "\n## The oddities\n\n"
           "Where the described behaviour itself breaks a property, and how few steps it takes to see it. Each is a "
           "scenario of its name in `scenarios/oddities/`, the shortest there is.\n\n" +
           list_of_oddities(all) +
           "\n## What was explored\n\n"
           "Every state means that there are no others: each stimulus leads from each of them to one of them; "
           "otherwise "
           "every history up to a number of steps was played. A value in NV changes together with its notification, "
           "the "
           "clock stands at noon or at 23:00, and a timer may fire whenever it runs. Property 10 is checked where "
           "every "
           "state is known, property 9 where faults are among the stimuli: refused LED requests, timers, NV reads and "
           "battery queries, any number of them. `kiv_led_explore --states 0` goes to the fixed point wherever memory "
           "and patience allow.\n\n" +
           table_of_searches(all);
}

void print_row(FILE *out, const search_result &result)
{
    fprintf(out, "%-12s %-22s %3zu stimuli  %-14s %11" PRIu64 " states %13" PRIu64 " transitions %7.1f s %6.0f MB%s\n",
            product_of(result.plan).c_str(), family_names(result.plan.families).c_str(), result.stimuli,
            extent_of(result).c_str(), result.states, result.transitions, result.seconds,
            static_cast<double>(result.bytes) / 1e6, result.interrupted ? "  interrupted" : "");
}

void print_unknown(FILE *out, const report &all)
{
    for (const search_result &result : all.results) {
        for (const auto &[name, entry] : result.findings) {
            if (!entry.oddity.empty()) {
                continue;
            }
            fprintf(out, "\n# Broken: %s (%s), %" PRIu64 " times. The shortest history, %zu steps%s:\n%s",
                    std::string(property_text(entry.what.broken)).c_str(), name.c_str(), entry.times,
                    entry.history.size(), entry.shows ? "" : "; it takes another order of timers than the clock's",
                    entry.scenario.c_str());
        }
    }
}

// Texts are written with their length, so that they may hold lines.
static void write_text(FILE *out, const std::string &text)
{
    fprintf(out, "%zu:%s\n", text.size(), text.c_str());
}

static bool read_text(FILE *in, std::string &text)
{
    size_t size = 0;
    if (fscanf(in, "%zu:", &size) != 1) {
        return false;
    }
    text.resize(size);
    return fread(text.data(), 1, size, in) == size && fgetc(in) == '\n';
}

void write_result(FILE *out, const search_result &result)
{
    fprintf(out, "%" PRIu64 " %" PRIu64 " %zu %u %d %d %" PRIu64 " %f %zu\n", result.states, result.transitions,
            result.stimuli, result.depth, result.complete, result.interrupted, result.bytes, result.seconds,
            result.findings.size());
    for (const auto &[name, entry] : result.findings) {
        fprintf(out, "%d %" PRIu64 " %zu %d\n", entry.what.broken, entry.times, entry.history.size(), entry.shows);
        write_text(out, name);
        write_text(out, entry.oddity);
        write_text(out, entry.scenario);
    }
}

static bool read_finding(FILE *in, search_result &result)
{
    finding entry;
    std::string name;
    int broken = 0;
    int shows = 0;
    size_t steps = 0;
    if (fscanf(in, "%d %" SCNu64 " %zu %d\n", &broken, &entry.times, &steps, &shows) != 4 || !read_text(in, name) ||
        !read_text(in, entry.oddity) || !read_text(in, entry.scenario)) {
        return false;
    }
    entry.what.broken = static_cast<property>(broken);
    entry.history.resize(steps);
    entry.shows = shows != 0;
    result.findings[name] = entry;
    return true;
}

bool read_result(FILE *in, search_result &result)
{
    int complete = 0;
    int interrupted = 0;
    size_t findings = 0;
    if (fscanf(in, "%" SCNu64 " %" SCNu64 " %zu %u %d %d %" SCNu64 " %lf %zu\n", &result.states, &result.transitions,
               &result.stimuli, &result.depth, &complete, &interrupted, &result.bytes, &result.seconds,
               &findings) != 9) {
        return false;
    }
    result.complete = complete != 0;
    result.interrupted = interrupted != 0;
    while (findings-- > 0) {
        if (!read_finding(in, result)) {
            return false;
        }
    }
    return true;
}
