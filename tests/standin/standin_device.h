// A fresh device directory for every test.
#pragma once

#include <gtest/gtest.h>

#include <string>
#include <vector>

struct standin_device : testing::Test {
    std::string directory;

    void SetUp() override;
    void TearDown() override;

    std::string path(const std::string &file) const { return directory + "/" + file; }
    void write(const std::string &file, const std::string &text) const;
    std::string read(const std::string &file) const;                // "(missing)" when there is none
    void set(const char *variable, const std::string &value) const; // and lets the stand-ins read it
    std::vector<std::string> trace() const;                         // without the times; needs trace_to_file
    void trace_to_file() const { set("KIV_TRACE", path("trace")); }
    int open_queue(const char *name) const;
};

long long now_ms();
