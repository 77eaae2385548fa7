// What a received message sets off: the command switch, and the decoding of the other modules' notifications.
#pragma once

#include "kiv/socket.h"

// Handles one message by its command. A null pointer and a message for another module are refused. p_data is
// terminated, at the latest by the byte behind the message. Receive thread.
void messageParse(const svc_msg *msg);
