// The real daemon in a device directory of its own, in real time, and the other ends of its bus.
#pragma once

#include <gtest/gtest.h>

#include <cstdint>
#include <string>
#include <string_view>
#include <sys/types.h>
#include <vector>

struct daemon_rig : testing::Test {
    std::string directory;
    pid_t pid = -1;
    int daemon_queue = -1;
    int main_queue = -1;

    void SetUp() override { ASSERT_TRUE(open("DRIVER_UFI")); }
    void TearDown() override { close(); }

    // With a size, the directory is a disk of its own; false when that takes a right that we do not have.
    bool open(const std::string &product, const char *disk_size = nullptr);
    void close();
    void launch();            // with faults looked for, logging and tracing beside the directory
    void kill_daemon() const; // and waits for its end
    bool start();             // launches it, sends the start record once it listens; false after ten seconds
    bool wait_for_hello() const;
    bool go() const;      // sends the start record
    bool answers() const; // asks for a scene that ends with a message to the main control, and waits for it

    std::string path(const std::string &file) const { return directory + "/" + file; }
    void write(const std::string &file, std::string_view text) const;
    std::string log() const;
    std::string trace() const;
    bool log_shows(const std::string &text) const; // waits up to ten seconds, as does the next
    bool trace_shows(const std::string &text) const;
};

// False when it was not accepted.
bool notify(int module_id, uint32_t event, std::string_view text = "");
bool send_command(int cmd);

// The next reverser that the main control gets within so many ms; empty when there is none.
std::string next_reverser(int main_queue, int wait_ms);
