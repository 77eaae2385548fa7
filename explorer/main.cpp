// kiv_led_explore: visits every state that the daemon can reach, and says where a property of its LEDs breaks.
#include "answer.h"
#include "report.h"

#include <CLI/CLI.hpp>

#include <cstdlib>
#include <fstream>
#include <sys/wait.h>
#include <unistd.h>

namespace
{
constexpr int EXIT_BROKEN = 1;
constexpr int EXIT_IMPOSSIBLE = 2;

struct explore_options {
    std::vector<std::string> products;
    std::vector<std::string> families;
    bool singles_only = false;
    uint64_t most_states = 0; // of one family
    uint64_t most_of_a_pair = 400'000;
    uint64_t steps = 10'000'000; // ten walks: a hundred million
    unsigned jobs = 1;
    std::string document;
    std::string scenarios;
};

// A search in a process of its own, because the daemon has one set of statics.
struct job {
    search_plan plan;
    pid_t process = 0;
    FILE *answer = nullptr;
    bool is_done = false;
    search_result result;
};

void interrupt(int)
{
    is_interrupted = 1;
}

bool is_wanted(const std::vector<std::string> &list, std::string_view name)
{
    return list.empty() || std::find(list.begin(), list.end(), name) != list.end();
}

std::vector<unsigned> wanted_families(const explore_options &options, unsigned product)
{
    std::vector<unsigned> wanted;
    for (unsigned of = BATTERY; of <= REFUSALS; of <<= 1) {
        if ((families_of(product) & of) != 0 && is_wanted(options.families, family_names(of))) {
            wanted.push_back(of);
        }
    }
    return wanted;
}

void plan_product(const explore_options &options, unsigned product, std::vector<job> &jobs)
{
    const std::vector<unsigned> families = wanted_families(options, product);
    const auto add = [&](unsigned of, uint64_t most_states, uint64_t steps = 0) {
        jobs.emplace_back().plan = {
            .product = product, .families = POWER | of, .most_states = most_states, .steps = steps};
    };
    if (is_wanted(options.families, "power")) {
        add(0, options.most_states);
    }
    for (const unsigned of : families) {
        add(of, options.most_states);
    }
    if (options.singles_only) {
        return;
    }
    for (size_t first = 0; first < families.size(); first++) {
        for (size_t second = first + 1; second < families.size(); second++) {
            add(families[first] | families[second], options.most_of_a_pair);
        }
    }
    if (options.steps != 0 && options.families.empty()) {
        add(families_of(product) & ~FAILURES, 0, options.steps);
        add(families_of(product), 0, options.steps);
    }
}

void begin(job &one)
{
    one.answer = tmpfile();
    fflush(nullptr);
    one.process = one.answer == nullptr ? -1 : fork();
    if (one.process < 0) {
        perror("kiv_led_explore: no process for a search");
        exit(EXIT_IMPOSSIBLE);
    }
    if (one.process == 0) {
        write_result(one.answer, search(one.plan));
        fflush(one.answer);
        _exit(0);
    }
}

bool end(job &one, int status)
{
    one.is_done = true;
    one.result.plan = one.plan;
    rewind(one.answer);
    const bool is_read = WIFEXITED(status) && WEXITSTATUS(status) == 0 && read_result(one.answer, one.result);
    fclose(one.answer);
    return is_read;
}

// At most so many at once; their results stand in the order of the plan.
bool run_jobs(std::vector<job> &jobs, unsigned most)
{
    size_t next = 0;
    size_t running = 0;
    bool all_ended = true;
    while (next < jobs.size() || running > 0) {
        if (next < jobs.size() && running < most) {
            begin(jobs[next++]);
            running++;
            continue;
        }
        int status = 0;
        const pid_t process = wait(&status);
        for (job &one : jobs) {
            if (process > 0 && one.process == process) {
                running--;
                all_ended &= end(one, status);
                fprintf(stderr, "%s", isatty(STDERR_FILENO) != 0 ? "\r\033[K" : "");
                print_row(stdout, one.result);
                fflush(stdout);
            }
        }
    }
    return all_ended;
}

bool write_file(const std::string &path, const std::string &text)
{
    std::ofstream file(path);
    file << text;
    file.close();
    if (!file) {
        fprintf(stderr, "kiv_led_explore: %s cannot be written\n", path.c_str());
    }
    return static_cast<bool>(file);
}

bool write_papers(const explore_options &options, const report &all)
{
    bool written = options.document.empty() || write_file(options.document, document_of(all));
    if (!options.scenarios.empty()) {
        for (const known_oddity &known : oddities_in(all)) {
            written &= write_file(options.scenarios + "/" + known.name + ".scn", scenario_of(known));
        }
    }
    return written;
}

int explore(const explore_options &options)
{
    std::vector<job> jobs;
    for (unsigned product = 0; product < PRODUCTS; product++) {
        if (is_wanted(options.products, all_products()[product].name)) {
            plan_product(options, product, jobs);
        }
    }
    if (!run_jobs(jobs, options.jobs)) {
        fprintf(stderr, "kiv_led_explore: a search has ended before its time\n");
        return EXIT_IMPOSSIBLE;
    }
    report all;
    for (job &one : jobs) {
        all.results.push_back(std::move(one.result));
    }
    print_unknown(stdout, all);
    if (!write_papers(options, all)) {
        return EXIT_IMPOSSIBLE;
    }
    return all_hold(all) ? 0 : EXIT_BROKEN;
}

std::vector<std::string> names_of_products()
{
    std::vector<std::string> names;
    for (const product_name &product : all_products()) {
        names.emplace_back(product.name);
    }
    return names;
}

std::vector<std::string> names_of_families()
{
    std::vector<std::string> names;
    for (unsigned of = POWER; of <= REFUSALS; of <<= 1) {
        names.push_back(family_names(of));
    }
    return names;
}
} // namespace

// NOLINTNEXTLINE(bugprone-exception-escape): without memory the exploration ends
int main(int argc, char **argv)
{
    explore_options options;
    CLI::App app("Visits every state that the LED daemon can reach and checks what its LEDs show in each",
                 "kiv_led_explore");
    app.add_option("--product", options.products, "Of this product only; may be repeated")
        ->check(CLI::IsMember(names_of_products()));
    app.add_option("--family", options.families, "With these families of events only; may be repeated")
        ->check(CLI::IsMember(names_of_families()));
    app.add_flag("--single", options.singles_only, "Each family by itself: no pairs of them, no walks");
    app.add_option("--states", options.most_states,
                   "The search of a family ends with the level that exceeds them; 0, the default, never does");
    app.add_option("--pair-states", options.most_of_a_pair, "The same for a pair of families");
    app.add_option("--steps", options.steps, "Steps of each walk at random, two for a product; 0 for none");
    app.add_option("--jobs", options.jobs, "Searches at once")->check(CLI::Range(1U, 64U));
    app.add_option("--document", options.document, "Write what was found, as a page, to this file");
    app.add_option("--scenarios", options.scenarios, "Write the oddities as scenarios to this folder");
    CLI11_PARSE(app, argc, argv);

    cold_daemon(); // before it has run
    signal(SIGINT, interrupt);
    return explore(options);
}
