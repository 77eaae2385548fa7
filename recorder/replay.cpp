#include "replay.h"

#include "evidence/recording.h"
#include "evidence/replay_protocol.h"

#include <condition_variable>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <list>
#include <map>
#include <mutex>
#include <sys/mman.h>

namespace
{
enum class doing { STARTS, RUNS, CALLS, WAITS, SERVES_TIMERS, SERVES_LOOP, RESTS };

struct player_thread {
    std::string label; // empty until its first line tells it
    doing what = doing::STARTS;
    std::string call; // that it makes: "NAME(ARGUMENTS"
    size_t event = 0; // the line that it carries out
    void *(*body)(void *) = nullptr;
    void *argument = nullptr;
    std::condition_variable turn;
};

struct timer {
    timer_callback callback;
    void *argument;
};

std::mutex lock; // everything below
recording trace;
std::vector<std::string> tails; // of each line, from the end of its arguments on
size_t now;                     // the next line
std::list<player_thread> threads;
std::map<int, timer> timers;
bsp_ind_callback callbacks[IND_SLOTS];
replay_page *page;
FILE *out;
thread_local player_thread *self;

std::string call_of(const trace_entry &entry)
{
    return entry.call + "(" + entry.arguments;
}

// The third argument of a log line, which is where in the source it stands, as a blank.
std::string without_line(const std::string &call)
{
    const size_t file = call.find('"');
    const size_t number = file == std::string::npos ? file : call.find(", ", call.find('"', file + 1));
    if (page->lines || !call.starts_with("kiv_syslog_append(") || number == std::string::npos) {
        return call;
    }
    const size_t behind = call.find(',', number + 2);
    return call.substr(0, number) + (behind == std::string::npos ? "" : call.substr(behind));
}

bool is_same(const std::string &call, const trace_entry &entry)
{
    return without_line(call) == without_line(call_of(entry));
}

[[noreturn]] void finish(replay_verdict verdict, const std::string &done)
{
    page->line = now;
    snprintf(page->done, sizeof page->done, "%s", done.c_str());
    page->verdict = verdict;
    if (out) {
        fflush(out);
    }
    _exit(0);
}

// The line is done. What was done goes into the replay's own trace, with the time and the thread of the recording.
void advance(const std::string &call)
{
    const trace_entry &entry = trace.entries[now];
    if (out) {
        const std::string head = entry.line.substr(0, entry.line.find(' ') + 1) + entry.thread + " ";
        fprintf(out, "%s%s%s\n", head.c_str(), call.c_str(), tails[now].c_str());
    }
    page->line = ++now;
}

bool blocks(const std::string &call)
{
    return call.starts_with("kiv_recv_msg(");
}

std::string what_it_does(const player_thread &thread)
{
    const std::string who = thread.label.empty() ? "a new thread" : thread.label;
    switch (thread.what) {
    case doing::CALLS:
        return who + " " + thread.call + ")";
    case doing::SERVES_TIMERS:
    case doing::SERVES_LOOP:
        return who + " waits for its next event";
    case doing::RESTS:
        return who + " has come to its end";
    case doing::STARTS:
    case doing::RUNS:
    case doing::WAITS:
        break;
    }
    return who + " waits";
}

// The recording is over. A daemon that is not at rest there would have gone on: the recording was cut.
[[noreturn]] void finish_same()
{
    for (const player_thread &thread : threads) {
        if (thread.what == doing::CALLS && !blocks(thread.call)) {
            finish(REPLAY_SAME, what_it_does(thread));
        }
    }
    finish(REPLAY_SAME, "");
}

// What the line tells is what the thread stands before.
bool is_next(const player_thread &thread, const trace_entry &entry)
{
    return (thread.what == doing::SERVES_TIMERS && entry.call == "kiv_timer_fire") ||
           (thread.what == doing::SERVES_LOOP && entry.call == "kiv_bsp_ind") ||
           (thread.what == doing::CALLS && is_same(thread.call, entry));
}

bool may_be_called(const player_thread &thread)
{
    return thread.label.empty() || (thread.label[0] == 't' && thread.label != "timer");
}

// The thread of a line: by its name, or, where the name is new, by what the line says.
player_thread *find_thread(const trace_entry &entry)
{
    for (player_thread &thread : threads) {
        if (thread.label == entry.thread) {
            return &thread;
        }
    }
    for (player_thread &thread : threads) {
        if (may_be_called(thread) && is_next(thread, entry)) {
            thread.label = entry.thread;
            return &thread;
        }
    }
    return nullptr;
}

// A line that nobody in the daemon does.
bool is_aside(const trace_entry &entry)
{
    return is_head(entry) || entry.call == "kiv_trace_goes_on" || entry.call == "kiv_lib_led_relight_deliver";
}

void resume(player_thread &thread)
{
    thread.what = doing::RUNS;
    thread.turn.notify_one();
}

[[noreturn]] void differ(const player_thread *thread)
{
    std::string done = thread ? what_it_does(*thread) : "";
    for (const player_thread &other : threads) {
        if (!thread && other.what == doing::CALLS && !blocks(other.call)) {
            done = what_it_does(other);
        }
    }
    finish(REPLAY_DIFFERS, done.empty() ? "nothing: every thread waits" : done);
}

// Every thread stands still: who is next? A new thread runs to its first call before anything else goes on.
void schedule()
{
    for (player_thread &thread : threads) {
        if (thread.what == doing::STARTS) {
            resume(thread);
            return;
        }
    }
    while (now < page->end && is_aside(trace.entries[now])) {
        advance(call_of(trace.entries[now]));
    }
    if (now == page->end) {
        finish_same();
    }
    const trace_entry &entry = trace.entries[now];
    player_thread *thread = find_thread(entry);
    if (!thread) {
        differ(nullptr);
    }
    if (is_next(*thread, entry)) {
        thread->event = now;
        advance(thread->what == doing::CALLS ? thread->call : call_of(entry));
    } else if (thread->what != doing::WAITS) {
        differ(thread);
    }
    resume(*thread);
}

void stand_still(std::unique_lock<std::mutex> &guard, doing what)
{
    self->what = what;
    schedule();
    self->turn.wait(guard, [] { return self->what == doing::RUNS; });
}

player_thread &add_thread(doing what)
{
    player_thread &thread = threads.emplace_back();
    thread.what = what;
    return thread;
}

void *run_thread(void *thread)
{
    std::unique_lock guard(lock);
    self = static_cast<player_thread *>(thread);
    self->turn.wait(guard, [] { return self->what == doing::RUNS; });
    guard.unlock();
    self->body(self->argument);
    guard.lock();
    self->what = doing::RESTS;
    schedule();
    return nullptr;
}

int event_number(const trace_entry &entry)
{
    return atoi(entry.arguments.c_str());
}

void *serve_timers(void *)
{
    for (;;) {
        std::unique_lock guard(lock);
        stand_still(guard, doing::SERVES_TIMERS);
        const int handle = event_number(trace.entries[self->event]);
        const auto known = timers.find(handle);
        if (known == timers.end()) {
            now--;
            finish(REPLAY_DIFFERS, "nothing: the daemon has started no timer " + std::to_string(handle));
        }
        const timer due = known->second;
        guard.unlock();
        due.callback(due.argument);
    }
}

bsp_ind_callback callback_for(int event_id)
{
    const bool battery = event_id < 1352;
    const int wanted = battery ? event_id - 1350 : event_id - 1356 + CHARGER_CONNECT;
    if (wanted >= 0 && wanted < IND_SLOTS && callbacks[wanted]) {
        return callbacks[wanted];
    }
    for (const bsp_ind_callback callback : callbacks) {
        if (callback) {
            return callback;
        }
    }
    return nullptr;
}

void serve_indication()
{
    std::unique_lock guard(lock);
    stand_still(guard, doing::SERVES_LOOP);
    const trace_entry &entry = trace.entries[self->event];
    const bsp_ind_callback callback = callback_for(event_number(entry));
    char record[64] = {};
    if (!callback) {
        now--;
        finish(REPLAY_DIFFERS, "nothing: the daemon has registered for no indication");
    }
    const bool null = entry.arguments.ends_with(", null");
    guard.unlock();
    callback(event_number(entry), 0, null ? nullptr : record);
}

void read_recording()
{
    std::string error;
    if (!load_recording(page->trace, trace, error)) {
        finish(REPLAY_UNREADABLE, error);
    }
    now = page->line;
    page->end = std::min(page->end, trace.entries.size());
    for (const trace_entry &entry : trace.entries) {
        tails.push_back(entry.line.substr(entry.line.find(call_of(entry)) + call_of(entry).size()));
    }
    if (page->out[0]) {
        out = fopen(page->out, "ae");
    }
}
} // namespace

