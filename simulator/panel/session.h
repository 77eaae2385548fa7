// The device behind the panel: the real daemon, statements played to it, time that passes at a chosen speed, and what
// came of all that. One thread at a time; the thread that makes it must outlive it, for the daemon dies with it.
#pragma once

#include "player.h"

#include <atomic>
#include <deque>

struct told_change { // of one LED
    int64_t time_us = 0;
    int led = 0;
    led_look look;
};

struct told_statement {
    int64_t time_us = 0;
    std::string text;
};

constexpr int LEVEL_OF_CALLS = -1;

struct told_line { // of the log, or a platform call
    int64_t time_us = 0;
    int level = LEVEL_OF_CALLS;
    int led = -1; // that it names
    std::string thread;
    std::string text;
};

// What has happened since somebody last took it out. The newest are kept, the others counted.
struct told {
    std::deque<told_change> changes;
    std::deque<told_statement> statements;
    std::deque<told_line> lines;
    int64_t left_out = 0;
};

enum class line_state { COMING, HELD, FAILED };

struct story_line {
    std::string text;
    line_state state = line_state::COMING;
    std::string shown; // of a failed one: what is so instead
};

// A scenario that is being played while somebody watches.
struct story {
    std::string name; // empty: none
    scenario script;
    std::vector<story_line> lines;
    size_t next = 0;
    int64_t wait_until_ns = -1; // a statement that lets time pass; -1: none
    bool failed = false;
};

struct kept_statement {
    int64_t time_ns = 0;
    std::string text; // several lines for a repeat
};

struct session {
    player device;
    player_options options;
    int generation = 0; // of the device; a new one begins at time 0 with nothing done
    int speed = 1;      // device seconds a second
    bool running = false;
    int64_t owed_ns = 0; // of device time, less than a millisecond
    std::array<int64_t, LED_ID_COUNT> since_us = {};
    told news;
    told past;            // of the device, for a page that comes later
    uint64_t batches = 0; // of news that have been made
    story play;
    std::vector<kept_statement> kept;
    size_t kept_bytes = 0;
    bool death_told = true;
    const std::atomic<bool> *stop = nullptr; // ends what takes long
};

// What came of a text of statements. line is 0 unless one of them was refused or failed.
struct outcome {
    int done = 0;
    int line = 0;
    std::string message;
};

bool open_session(session &s, const player_options &options, std::string &error);
void close_session(session &s);

// A fresh device, on which the statements are then played.
outcome renew(session &s, const std::string &statements);

outcome do_text(session &s, const std::string &text);

// Plays the scenario on a fresh device, as time passes. False with the cause.
bool begin_story(session &s, const std::string &path, std::string &error);

// Lets device time pass for that much real time, if it runs, and plays what the story has next.
void go_on(session &s, int64_t real_ns);

// Lets time pass up to the next deadline of the daemon. False when it waits for none.
bool step_to_deadline(session &s);

// Everything done so far as a scenario, with what is shown now as its expectations. Empty when that is too much.
std::string keep(const session &s);

const product_name *product_of(const session &s); // null before one is chosen
