#include "world/device.h"

#include <cerrno>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <sys/stat.h>

namespace fs = std::filesystem;

namespace
{
bool write_whole(const fs::path &path, const std::string &text, std::string &error)
{
    const fs::path fresh = path.parent_path() / ".new";
    std::error_code failure;
    const mode_t before = umask(077); // a folder that others can write to is refused
    fs::create_directories(path.parent_path(), failure);
    umask(before);
    std::ofstream out(fresh, std::ios::binary | std::ios::trunc);
    out << text;
    out.close();
    if (out) {
        fs::rename(fresh, path, failure);
    }
    if (out && !failure) {
        return true;
    }
    error = path.string() + " cannot be written";
    return false;
}
} // namespace

std::string make_device(std::string &error)
{
    const char *place = getenv("TMPDIR");
    std::string device = std::string(place && *place ? place : "/tmp") + "/kiv_led_XXXXXX";
    if (!mkdtemp(device.data())) {
        error = device + ": " + strerror(errno);
        return {};
    }
    return device;
}

void remove_device(const std::string &device)
{
    std::error_code failure;
    fs::remove_all(device, failure);
}

bool write_device_file(const std::string &device, const file_write &file, std::string &error)
{
    const fs::path path = fs::path(device) / file.path;
    std::error_code failure;
    if (file.text) {
        return write_whole(path, *file.text + "\n", error);
    }
    fs::remove(path, failure);
    // A device without an LED has no folder for it either.
    if (path.parent_path().parent_path().filename() == "leds") {
        fs::remove(path.parent_path(), failure);
    }
    return true;
}

bool add_fault(const std::string &device, const std::string &call, const std::string &line, std::string &error)
{
    std::string text;
    const fs::path path = fs::path(device) / "faults" / call;
    read_file(path.string(), text);
    return write_whole(path, text + line + "\n", error);
}

void remove_faults(const std::string &device, const std::string &call)
{
    std::error_code failure;
    const fs::path folder = fs::path(device) / "faults";
    if (!call.empty()) {
        fs::remove(folder / call, failure);
    } else {
        for (const fs::directory_entry &entry : fs::directory_iterator(folder, failure)) {
            fs::remove(entry.path(), failure);
        }
    }
}

bool write_file(const std::string &path, const std::string &text, std::string &error)
{
    std::error_code failure;
    const bool is_special = fs::exists(path, failure) && !fs::is_regular_file(path, failure); // /dev/stdout, a pipe
    const std::string fresh = is_special ? path : path + ".new";
    std::ofstream out(fresh, std::ios::binary | std::ios::trunc);
    out << text;
    out.close();
    const int cause = errno;
    if (out && !is_special) {
        fs::rename(fresh, path, failure);
    }
    if (out && !failure) {
        return true;
    }
    error = path + " cannot be written: " + (failure ? failure.message() : strerror(cause));
    if (!is_special) {
        fs::remove(fresh, failure);
    }
    return false;
}

bool copy_file(const std::string &from, const std::string &to, std::string &error)
{
    const std::string fresh = to + ".new";
    std::error_code failure;
    fs::copy_file(from, fresh, fs::copy_options::overwrite_existing, failure);
    if (!failure) {
        fs::rename(fresh, to, failure);
    }
    if (!failure) {
        return true;
    }
    error = to + " cannot be written: " + failure.message();
    fs::remove(fresh, failure);
    return false;
}

bool read_file(const std::string &path, std::string &text)
{
    std::ifstream in(path, std::ios::binary);
    if (!in) {
        return false;
    }
    text.assign(std::istreambuf_iterator<char>(in), {});
    return !in.bad();
}

bool load_scenario_file(const std::string &path, std::string &text)
{
    std::error_code failure;
    return fs::is_regular_file(path, failure) && fs::file_size(path, failure) <= SCENARIO_FILE_MAX &&
           read_file(path, text);
}

bool read_device_text(const std::string &device, const std::string &file, std::string &text)
{
    if (!read_file(device + "/" + file, text)) {
        return false;
    }
    if (text.ends_with('\n')) {
        text.pop_back();
    }
    return true;
}
