// Runs each case in a process of its own, so that every case meets a daemon that has just booted, and compares the
// platform calls that it made with the expected ones.
#pragma once

#include "core/led_ctx.h"
#include "fake_platform.h"
#include "kiv/socket.h"

#include <cstdint>
#include <string>

// Expected calls stand one a line, or several a line with " | " between them. "net off", and so on with bat, sms,
// voice, voicemail and handheld, stand for the requests that switch the whole group off.
using script = void();
void expect_calls(const char *name, const std::string &expected, script *play);   // every call
void expect_logs(const char *name, const std::string &expected, script *play);    // the log lines
void expect_errors(const char *name, const std::string &expected, script *play);  // those of level 0
void expect_effects(const char *name, const std::string &expected, script *play); // all but logs and what is only read

// What a script is made of.
void product_on(led_product product); // the LED function on, the device on
void nv(const char *key, const char *value);
void forget();                                                            // what came before is not compared
void receive(const std::string &bytes);                                   // one turn of the receive thread
void notify(int source, uint32_t event, const std::string &payload = ""); // to module 38
void mc(uint32_t event);                                                  // by the main-control module
void command(int us_cmd);
std::string message_bytes(int us_cmd, int dest, int source, uint32_t event, const std::string &payload = "");
void at_utc(int hour, int minute);
void note_power(); // "power P sleep S"

// The reverser message, but for its value and the quotation mark that ends it.
inline const std::string reverser = R"(send 1 8 0:"\x02/" 4:"\x01" 6:"&" 8:"\x08" 15:" )";
