#include "language/doubts.h"

#include "kiv/socket.h"
#include "language/names.h"
#include "language/vocabulary.h"

#include <algorithm>
#include <cstddef>

namespace
{
struct doubting {
    const scenario &story;
    std::vector<std::string> doubts;
    int expectations = 0;
    bool has_product = false;
    bool has_started = false;
};

void doubt(doubting &d, const statement &s, const std::string &what)
{
    d.doubts.push_back(d.story.files[s.file] + ":" + std::to_string(s.line) + ": warning: " + what);
}

std::string nearest_key(std::string_view key)
{
    std::vector<std::string_view> known;
    known.reserve(nv_words().size());
    for (const nv_word &word : nv_words()) {
        known.push_back(word.key);
    }
    return nearest(key, known);
}

std::string nearest_led(std::string_view name)
{
    std::vector<std::string_view> known;
    known.reserve(led_rows.size());
    for (const led_row &row : led_rows) {
        known.emplace_back(row.name);
    }
    return nearest(name, known);
}

void look_at_files(doubting &d, const statement &s)
{
    for (const file_write &file : s.files) {
        d.has_product |= file.path == "cfg/6000";
        if (!file.path.starts_with("nv/")) {
            continue;
        }
        const std::string key = file.path.substr(3);
        const auto words = nv_words();
        if (std::none_of(words.begin(), words.end(), [&key](const nv_word &word) { return word.key == key; })) {
            doubt(d, s, "the daemon never reads NV '" + key + "'; did you mean " + nearest_key(key) + "?");
        }
    }
}

// A notification whose sender must have been asked for it; what is sent unregistered may be anything.
void look_at_text(doubting &d, const statement &s)
{
    if (s.module_id == 0 || event_word(s.module_id, s.event).empty()) {
        return;
    }
    const std::string text = s.bytes.substr(offsetof(svc_msg, p_data)).c_str();
    if (has_meaning(s.module_id, s.event, text)) {
        return;
    }
    const text_word *word = find_text_word(s.module_id, s.event);
    doubt(d, s,
          word ? "'" + text + "' means nothing to the daemon; it knows " + std::string(word->meaning)
               : "the daemon does not look at the text of this event");
}

void look_at_indication(doubting &d, const statement &s)
{
    const int id = atoi(s.bytes.c_str());
    if (id < INDICATION_FIRST || id > INDICATION_LAST) {
        doubt(d, s, "no board sends indication " + std::to_string(id) + "; they are 1350 to 1357");
    }
}

// The piece of the arguments of an LED request, as far as it looks like the name of an LED.
void look_at_fault(doubting &d, const statement &s)
{
    const std::string piece = s.bytes.substr(1, s.bytes.find('\'', 1) - 1);
    const std::string name = piece.substr(0, piece.find_first_of(" ,)"));
    const bool exists = std::any_of(led_rows.begin(), led_rows.end(), [&name](const led_row &row) {
        return std::string_view(row.name).find(name) != std::string_view::npos;
    });
    if (s.key == "kiv_bsp_set_leds_sync" && !exists && name.find('_') != std::string::npos) {
        doubt(d, s, "there is no LED '" + name + "'; did you mean " + nearest_led(name) + "?");
    }
}

void look_at(doubting &d, const std::vector<statement> &statements)
{
    for (const statement &s : statements) {
        look_at_files(d, s);
        switch (s.what) {
        case verb::START:
        case verb::LAUNCH:
            if (!d.has_product && !d.has_started) {
                doubt(d, s, "no product is set; without one the daemon takes the device for a data card");
            }
            d.has_started = true;
            break;
        case verb::SEND:
            look_at_text(d, s);
            break;
        case verb::INDICATE:
            look_at_indication(d, s);
            break;
        case verb::FAIL:
            look_at_fault(d, s);
            break;
        case verb::EXPECT:
            d.expectations++;
            break;
        case verb::REPEAT:
            look_at(d, s.body);
            break;
        default:
            break;
        }
    }
}
} // namespace

std::vector<std::string> find_doubts(const scenario &story)
{
    doubting d = {.story = story, .doubts = {}};
    if (story.has_byte_order_mark) {
        d.doubts.push_back(story.files[0] + ": warning: a file begins with a byte-order mark; it is passed over");
    }
    look_at(d, story.statements);
    if (d.expectations == 0) {
        d.doubts.push_back(story.files[0] + ": warning: the scenario expects nothing");
    }
    return d.doubts;
}
