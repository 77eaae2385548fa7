// What the daemon has done to the device, as its trace tells it.
#pragma once

#include "language/names.h"
#include "seen/trace.h"

#include <array>
#include <deque>
#include <map>
#include <set>
#include <unordered_set>

struct running_timer {
    int64_t period_ms = 0;
    bool repeats = false;
};

// What a thread is about: the entry that set it off, and what it has logged since.
struct thread_story {
    std::string set_off_by; // a message, a timer, an indication; empty for what it began with
    int64_t timer_ms = 0;   // of a timer
    std::string decision;   // the last log line that is not the output layer's own
};

struct led_request_story {
    int64_t time_us = 0;
    led_look look;
    std::string result;
    thread_story thread;
};

// A call that the scenario makes fail, and whether one has.
struct watched_fault {
    std::string call;
    std::string match;
    std::string result;
    std::string where; // in the scenario
    bool hit = false;
};

using led_looks = std::array<led_look, LED_ID_COUNT>; // by id

struct observed {
    led_looks leds = {};
    std::map<int64_t, running_timer> timers;
    std::vector<trace_entry> step; // since the last stimulus; of entries alike but for their time the first
    std::unordered_set<std::string> step_calls;
    int64_t requests_in_step = 0; // LED requests among them
    bool timer_deleted_in_step = false;
    std::set<std::string> nv_read; // the keys that the daemon has asked for
    std::vector<watched_fault> faults;
    std::map<std::string, thread_story> threads;
    std::array<std::deque<led_request_story>, LED_ID_COUNT> last_requests; // the last three of each LED
    bool started = false;                                                  // the daemon has had the start record
};

void observe(observed &state, const trace_entry &entry);
void begin_step(observed &state);
void forget_process(observed &state); // it is gone, and its timers with it; the LEDs stay as they are

led_look seen(const led_look &look);           // to the eye, an LED that is on at brightness 0 is off
std::string lit_leds(const led_looks &leds);   // "bat_green on 4 and net_red on 2", or "dark"
std::string expect_lit(const led_looks &leds); // "expect only bat_green on 4 and net_red on 2", or "expect dark"
std::string describe(const led_look &look);    // "on 4", "off", "blink 800/1200 4"
