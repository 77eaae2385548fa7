// A live session: statements as they come, on the wall clock, and what the daemon does meanwhile.
#pragma once

#include "player.h"

struct live_session {
    player p;
    bool typed = false;     // at a terminal: a statement that cannot be played is told, and no more
    int64_t failed = 0;     // expectations
    int line = 0;           // of the input, the last one that was read
    bool told_end = false;  // that the daemon has ended
    size_t told_errors = 0; // how much of what it has written to standard error
};

// Prints what has happened since it was last looked at.
void look_up(live_session &s);
// The same as a text.
std::string news(live_session &s);

// Plays statements, up to the first that cannot be read or played, or a signal. False when there is such one: what is
// wrong has been told. A daemon that has never been started is, before the first statement that needs it. text: whole
// lines, the last of them that of the session; name: what stands for a file in front of their numbers.
bool play_story(live_session &s, const scenario &story);
bool play_text(live_session &s, const std::string &text, const std::string &name);

// Answers help, leds and why. False when the line is none of them.
bool answer(live_session &s, const std::string &line);
