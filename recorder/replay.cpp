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
    size_t event = 0; // the line that a service carries out
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
size_t end;
std::list<player_thread> threads;
std::map<int, timer> timers;
bsp_ind_callback callbacks[IND_SLOTS];
replay_status *status;
FILE *out;
bool lines_count;
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
    if (lines_count || !call.starts_with("kiv_syslog_append(") || number == std::string::npos) {
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
    status->line = now;
    snprintf(status->done, sizeof status->done, "%s", done.c_str());
    status->verdict = verdict;
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
    status->line = ++now;
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

bool can_be(const player_thread &thread, const trace_entry &entry)
{
    const bool nameless = thread.label.empty() || (thread.label[0] == 't' && thread.label != "timer");
    if (!nameless) {
        return false;
    }
    if (entry.call == "kiv_timer_fire") {
        return thread.what == doing::SERVES_TIMERS;
    }
    if (entry.call == "kiv_bsp_ind") {
        return thread.what == doing::SERVES_LOOP;
    }
    return thread.what == doing::CALLS && is_same(thread.call, entry);
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
        if (can_be(thread, entry)) {
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

bool is_event_of(const player_thread &thread, const trace_entry &entry)
{
    return (thread.what == doing::SERVES_TIMERS && entry.call == "kiv_timer_fire") ||
           (thread.what == doing::SERVES_LOOP && entry.call == "kiv_bsp_ind");
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
    while (now < end && is_aside(trace.entries[now])) {
        advance(call_of(trace.entries[now]));
    }
    if (now == end) {
        finish_same();
    }
    const trace_entry &entry = trace.entries[now];
    player_thread *thread = find_thread(entry);
    if (!thread) {
        differ(nullptr);
    }
    if (is_event_of(*thread, entry)) {
        thread->event = now;
        advance(call_of(entry));
    } else if (thread->what == doing::CALLS && is_same(thread->call, entry)) {
        thread->event = now;
        advance(thread->call);
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

struct thread_start {
    void *(*body)(void *);
    void *argument;
    player_thread *thread;
};

void *run_thread(void *given)
{
    const thread_start start = *static_cast<thread_start *>(given);
    delete static_cast<thread_start *>(given);
    std::unique_lock guard(lock);
    self = start.thread;
    self->turn.wait(guard, [] { return self->what == doing::RUNS; });
    guard.unlock();
    start.body(start.argument);
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

void start_timer_service()
{
    static bool started = false;
    pthread_t thread;
    if (!started) {
        started = true;
        next().pthread_create(&thread, nullptr, run_thread,
                              new thread_start{serve_timers, nullptr, &add_thread(doing::STARTS)});
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

const char *variable(const char *name)
{
    const char *value = getenv(name);
    return value ? value : "";
}

void read_recording()
{
    std::string error;
    if (!load_recording(variable(REPLAY_TRACE_VARIABLE), trace, error)) {
        finish(REPLAY_UNREADABLE, error);
    }
    now = strtoul(variable(REPLAY_FROM_VARIABLE), nullptr, 10);
    end = std::min<size_t>(strtoul(variable(REPLAY_TO_VARIABLE), nullptr, 10), trace.entries.size());
    lines_count = getenv(REPLAY_LINES_VARIABLE) != nullptr;
    for (const trace_entry &entry : trace.entries) {
        tails.push_back(entry.line.substr(entry.line.find(call_of(entry)) + call_of(entry).size()));
    }
    if (const char *path = getenv(REPLAY_OUT_VARIABLE)) {
        out = fopen(path, "ae");
    }
}

} // namespace

// The daemon ends by itself. Where the recording ends too, that is the same.
__attribute__((destructor)) static void end_replay()
{
    if (status && status->verdict == REPLAY_GOES_ON) {
        finish(now == end ? REPLAY_SAME : REPLAY_DIFFERS, now == end ? "" : "the daemon ends");
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
    for (size_t at = now; at < end; at++) {
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
    const std::lock_guard guard(lock);
    if (handle > 0) {
        timers[handle] = {callback, argument};
        start_timer_service();
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
    return next().pthread_create(id, attributes, run_thread,
                                 new thread_start{body, argument, &add_thread(doing::STARTS)});
}

// Before the daemon's first line. The page is shared with whoever started the replay.
static bool begin_replay()
{
    const int fd = open(variable(REPLAY_STATUS_VARIABLE), O_RDWR | O_CLOEXEC);
    void *page = fd < 0 ? MAP_FAILED : mmap(nullptr, sizeof *status, PROT_READ | PROT_WRITE, MAP_SHARED, fd, 0);
    if (page == MAP_FAILED) {
        fputs("libkivreplay: to be used by kiv_led_sim replay\n", stderr);
        _exit(2);
    }
    status = static_cast<replay_status *>(page);
    read_recording();
    self = &add_thread(doing::RUNS);
    self->label = "main";
    return true;
}

[[maybe_unused]] static const bool begun = begin_replay(); // behind everything that it sets up
