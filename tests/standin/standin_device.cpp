#include "standin_device.h"

#include "kiv/socket.h"
#include "standin.h"

#include <chrono>
#include <filesystem>
#include <fstream>
#include <regex>
#include <sstream>
#include <stdlib.h>

void standin_device::SetUp()
{
    directory = testing::TempDir() + "kiv-XXXXXX";
    ASSERT_NE(mkdtemp(directory.data()), nullptr);
    for (const char *variable : {"KIV_TRACE", "KIV_FAULTS", "KIV_LED_DIR", "KIV_LED_MAP", "XDG_RUNTIME_DIR"}) {
        unsetenv(variable);
    }
    setenv("KIV_LOG", "none", 1);
    set("KIV_DEVICE_DIR", directory);
    ASSERT_GE(standin_device_dir(), 0);
}

void standin_device::TearDown()
{
    unsetenv("KIV_TRACE");
    unsetenv("KIV_FAULTS");
    standin_reload();
    std::filesystem::remove_all(directory);
}

void standin_device::write(const std::string &file, const std::string &text) const
{
    std::ofstream(path(file)) << text;
}

std::string standin_device::read(const std::string &file) const
{
    const std::ifstream in(path(file));
    std::ostringstream text;
    if (!in) {
        return "(missing)";
    }
    text << in.rdbuf();
    return text.str();
}

void standin_device::set(const char *variable, const std::string &value) const
{
    setenv(variable, value.c_str(), 1);
    standin_reload();
}

std::vector<std::string> standin_device::trace() const
{
    static const std::regex shape("^[0-9]+\\.[0-9]{6} (.*)$");
    std::vector<std::string> lines;
    std::ifstream in(path("trace"));
    for (std::string line; std::getline(in, line);) {
        if (line.find(" kiv_trace(") == std::string::npos) {
            lines.push_back(std::regex_replace(line, shape, "$1"));
        }
    }
    return lines;
}

int standin_device::open_queue(const char *name) const
{
    int handle = -1;
    EXPECT_GE(kiv_init_msg(name, &handle), 0) << name;
    return handle;
}

long long now_ms()
{
    using std::chrono::steady_clock;
    return std::chrono::duration_cast<std::chrono::milliseconds>(steady_clock::now().time_since_epoch()).count();
}
