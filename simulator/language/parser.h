// What the parts of the scenario parser share: the words of one statement, taken one by one.
#pragma once

#include "language/scenario.h"
#include "language/words.h"

struct statement_words {
    const std::vector<word> &words;
    size_t next;
    std::string error;
};

bool fail(statement_words &in, std::string error); // always false
bool at_end(const statement_words &in);
const word *take(statement_words &in);                         // null at the end
bool take_keyword(statement_words &in, std::string_view text); // only when it is the next word
bool take_number(statement_words &in, std::string_view what, int64_t least, int64_t most, int64_t &value);
bool take_text(statement_words &in, std::string_view what, std::string &text);

// The key and the value of a word KEY=VALUE.
bool split_pair(statement_words &in, const word &pair, std::string &key, std::string &value);
bool is_key(std::string_view text); // may name a file

bool parse_statement(const std::vector<word> &words, statement &out, std::string &error);
// The statements that become a message to the daemon.
bool parse_register(statement_words &in, statement &out);
bool parse_notify(statement_words &in, statement &out);
bool parse_command(statement_words &in, statement &out);
bool parse_raw(statement_words &in, statement &out);
bool parse_indication(statement_words &in, statement &out);

bool parse_expectation(statement_words &in, expectation &wanted);
