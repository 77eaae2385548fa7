// The daemon in this process: started, killed, told, and its whole state taken and put back.
#pragma once

#include "kiv/socket.h"
#include "world.h"

#include <cstddef>
#include <string>

// Every writable static of the daemon is part of its state.
bool daemon_holds(int word); // in one of them

// The daemon and the device: a state of the exploration, as bytes.
constexpr size_t SNAPSHOT_MAX = 32768;
struct snapshot {
    std::array<std::byte, SNAPSHOT_MAX> bytes; // the world, then the daemon
};
size_t snapshot_size();
void take_snapshot(snapshot &into);
void put_back(const snapshot &from);

void cold_daemon();  // as the program's file has it; no timer runs
void start_daemon(); // a cold one: handshake, initial scene; pending relights are delivered
void kill_daemon();

// A message as it lies in the receive buffer, whole.
struct received {
    svc_msg message;
    char terminator;
};
received received_of(const std::string &bytes);
void deliver(const received &message); // to the end, with the relights that it leads to
void indicate(int event_id);
void deliver_relights();
