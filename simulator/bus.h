// The other ends of the message bus: the queues of the system daemon and of the modules, and the BSP's indications.
#pragma once

#include <string>
#include <vector>

struct bus {
    std::string device;
    std::vector<int> queues;
};

// Opens every queue but the daemon's own. The device directory is KIV_DEVICE_DIR of this process.
bool open_bus(bus &b, const std::string &device, std::string &error);
void close_bus(bus &b);

// Neither blocks: a queue that is full is an error, because its reader waits for the clock.
bool send_to_daemon(const bus &b, const std::string &bytes, std::string &error);
bool send_indication(const bus &b, const std::string &text, std::string &error);

// Takes everything that the daemon has sent to the others. Returns how many messages that were.
int drain(const bus &b);