// The daemon ends by itself. Where the recording ends too, that is the same.
__attribute__((destructor)) static void end_replay()
{
    if (page && page->verdict == REPLAY_GOES_ON) {
        finish(now == page->end ? REPLAY_SAME : REPLAY_DIFFERS, now == page->end ? "" : "the daemon ends");
    }
}

const std::string &replay_take(const trace_line &line)
{
    std::unique_lock guard(lock);
    self->call = std::string(line.call) + "(" + std::string(line.text, line.length);
    stand_still(guard, doing::CALLS);
    return tails[self->event];
}

void replay_wait_for_turn()
{
    std::unique_lock guard(lock);
    stand_still(guard, doing::WAITS);
}

const std::string *replay_next_is(const char *call)
{
    const std::lock_guard guard(lock);
    for (size_t at = now; at < page->end; at++) {
        if (trace.entries[at].thread == self->label) {
            return trace.entries[at].call == call ? &tails[at] : nullptr;
        }
    }
    return nullptr;
}

int start_timer(timer_callback, void *, int, int)
{
    return 0;
}

void keep_timer(int handle, timer_callback callback, void *argument)
{
    pthread_t service;
    if (handle > 0 && timers.empty()) {
        replay_create(&service, nullptr, serve_timers, nullptr);
    }
    const std::lock_guard guard(lock);
    if (handle > 0) {
        timers[handle] = {callback, argument};
    }
}

