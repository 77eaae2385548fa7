#include "report.h"

#include "history.h"
#include "oddities.h"

#include <algorithm>
#include <cinttypes>

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

// A history that the clock can play is the better one; then one without a failure; then the shorter.
std::array<size_t, 3> drawbacks_of(const finding &one, const search_plan &plan)
{
    return {one.shows ? 0U : 1U, (plan.families & FAILURES) != 0 ? 1U : 0U, one.history.size()};
}

std::string events_of(const search_plan &plan)
{
    if (plan.steps == 0) {
        return family_names(plan.families);
    }
    return (plan.families & FAILURES) != 0 ? "all of them" : "all but failures";
}

std::string table_of_searches(const report &all)
{
    std::string text = "| product | events | stimuli | explored | states | transitions |\n"
                       "| --- | --- | ---: | --- | ---: | ---: |\n";
    for (const search_result &result : all.results) {
        text += "| " + product_of(result.plan) + " | " + events_of(result.plan) + " | " +
                std::to_string(result.stimuli) + " | " + extent_of(result) + " | " +
                (result.plan.steps == 0 ? with_commas(result.states) : "") + " | " + with_commas(result.transitions) +
                " |\n";
    }
    return text;
}

std::string sum_of_searches(const report &all)
{
    uint64_t complete = 0;
    uint64_t searches = 0;
    uint64_t states = 0;
    uint64_t transitions = 0;
    uint64_t steps = 0;
    for (const search_result &result : all.results) {
        (result.plan.steps == 0 ? transitions : steps) += result.transitions;
        if (result.plan.steps == 0) {
            complete += result.complete ? 1 : 0;
            states += result.states;
            searches++;
        }
    }
    return "Of " + with_commas(searches) + " searches " + with_commas(complete) +
           " have seen every state. Together they visited " + with_commas(states) + " states by " +
           with_commas(transitions) + " transitions; the walks took " + with_commas(steps) + " steps.\n\n";
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

static bool holds(const search_result &result)
{
    return std::all_of(result.findings.begin(), result.findings.end(),
                       [](const auto &entry) { return !entry.second.oddity.empty(); });
}

bool all_hold(const report &all)
{
    return std::all_of(all.results.begin(), all.results.end(), holds);
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
            if (known.shortest == nullptr ||
                drawbacks_of(at->second, result.plan) < drawbacks_of(*known.shortest, known.plan)) {
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

// Everything that is not a list, in one piece; each %s is a list.
static constexpr char PAGE[] = R"(# Every reachable state

`kiv_led_explore` visits the states that the daemon and its device can reach and checks ten properties in them. It has
written this page and the scenarios of the oddities; a test keeps them current. To write them again:

    build/release/kiv_led_explore --jobs 2 --document docs/states.md --scenarios scenarios/oddities

## The properties

%s
Where each is checked: 1 to 5 and 7 in every state, 6 from every state, 8 after every indication, and the morning of 5
after every end of a night. In a search with faults or refusals only 9 and 10 are: what a refused call leaves unlit or
lit is no breach until a power cycle has left it so. 9 is checked from every state of those searches, after any number
of failures: `faults` are refused LED requests, timers and NV reads, `refusals` are refused NV writes, board queries,
configuration and relights. 10 is checked from every state from which all stimuli were played. A walk checks 1 to 5 and
7 after every step and 6 after every fiftieth; with failures it checks 9 there and nothing else.

## The oddities

Where the described behaviour itself breaks a property, and how few steps it takes to see it. Each is a scenario of
its name in `scenarios/oddities/`, the shortest there is: without a failed call, where it shows without one.

%s
## What was explored

"Every state" means that there are no others: each stimulus leads from each of them to one of them. Otherwise every
history up to that number of steps was played, and nothing is known of longer ones but what the walks have met. A
value in NV changes together with its notification, the clock stands at noon or at 23:00, and a timer may fire
whenever it runs. Power, sleep, the night's beginning and end, heat, relights and restarts are part of every search.
Walks are random but the same every time. `--pair-states 0` goes on to a pair's last state, where memory and patience
allow.

%s)";

std::string document_of(const report &all)
{
    const std::array<std::string, 3> lists = {properties_and_oddities(all), list_of_oddities(all),
                                              sum_of_searches(all) + table_of_searches(all)};
    std::string page = PAGE;
    for (const std::string &list : lists) {
        page.replace(page.find("%s"), 2, list);
    }
    return page;
}

void print_row(FILE *out, const search_result &result)
{
    fprintf(out,
            "%-12s %-22s %3zu stimuli  %-14s %11" PRIu64 " states %13" PRIu64 " transitions %7.1f s %6.0f MB%s%s\n",
            product_of(result.plan).c_str(), events_of(result.plan).c_str(), result.stimuli, extent_of(result).c_str(),
            result.states, result.transitions, result.seconds, static_cast<double>(result.bytes) / 1e6,
            holds(result) ? "" : "  broken", result.interrupted ? "  interrupted" : "");
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
