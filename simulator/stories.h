// The scenarios that a command line names.
#pragma once

#include "language/scenario.h"

// Every path, and for a folder every scenario (*.scn) in and below it in the order of their names. False after a
// message on standard error when one cannot be read or holds none.
bool find_stories(const std::vector<std::string> &paths, std::vector<std::string> &files);

// False with what is wrong in error, each on a line of its own.
bool load_story(const std::string &path, scenario &story, std::string &error);
