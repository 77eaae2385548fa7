// What a page is told, as JSON texts. Times are of the device: milliseconds, LED changes and lines in microseconds.
#pragma once

#include "panel/session.h"

// Everything there is: the answer to GET /state. It holds the news of every batch made so far.
std::string whole_state(const session &s, const std::vector<std::string> &scenarios);

// What has changed since the last batch, and the news, which it takes out.
std::string next_batch(session &s);

std::string answer_of(const outcome &result);
std::string failure_of(const std::string &message);
