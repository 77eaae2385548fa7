// Which program this process runs.
#pragma once

#include <cstddef>

// Its name and version, from the package metadata that its build has left in it (note .note.package). A program
// without it has the process's name, and the version "unknown". Allocates nothing.
void find_program(char *name, size_t name_size, char *version, size_t version_size);
