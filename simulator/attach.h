// The rig on a device whose daemon others start and end.
#pragma once

#include "rig.h"

// Takes the device directory, which is made when it is missing, and the daemon that runs there, if one does: what it
// has done so far is observed. The simulator is the other modules as far as no other program is.
bool attach_rig(rig &r, const std::string &device, std::string &error);

// Takes the daemon that runs there now. False when there is none.
bool take_daemon(rig &r);

// Waits some seconds for one. False with an error text that says how to start one.
bool await_daemon(rig &r, std::string &error);
