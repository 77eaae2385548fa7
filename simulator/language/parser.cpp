#include "language/parser.h"

#include <algorithm>

namespace
{
constexpr int MAX_INCLUDES_DEEP = 8;
constexpr int MAX_INCLUDES = 1000;
constexpr size_t MAX_REPEATS_DEEP = 8;
constexpr size_t MAX_STATEMENTS = 100'000;
constexpr size_t MAX_LINE = 8192;
constexpr size_t MAX_ERRORS = 50;
constexpr std::string_view BYTE_ORDER_MARK = "\xef\xbb\xbf";

// One scenario on its way to statements.
struct reading {
    const file_loader &load;
    scenario &story;
    std::string &error;
    size_t statements = 0;
    int includes_deep = 0;
    int includes = 0;
    size_t errors = 0;            // it goes on behind a bad line, so that all of them are told at once
    include_place including = {}; // where the include stands that is being read
};

// One of its files, and the repeats that it has opened, outermost first.
struct source {
    size_t file;
    int line = 0;
    std::vector<statement> open_repeats;
    std::vector<statement> done;
};

bool parse_text(reading &state, std::string_view text, const std::string &name, std::vector<statement> &into);

bool refuse(reading &state, const source &from, int line, const std::string &what)
{
    if (state.errors++ < MAX_ERRORS) {
        state.error +=
            (state.error.empty() ? "" : "\n") + state.story.files[from.file] + ":" + std::to_string(line) + ": " + what;
    }
    return false;
}

std::vector<statement> &current_block(source &from)
{
    return from.open_repeats.empty() ? from.done : from.open_repeats.back().body;
}

// A name that is not absolute is looked up beside the file that includes it.
std::string beside(const std::string &file, const std::string &name)
{
    const size_t slash = file.rfind('/');
    return name.starts_with('/') || slash == std::string::npos ? name : file.substr(0, slash + 1) + name;
}

bool include(reading &state, source &from, const std::vector<word> &words)
{
    if (words.size() != 2 || words[1].text.empty()) {
        return refuse(state, from, from.line, "include \"FILE\"");
    }
    if (state.includes_deep == MAX_INCLUDES_DEEP) {
        return refuse(state, from, from.line, "includes are nested more than 8 deep");
    }
    if (++state.includes > MAX_INCLUDES) {
        return refuse(state, from, from.line, "more than 1000 files are included");
    }
    const std::string path = beside(state.story.files[from.file], words[1].text);
    std::string text;
    if (!state.load(path, text)) {
        return refuse(state, from, from.line, "cannot read '" + path + "'");
    }
    state.includes_deep++;
    state.including = {from.file, from.line};
    const bool parsed = parse_text(state, text, path, current_block(from));
    state.includes_deep--;
    return parsed;
}

bool end_repeat(reading &state, source &from, const std::vector<word> &words)
{
    if (words.size() > 1) {
        return refuse(state, from, from.line, "'" + words[1].text + "' is too much");
    }
    if (from.open_repeats.empty()) {
        return refuse(state, from, from.line, "end without repeat");
    }
    statement finished = std::move(from.open_repeats.back());
    from.open_repeats.pop_back();
    current_block(from).push_back(std::move(finished));
    return true;
}

// The line as the timeline shows it: without its indentation and its comment.
std::string shown(std::string_view line)
{
    bool quoted = false;
    size_t end = 0;
    while (end < line.size() && (quoted || line[end] != '#' || line[end - 1] > ' ')) {
        if (quoted && line[end] == '\\') {
            end++;
        } else if (line[end] == '"') {
            quoted = !quoted;
        }
        end++;
    }
    line = line.substr(0, end);
    const size_t first = line.find_first_not_of(" \t\r");
    return std::string(line.substr(first, line.find_last_not_of(" \t\r") + 1 - first));
}

bool take_line(reading &state, source &from, std::string_view line)
{
    std::vector<word> words;
    std::string error;
    if (line.size() > MAX_LINE) {
        return refuse(state, from, from.line, "the line is longer than 8192 characters");
    }
    if (!split_line(line, words, error)) {
        return refuse(state, from, from.line, error);
    }
    if (words.empty()) {
        return true;
    }
    if (words[0].text == "include") {
        return include(state, from, words);
    }
    if (words[0].text == "end") {
        return end_repeat(state, from, words);
    }
    if (++state.statements > MAX_STATEMENTS) {
        return refuse(state, from, from.line, "more than 100000 statements");
    }
    statement parsed;
    if (!parse_statement(words, parsed, error)) {
        if (words[0].text == "repeat" && from.open_repeats.size() < MAX_REPEATS_DEEP) {
            from.open_repeats.emplace_back(); // for its end
        }
        return refuse(state, from, from.line, error);
    }
    parsed.file = from.file;
    parsed.line = from.line;
    parsed.text = shown(line);
    if (parsed.what != verb::REPEAT) {
        current_block(from).push_back(std::move(parsed));
    } else if (from.open_repeats.size() == MAX_REPEATS_DEEP) {
        return refuse(state, from, from.line, "repeats are nested more than 8 deep");
    } else {
        from.open_repeats.push_back(std::move(parsed));
    }
    return true;
}

bool parse_text(reading &state, std::string_view text, const std::string &name, std::vector<statement> &into)
{
    source from = {.file = state.story.files.size(), .line = 0, .open_repeats = {}, .done = {}};
    state.story.files.push_back(name);
    state.story.included_at.push_back(state.including);
    if (text.size() > SCENARIO_FILE_MAX) {
        return refuse(state, from, 1, "the file is larger than 256 KiB");
    }
    if (text.starts_with(BYTE_ORDER_MARK)) {
        text.remove_prefix(BYTE_ORDER_MARK.size());
        state.story.has_byte_order_mark = true;
    }
    while (!text.empty()) {
        const size_t end = std::min(text.find('\n'), text.size());
        from.line++;
        take_line(state, from, text.substr(0, end));
        if (state.errors > MAX_ERRORS) {
            return false;
        }
        text.remove_prefix(std::min(end + 1, text.size()));
    }
    if (!from.open_repeats.empty() && state.errors == 0) {
        return refuse(state, from, from.open_repeats.back().line, "repeat without end");
    }
    std::move(from.done.begin(), from.done.end(), std::back_inserter(into));
    return state.errors == 0;
}
} // namespace

