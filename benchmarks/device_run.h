// The real daemon on a device directory of its own, a receiver that only receives beside it, and a way to send to both.
#pragma once

#include "kiv/socket.h"

#include <string>
#include <sys/types.h>

struct device_run {
    std::string dir; // removed by end_device
    pid_t daemon = -1;
    pid_t bare = -1;
    pid_t bare_led = -1;
};

constexpr char LED_QUEUE[] = "MSG_ID_LED";
constexpr char BARE_QUEUE[] = "MSG_ID_BARE";         // of a process that receives and does nothing else
constexpr char BARE_LED_QUEUE[] = "MSG_ID_BARE_LED"; // of one that writes what it receives, "1" lit and "0" dark, into
constexpr char BARE_BRIGHTNESS[] = "/bare_brightness";

// A handheld, started, registered and switched on, with NV that says what each notification asks for. Exits with a
// message when it cannot be had.
device_run start_device();
void start_bare_led(device_run &device); // it is lit
void end_device(device_run &device);

svc_msg notification(uint16_t module, uint32_t event, const char *payload);
int message_length(const svc_msg &message);

// A socket connected to a queue; a send to it waits while the queue is full.
int connect_queue(const device_run &device, const char *queue_name);
void wait_until_taken(int queue); // until the reader has received all that was sent through this socket
[[noreturn]] void give_up(const char *what);
