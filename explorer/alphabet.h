// What may happen to a device: stimuli in the words of the scenario language, by product and family of events.
#pragma once

#include "daemon.h"
#include "timers.h"

#include <string>
#include <string_view>
#include <vector>

// Products as names lists them.
enum product_number : unsigned { UFI, DATA_CARD, PAPER_KITE, MODULE, UNI_CORE, PRODUCTS };
// As bits.
constexpr unsigned ON_UFI = 1U << UFI;
constexpr unsigned ON_DATA_CARD = 1U << DATA_CARD;
constexpr unsigned ON_PAPER_KITE = 1U << PAPER_KITE;
constexpr unsigned ON_MODULE = 1U << MODULE;
constexpr unsigned ON_UNI_CORE = 1U << UNI_CORE;
constexpr unsigned ON_EVERY = (1U << PRODUCTS) - 1;

enum family : unsigned {
    POWER = 1, // and sleep, the night's beginning and end, heat, a relight and a restart: part of every exploration
    BATTERY = 2,
    NETWORK = 4, // with the data call and the reminder
    SIGNAL = 8,  // with the setting of the temperature alarm
    WIFI = 16,
    MESSAGES = 32,
    CALLS = 64, // voicemail and the phone
    NIGHT = 128,
    FAULTS = 256,   // refused LED requests, timers and NV reads
    REFUSALS = 512, // of other calls of the platform
    FAILURES = FAULTS | REFUSALS,
};
std::string family_names(unsigned families);

// A statement of a scenario, made ready.
struct action {
    verb what = verb::AFTER;
    uint8_t key = 0;
    uint8_t value = 0;  // a text, or a refused call
    int64_t number = 0; // the statement's, an indication or what a notification says
    received message = {};
    uint16_t module = 0;
    uint32_t event = 0;
};

struct stimulus {
    std::string text; // lines of a scenario; empty for a timer
    std::vector<action> actions;
    std::optional<timer_purpose> fires;
    bool indication = false; // of one indicator: repeating it should ask for nothing
};

// The stimuli of a product's families, timers included, in a fixed order. Aborts when one cannot be read.
std::vector<stimulus> alphabet_of(unsigned product, unsigned families);

// What a product's device holds before it starts, as a scenario says it, and the same done.
std::string furniture(unsigned product);
void furnish(unsigned product);
unsigned families_of(unsigned product);

// A stimulus for what the daemon is told outside of an alphabet.
stimulus stimulus_of(const std::string &text);

// Does it. False when nothing can happen: a timer that does not run.
bool apply(const stimulus &what, unsigned product);
