// Plays the rest of the device to the real daemon: a statement in, what it did out. What plays scenarios, prints the
// table or takes statements from a person stands on this.
#pragma once

#include "rig.h"

#include <map>

#include <functional>

enum play_result { PLAY_HELD = 0, PLAY_FAILED = 1, PLAY_IMPOSSIBLE = 2 };

struct player_options {
    daemon_options process;
    std::string trace_path; // empty: not kept
    bool every_request = false;
    bool show_log = false;    // beside the timeline
    bool keep_going = false;  // after an expectation that does not hold
    std::string device;       // of a daemon that others start and end; empty: a fresh one
    FILE *timeline = nullptr; // null: none
};

// What one statement did. Times are of the device, from the beginning of the run.
struct played {
    play_result result = PLAY_HELD;
    std::string expected; // of an expectation that does not hold,
    std::string shown;    // and what is so instead
    std::string failure;  // for a person: what went wrong where, several lines; empty when all held
    int64_t begin_ns = 0;
    int64_t end_ns = 0;
    std::vector<led_event> changes;  // LEDs that show something else, in order; the first SEEN_MAX of a step
    std::vector<led_event> requests; // every LED request, refused ones too; the first SEEN_MAX of a step
};

struct repeat_round {
    const statement *repeat;
    int64_t round;
};

// One device, from set_up_player to take_down_player. One thread at a time.
struct player {
    rig device;
    int64_t held = 0;                 // expectations
    std::vector<repeat_round> rounds; // of the repeats around it, outermost first
    bool quiet = false;               // a repeat after its first round
    bool end_known = false;           // the daemon is gone, and the scenario wanted or expected that
    played now;                       // the statement that is being played
    const scenario *story = nullptr;
    size_t changes_before = 0; // how much of the step's changes and requests came before it
    size_t requests_before = 0;
    std::map<std::string, std::string> nv_written; // keys that the scenario has set, and where
};

// Makes a fresh device; nothing runs on it yet. False with the cause in error; take_down_player is due even so.
bool set_up_player(player &p, const player_options &options, std::string &error);

// Begins again on a fresh device.
bool renew_player(player &p, std::string &error);

// Plays one statement, with all rounds when it is a repeat. story names the files of the statement's place. After a
// result that is not PLAY_HELD the device stands as it is, and may be played on.
played play_statement(player &p, const scenario &story, const statement &s);

// Behind the last statement: a daemon that has ended by itself fails the run.
played finish_play(player &p, const scenario &story);

// Ends the daemon and removes the device, unless it is to be kept.
void take_down_player(player &p, bool keep_device);

struct play_report {
    played last;                       // the statement that ended the run; PLAY_HELD when there was none such
    std::vector<played> failed;        // every statement that did not hold: one, or more of a run that goes on
    std::vector<std::string> warnings; // what the scenario furnished or made fail, and nobody met
    int64_t held = 0;                  // expectations
    int64_t end_ns = 0;
    std::string complaints;                       // what the daemon's process wrote to standard error
    std::string device;                           // where it is kept, empty when it is gone
    std::array<led_look, LED_ID_COUNT> leds = {}; // at the end
};

// Called with each statement that has been played.
using play_watcher = std::function<void(const statement &, const played &)>;

// A whole scenario on a device of its own, up to the first statement that fails, or to the end when it keeps going. A
// failed run keeps its device.
play_report play(const scenario &story, const player_options &options, bool keep_device,
                 const play_watcher &watcher = {});
