// What the ten libraries are in the tests: answers that a test scripts, and a record of every call as one line.
// Every function of the contract may be called from any thread; a script is written before other threads start.
#pragma once

#include "kiv/adabsp.h"
#include "kiv/reg.h"

#include <array>
#include <ctime>
#include <deque>
#include <functional>
#include <map>
#include <optional>
#include <string>

struct fake_timer {
    void (*callback)(void *);
    void *argument;
    int period_ms;
    bool repeats;
};

struct fake_device {
    std::map<std::string, std::string> nv;
    std::map<int, std::string> cfg;            // an item that is missing fails
    std::map<int, int> led_results;            // by LED id; 0 unless given here
    std::array<std::optional<int>, 7> sensors; // without a value the record stays untouched
    std::optional<bsp_query_result> charger;   // without a value the query fails
    std::optional<bsp_query_result> battery;
    std::deque<std::optional<std::string>> inbox; // received next; without a value, and at the end, receiving fails
    bool cfg_fails = false;
    int failing_queue_opens = 0;
    int failing_timers = 0;
    int reg_proc_result = 1;
    int send_result = 0;
    int tr181_result = 0;
    bool writes_failures_only = false; // an LED request that succeeds leaves its result code alone

    std::map<int, reg_masks> registrations;                 // by the module that is to notify
    bsp_ind_callback indication = nullptr;                  // as registered
    std::function<void(const std::string &line)> meanwhile; // called at every recorded call, on the caller's thread

    // The C library, for programs that link fake_libc.
    std::optional<std::time_t> clock;                 // UTC; without a value the real one
    std::deque<std::string> rolling_leds;             // contents at each opening, the last one for good; empty: no file
    std::map<void *(*)(void *), std::string> threads; // names of the thread bodies; none of them is started
    std::string failing_thread;

    std::map<int, fake_timer> timers; // by handle, at most 64
};

// The one device of the process.
fake_device &fake_platform();

// Recording is off at first. The record keeps the first 5000 lines.
void fake_record(bool on);
void fake_note(const std::string &line);
std::string fake_take_record();

// Runs a timer's procedure on the calling thread; false when there is no such timer.
bool fake_fire(int handle);

// While other threads run.
void fake_set_nv(const std::string &key, const std::string &value);
void fake_deliver(std::string message);
std::map<int, fake_timer> fake_timers();
unsigned long fake_led_requests(); // made so far, recorded or not
