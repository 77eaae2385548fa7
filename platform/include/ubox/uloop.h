// libubox is C, and its header does not say so to a C++ compiler: C++ includes it through this one.
#pragma once

extern "C" {
#include <libubox/uloop.h>
}