bsp_ind_callback keep_callback(ind_slot slot, bsp_ind_callback callback)
{
    callbacks[slot] = callback;
    return callback;
}

void replay_rest()
{
    std::unique_lock guard(lock);
    for (;;) {
        stand_still(guard, doing::RESTS);
    }
}

void replay_serve_loop()
{
    for (;;) {
        serve_indication();
    }
}

int replay_create(pthread_t *id, const pthread_attr_t *attributes, void *(*body)(void *), void *argument)
{
    const std::lock_guard guard(lock);
    player_thread &thread = add_thread(doing::STARTS);
    thread.body = body;
    thread.argument = argument;
    return next().pthread_create(id, attributes, run_thread, &thread);
}

// Before the daemon's first line. The page is shared with whoever started the replay.
static bool begin_replay()
{
    const char *file = getenv(REPLAY_VARIABLE);
    const int fd = file ? open(file, O_RDWR | O_CLOEXEC) : -1;
    void *shared = fd < 0 ? MAP_FAILED : mmap(nullptr, sizeof *page, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0);
    if (shared == MAP_FAILED) {
        fputs("libkivreplay: to be used by kiv_led_sim replay\n", stderr);
        _exit(2);
    }
    page = static_cast<replay_page *>(shared);
    read_recording();
    self = &add_thread(doing::RUNS);
    self->label = "main";
    return true;
}

// Behind everything that it sets up. NOLINTNEXTLINE(cert-err58-cpp): without memory the replay ends
[[maybe_unused]] static const bool begun = begin_replay();
