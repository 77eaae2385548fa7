// A trace as causes and effects: which entry belongs to what was being done, and what had set that off.
#pragma once

#include "evidence/recording.h"
#include "seen/observed.h"

enum class cause { START, MESSAGE, OWN_RELIGHT, TIMER, INDICATION, THREAD };

struct activity {
    cause what = cause::START;
    size_t entry = 0;     // with which it begins
    size_t asked_for = 0; // the entry that started the timer, or that asked for the relight; itself when unknown
    size_t asked_in = 0;  // the activity that did so
    int64_t timer = 0;    // its handle
};

// What one LED did in one activity.
struct led_change {
    led_look before;
    led_look after;
    size_t in = 0;       // the activity
    size_t request = 0;  // the entry of the last request for the LED in it
    bool failed = false; // that one did
};

struct history {
    const recording *trace = nullptr;
    bool from_log = false;                // times are line numbers, brightness and blink times unknown
    std::vector<std::string> moments;     // of a log, by entry: the line, and what it says of its time
    std::vector<std::string> timer_names; // of a log, by handle from 1 on
    std::vector<activity> activities;
    std::vector<size_t> activity_of; // by entry
};

history history_of(const recording &trace);

// Every activity that made requests for the LED, in the order of their last one.
std::vector<led_change> changes_of(const history &told, int led);

// "notify MAIN POWERON", "timer 3 (10000 ms, once), started at 15.000 by notify SMS NEW_SMS", "start-up".
std::string describe(const history &told, size_t activity_index);

std::string when(const history &told, size_t entry);

// The text of a log entry, without the line end; empty for every other entry.
std::string log_text(const trace_entry &entry);
