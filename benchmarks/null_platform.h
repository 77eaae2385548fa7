// The platform that does nothing. Its queue hands out messages of the benchmark's choice.
#pragma once

#include "kiv/socket.h"

#include <cstddef>

// What kiv_recv_msg hands out, round and round.
void null_platform_feed(const svc_msg *messages, const int *lengths, size_t count);