bool fail(statement_words &in, std::string error)
{
    if (in.error.empty()) {
        in.error = std::move(error);
    }
    return false;
}

bool at_end(const statement_words &in)
{
    return in.next == in.words.size();
}

const word *take(statement_words &in)
{
    return at_end(in) ? nullptr : &in.words[in.next++];
}

bool take_keyword(statement_words &in, std::string_view text)
{
    if (at_end(in) || in.words[in.next].quoted || in.words[in.next].text != text) {
        return false;
    }
    in.next++;
    return true;
}

bool take_number(statement_words &in, std::string_view what, int64_t least, int64_t most, int64_t &value)
{
    const word *digits = take(in);
    const std::optional<int64_t> number = digits ? parse_number(digits->text, least, most) : std::nullopt;
    if (!number) {
        return fail(in, in.words[0].text + " takes " + std::string(what) + " from " + std::to_string(least) + " to " +
                            std::to_string(most) + " here" + (digits ? ", not '" + digits->text + "'" : ""));
    }
    value = *number;
    return true;
}

bool take_text(statement_words &in, std::string_view what, std::string &text)
{
    const word *next = take(in);
    if (!next) {
        return fail(in, in.words[0].text + " takes " + std::string(what) + " here");
    }
    text = next->text;
    return true;
}

bool split_pair(statement_words &in, const word &pair, std::string &key, std::string &value)
{
    if (!pair.sign) {
        return fail(in, "'" + pair.text + "' is not KEY=VALUE");
    }
    key = pair.text.substr(0, *pair.sign);
    value = pair.text.substr(*pair.sign + 1);
    return true;
}

bool is_key(std::string_view text)
{
    constexpr std::string_view letters = "ABCDEFGHIJKLMNOPQRSTUVWXYZabcdefghijklmnopqrstuvwxyz0123456789_-.";
    return !text.empty() && text.size() <= 128 && text[0] != '.' &&
           text.find_first_not_of(letters) == std::string_view::npos;
}

bool parse_scenario(std::string_view text, const std::string &name, const file_loader &load, scenario &story,
                    std::string &error)
{
    reading state = {.load = load, .story = story, .error = error};
    story = {};
    error.clear();
    return parse_text(state, text, name, story.statements);
}
