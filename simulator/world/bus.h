// The other ends of the message bus: the queues of the system daemon and of the modules, and the BSP's indications.
#pragma once

#include <cstdint>
#include <deque>
#include <map>
#include <string>
#include <vector>

struct module_queue {
    int fd;
    int module_id; // 0 for the system daemon
};

struct bus {
    std::string device;
    std::vector<module_queue> queues;
    std::deque<std::string> pending;                 // messages to the daemon that its queue has no room for
    int64_t in_queue = 0;                            // messages that the daemon has been sent and has not taken
    std::map<int, std::vector<uint32_t>> registered; // the masks that the daemon registered with each module
    bool registered_unseen = false;                  // others had those messages, and no trace tells them
};

bool has_reader(const std::string &socket_path); // the file alone outlives its reader

// Opens every queue but the daemon's own and those that another program reads.
bool open_bus(bus &b, const std::string &device, std::string &error);
void close_bus(bus &b);

// Puts a message into the daemon's queue, or among the pending ones while that holds as many as a queue does. False
// when nobody listens.
bool send_to_daemon(bus &b, const std::string &bytes, std::string &error);
bool send_indication(const bus &b, const std::string &text, std::string &error);

void message_taken(bus &b); // the daemon has received one
void forget_queue(bus &b);  // the daemon has ended, and its queue with it

// Sends what is pending as far as there is room. Returns how many messages that were.
int deliver_pending(bus &b);

// Takes everything that the daemon has sent to the others; what it registers for is noted. Returns how many messages
// that were.
int drain(bus &b);

// Whether the module tells the daemon of this event: it has asked for it. The sleep module tells it unasked.
bool is_heard(const bus &b, int module_id, uint32_t event);
