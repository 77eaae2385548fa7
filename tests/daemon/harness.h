// Drives the daemon as the device does and compares what it did with what was expected, both in the words of scenarios
// and traces: a line a platform call, "net_red on 2" for an LED request, "info SOURCE "TEXT"" or "error ..." for a log
// line (tests/fake tells the others).
#pragma once

#include "fake_platform.h"
#include "ground/led_ctx.h"
#include "kiv/reg.h"
#include "kiv/socket.h"

#include <cstdint>
#include <functional>
#include <gtest/gtest.h>
#include <source_location>
#include <string>

// A test that meets a daemon that has just booted: it runs in a process of its own.
#define DEVICE_TEST(suite, name)                                                                                       \
    static void suite##_##name();                                                                                      \
    TEST(suite, name)                                                                                                  \
    {                                                                                                                  \
        on_a_fresh_device(#name, suite##_##name);                                                                      \
    }                                                                                                                  \
    static void suite##_##name()

// The same for a part of a test. What fails in it fails the test.
void on_a_fresh_device(const std::string &name, const std::function<void()> &play);

// Each compares a view of everything since the step before the last expectation with the expected lines. A message
// leaves the same lines on its way to whatever handles it; only expect_trace shows them. "net off" stands for the
// requests that switch off each LED of the group (bat, sms, flow, rssi, voice, voicemail and sigbar likewise; "handheld
// off" is every LED of the handheld), "only net_red on 2" for those and the request that follows them.
using source_place = std::source_location;
void expect_trace(const std::string &expected, source_place where = source_place::current());   // every call
void expect_calls(const std::string &expected, source_place where = source_place::current());   // from the handler on
void expect_effects(const std::string &expected, source_place where = source_place::current()); // no logs, no reads
void expect_errors(const std::string &expected, source_place where = source_place::current());  // log lines of level 0
// The log lines of one source, without its name.
void expect_log(const std::string &source, const std::string &expected, source_place where = source_place::current());

// What the device is like; done between steps.
void switched_on(led_product product); // by hand: the LED function on, the device on
void nv(const std::string &key, const std::string &value);
void utc(int hour, int minute);
void forget(); // what came before is not compared

// Steps.
void start(const std::string &product_type, char led_function = 1); // the whole start-up, without its threads
void notify(int module, uint32_t event, const std::string &payload = "");
void command(int us_cmd);
void receive(const std::string &bytes); // one turn of the receive thread
void fire_timers(int period_ms);        // every timer of that period that runs, once
void indicate(int event_id);            // the board's callback as it was registered
void step(const std::function<void()> &calls);

std::string message_bytes(int us_cmd, int dest, int source, uint32_t event, const std::string &payload = "");
fake_timer running_timer(int period_ms); // there must be one
