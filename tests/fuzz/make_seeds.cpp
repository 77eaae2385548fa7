// Turns scenarios into inputs of the receive target: make_seeds FOLDER SCENARIO...
#include "kiv/adabsp.h"
#include "language/scenario.h"
#include "receive_input.h"

#include <algorithm>
#include <cstdio>
#include <filesystem>
#include <fstream>
#include <iterator>
#include <string_view>

constexpr std::array<std::string_view, 5> products = {"DRIVER_UFI", "ONLY_DATA_CARD", "PAPER_KITE", "MODULE",
                                                      "UNI_CORE_CPE"};

static bool load(const std::string &path, std::string &text)
{
    std::ifstream file(path, std::ios::binary);
    text.assign(std::istreambuf_iterator<char>(file), {});
    return file.good() || !text.empty();
}

static std::string two_bytes(size_t number)
{
    return {static_cast<char>(number & 0xff), static_cast<char>(number >> 8)};
}

static void add_file(std::string &seed, const std::filesystem::path &path, const std::string &text, bool there)
{
    const std::string name = path.filename();
    const auto key = std::find(input_nv_keys.begin(), input_nv_keys.end(), name);
    const size_t product = static_cast<size_t>(std::find(products.begin(), products.end(), text) - products.begin());

    if (path == "cfg/6000" && product < products.size()) {
        seed[0] = static_cast<char>(product);
    } else if (path.parent_path() == "nv" && key != input_nv_keys.end()) {
        seed += {STEP_NV, static_cast<char>(key - input_nv_keys.begin())};
        seed += static_cast<char>(there ? std::min<size_t>(text.size(), MISSING_NV - 1) : MISSING_NV);
        seed += text.substr(0, MISSING_NV - 1);
    } else if (name.starts_with("sensor_")) {
        seed += {STEP_SENSOR, static_cast<char>(name.back() - '0'), static_cast<char>(there ? std::stoi(text) : -128)};
    } else if (name == "charger" || name == "battery") {
        seed += {STEP_QUERY, static_cast<char>(name == "battery"), static_cast<char>(there ? 0 : -128),
                 static_cast<char>(text == "1")};
    } else if (path == "leds/led:rolling_leds/brightness") {
        seed += {STEP_ROLLING_LEDS, there && !text.empty() ? text[0] : '\0'};
    }
}

static void add(std::string &seed, const std::vector<statement> &statements)
{
    for (const statement &each : statements) {
        for (const file_write &file : each.files) {
            add_file(seed, file.path, file.text.value_or(""), file.text.has_value());
        }
        if (each.what == verb::SEND) {
            const std::string message = each.bytes.substr(0, LONGEST_INPUT_MESSAGE);
            seed += STEP_MESSAGE;
            seed += two_bytes(message.size()) + message;
        } else if (each.what == verb::INDICATE) {
            const int id = std::stoi(each.bytes) - FIRST_INPUT_INDICATION;
            seed += {STEP_INDICATION, static_cast<char>((id & 0xf) | (each.bytes.ends_with("null") ? 0x80 : 0))};
        } else if (each.what == verb::AFTER) {
            seed += {STEP_TIMER, 0, STEP_TIMER, 1};
        } else if (each.what == verb::TIME_OF_DAY) {
            seed += STEP_CLOCK;
            seed += two_bytes(static_cast<size_t>(each.number / 60));
        } else if (each.what == verb::REPEAT) {
            add(seed, each.body);
        }
    }
}

int main(int argc, char **argv)
{
    for (int i = 2; i < argc; ++i) {
        std::string text;
        std::string error;
        scenario story;
        if (!load(argv[i], text) || !parse_scenario(text, argv[i], load, story, error)) {
            std::fprintf(stderr, "%s: %s\n", argv[i], error.c_str());
            continue;
        }
        std::string seed(1 + INPUT_STATE_WORDS, '\0');
        add(seed, story.statements);
        std::ofstream(std::filesystem::path(argv[1]) / std::filesystem::path(argv[i]).stem()) << seed;
    }
    return 0;
}
