// The panel's address: one page and what it asks for, over HTTP on 127.0.0.1 alone. Every connection is one request.
#pragma once

#include <string>

#include <httplib.h>

constexpr int CONNECTIONS_MAX = 64;
constexpr int REQUEST_BYTES_MAX = 512 * 1024; // with its head

class panel_server : public httplib::Server
{
public:
    // Behind binding: the library's own queue of five would keep a page waiting in a crowd.
    void lengthen_queue();

    bool process_and_close_socket(socket_t fd) override;
};

// Refuses what does not come from the panel's own page: another Host, a foreign Origin, a POST without the token.
void guard_requests(panel_server &server, int port, const std::string &token);

std::string make_token(); // 128 random bits
