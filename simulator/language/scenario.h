// A scenario as statements: what the device does to the daemon, and what must then be seen.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <string_view>
#include <vector>

struct file_write {
    std::string path;                // within the device directory
    std::optional<std::string> text; // none: the file goes
};

enum class led_mode { OFF, ON, BLINK };

struct led_look {
    led_mode mode = led_mode::OFF;
    int brightness = 0;
    int blink_time1 = 0;
    int blink_time2 = 0;

    bool operator==(const led_look &) const = default;
};

struct led_wanted {
    int led = 0;
    led_look look;
};

enum class subject {
    LED,           // looks[0]
    ONLY,          // looks, everything else dark
    NO_CHANGE,     // no LED shows anything else than before the step
    REQUESTS,      // number of LED requests in the step
    LOG,           // text, and number as the level unless -1
    NO_LOG,        // text
    SENT,          // text, to module number
    NV,            // key has text
    NV_MISSING,    // key
    NV_WRITTEN,    // key was given text in the step
    TIMER,         // a timer of number ms runs; repeats
    TIMER_COUNT,   // number of timers that run
    TIMER_DELETED, // a timer that ran was deleted in the step
    RAN,           // text is part of a shell command of the step
    TR181,         // text is part of record key
    OUTPUT,        // text is part of what the daemon printed in the step
    ALIVE,
    ENDED,
};

struct expectation {
    subject what = subject::ALIVE;
    std::vector<led_wanted> looks;
    std::string key;
    std::string text;
    int64_t number = -1;
    bool repeats = false;
};

enum class verb {
    WRITE,       // files
    SEND,        // bytes to the daemon's queue
    INDICATE,    // bytes to the BSP's indication socket
    FAIL,        // bytes, a line for faults/key
    REPAIR,      // key, or every call when it is empty
    TIME_OF_DAY, // number: seconds of the day, UTC
    DATE,        // number: seconds since 1970, UTC
    JUMP,        // number: nanoseconds to add to the wall clock
    LAUNCH,
    START, // LAUNCH, then the start record
    KILL,
    AFTER,  // number: nanoseconds
    REPEAT, // body, number of times
    EXPECT,
};

struct statement {
    verb what = verb::WRITE;
    size_t file = 0; // index into scenario::files
    int line = 0;
    std::string text; // as written, without indentation and comment
    std::vector<file_write> files;
    std::string key;
    std::string bytes;
    int module_id = 0;  // of a notification that only comes to who registered for it; 0 for everything else
    uint32_t event = 0; // its event
    int64_t number = 0;
    expectation wanted;
    std::vector<statement> body;
};

struct include_place {
    size_t file = 0;
    int line = 0;
};

struct scenario {
    std::vector<std::string> files;         // the first is the scenario itself, the others are what it includes
    std::vector<include_place> included_at; // of each file; of the first it means nothing
    std::vector<statement> statements;
    bool has_byte_order_mark = false; // an editor's, in one of the files
};

// Reads a file for an include. False when there is none.
using file_loader = std::function<bool(const std::string &path, std::string &text)>;

constexpr size_t SCENARIO_FILE_MAX = 256 * 1024;

// Parses the text of one scenario. False with "FILE:LINE: what is wrong" in error. Has no other effect than its
// results and the calls of load.
bool parse_scenario(std::string_view text, const std::string &name, const file_loader &load, scenario &story,
                    std::string &error);
