// The daemon's queue: the start handshake with the system daemon, then every later message.
#pragma once

#include "kiv/socket.h"

// A received message with a terminator of ours behind it, so that a payload that fills it is a text all the same.
struct received_message {
    svc_msg message;
    char terminator;
};

// Opens "MSG_ID_LED", says hello to "MSG_ID_DAEMON" and serves registration requests until the start record arrives.
// Retries the opening every second without end. Main thread, once.
void kiv_led_wait_for_daemon();

// Sends the system daemon the record that says every registration is made. Returns 0, or -1.
int kiv_led_send_reg_complete();

// Body of the receive thread: handles one message to the end before it takes the next. Never returns.
void *kiv_led_socket_server_thread(void *unused);

// One turn of the receive thread: waits for a message and handles it, or drops it while the LED function is off. The
// thread takes turns for ever; who drives the daemon without its threads takes them one by one.
void kiv_led_receive_message(received_message &received);
