#include "panel/server.h"

#include <array>
#include <atomic>
#include <chrono>
#include <condition_variable>
#include <cstring>
#include <mutex>
#include <poll.h>
#include <random>
#include <sys/socket.h>
#include <thread>
#include <unistd.h>

namespace
{
using std::chrono::steady_clock;

constexpr std::chrono::seconds REQUEST_TIME{5}; // for all of it to arrive
constexpr int WRITE_WAIT_MS = 5000;
constexpr const char *CONTENT_POLICY =
    "default-src 'none'; script-src 'self'; style-src 'self'; img-src 'self' data:; connect-src 'self'; "
    "base-uri 'none'; form-action 'none'; frame-ancestors 'none'";
constexpr char BUSY[] = "HTTP/1.1 503 Service Unavailable\r\nConnection: close\r\nContent-Length: 0\r\n\r\n";

thread_local bool too_many; // the connection that is being taken

// One request as a stream of bytes: what is too slow or too long comes to an end.
class connection : public httplib::Stream
{
public:
    explicit connection(int descriptor) : fd(descriptor), until(steady_clock::now() + REQUEST_TIME) {}

    bool is_readable() const override { return wait(POLLIN, 0); }
    bool is_writable() const override { return wait(POLLOUT, WRITE_WAIT_MS); }
    ssize_t read(char *to, size_t size) override
    {
        if (begin == end && !fill()) {
            return -1;
        }
        const size_t count = std::min(size, end - begin);
        memcpy(to, buffer.data() + begin, count);
        begin += count;
        return static_cast<ssize_t>(count);
    }
    ssize_t write(const char *from, size_t size) override
    {
        return is_writable() ? send(fd, from, size, MSG_NOSIGNAL) : -1;
    }
    void get_remote_ip_and_port(std::string &ip, int &port) const override
    {
        ip = "127.0.0.1";
        port = 0;
    }
    void get_local_ip_and_port(std::string &ip, int &port) const override { get_remote_ip_and_port(ip, port); }
    socket_t socket() const override { return fd; }

private:
    bool wait(short events, int ms) const
    {
        pollfd one = {fd, events, 0};
        return poll(&one, 1, ms) > 0;
    }
    bool fill()
    {
        const auto left = std::chrono::duration_cast<std::chrono::milliseconds>(until - steady_clock::now()).count();
        if (left <= 0 || got_bytes > REQUEST_BYTES_MAX || !wait(POLLIN, static_cast<int>(left))) {
            return false;
        }
        const ssize_t got = recv(fd, buffer.data(), buffer.size(), 0);
        begin = 0;
        end = got > 0 ? static_cast<size_t>(got) : 0;
        got_bytes += end;
        return got > 0;
    }

    int fd;
    steady_clock::time_point until;
    std::array<char, 4096> buffer = {};
    size_t begin = 0;
    size_t end = 0;
    size_t got_bytes = 0;
};

// A thread for each connection, up to as many as there may be; one more is told so at once.
class connection_threads : public httplib::TaskQueue
{
public:
    void enqueue(std::function<void()> serve) override
    {
        std::unique_lock lock(guard);
        if (count >= CONNECTIONS_MAX) {
            lock.unlock();
            too_many = true;
            serve();
            too_many = false;
            return;
        }
        count++;
        lock.unlock();
        std::thread([this, serve] {
            serve();
            const std::lock_guard ended(guard);
            count--;
            all_ended.notify_all();
        }).detach();
    }
    void shutdown() override
    {
        std::unique_lock lock(guard);
        all_ended.wait(lock, [&] { return count == 0; });
    }

private:
    std::mutex guard;
    std::condition_variable all_ended;
    int count = 0;
};

bool is_own_host(const std::string &host, int port)
{
    const std::string behind = ":" + std::to_string(port);
    return host == "127.0.0.1" + behind || host == "localhost" + behind;
}

bool is_own_origin(const std::string &origin, int port)
{
    constexpr std::string_view scheme = "http://";
    return origin.empty() || (origin.starts_with(scheme) && is_own_host(origin.substr(scheme.size()), port));
}

void refuse(httplib::Response &response, int status, const char *why)
{
    response.status = status;
    response.set_content(std::string(why) + "\n", "text/plain");
}
} // namespace

bool panel_server::process_and_close_socket(socket_t fd)
{
    bool served = false;
    if (too_many) {
        send(fd, BUSY, sizeof BUSY - 1, MSG_NOSIGNAL | MSG_DONTWAIT);
    } else {
        connection stream(fd);
        bool closed = false;
        served = process_request(stream, true, closed, nullptr);
    }
    ::shutdown(fd, SHUT_RDWR);
    close(fd);
    return served;
}

void panel_server::lengthen_queue()
{
    constexpr int waiting_max = 512;
    ::listen(svr_sock_, waiting_max);
}

void guard_requests(panel_server &server, int port, const std::string &token)
{
    server.new_task_queue = [] { return new connection_threads; };
    server.set_payload_max_length(256 * 1024);
    server.set_default_headers({
        {"Content-Security-Policy",      CONTENT_POLICY},
        {"X-Content-Type-Options",       "nosniff"     },
        {"Referrer-Policy",              "no-referrer" },
        {"Cross-Origin-Resource-Policy", "same-origin" },
        {"Cross-Origin-Opener-Policy",   "same-origin" },
        {"Cache-Control",                "no-store"    },
    });
    server.set_pre_routing_handler([port, token](const httplib::Request &request, httplib::Response &response) {
        if (!is_own_host(request.get_header_value("Host"), port)) {
            refuse(response, 403, "this is not the host that you asked for");
        } else if (!is_own_origin(request.get_header_value("Origin"), port)) {
            refuse(response, 403, "only the panel's own page may ask");
        } else if (request.method == "POST" && request.get_header_value("X-Panel-Token") != token) {
            refuse(response, 403, "POST needs the token of the page in X-Panel-Token");
        } else {
            return httplib::Server::HandlerResponse::Unhandled;
        }
        return httplib::Server::HandlerResponse::Handled;
    });
}

std::string make_token()
{
    std::random_device random;
    std::string token;
    while (token.size() < 32) {
        std::array<char, 9> digits;
        snprintf(digits.data(), digits.size(), "%08x", random());
        token += digits.data();
    }
    return token;
}
