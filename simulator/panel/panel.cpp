#include "panel/panel.h"

#include "panel/routes.h"
#include "panel/view.h"
#include "table.h"

#include <algorithm>
#include <chrono>
#include <csignal>
#include <filesystem>
#include <memory>
#include <spawn.h>
#include <thread>
#include <unistd.h>

namespace fs = std::filesystem;

namespace
{
using std::chrono::steady_clock;

constexpr int EXIT_UNUSABLE = 2;
constexpr int TICK_MS = 20;
constexpr int CLOCK_EVERY = 5; // ticks: pages let their clock run on in between
constexpr const char *ADDRESS = "127.0.0.1";

std::atomic<bool> *stop_flag; // of the panel that runs

void stop_panel(int)
{
    *stop_flag = true;
}

int refuse(const std::string &why)
{
    fprintf(stderr, "%s\n", why.c_str());
    return EXIT_UNUSABLE;
}

std::vector<std::string> scenarios_in(const std::string &folder)
{
    std::vector<std::string> found;
    std::error_code failure;
    for (const fs::directory_entry &entry : fs::recursive_directory_iterator(folder, failure)) {
        if (entry.path().extension() == ".scn") {
            found.push_back(entry.path().lexically_normal().string());
        }
    }
    std::sort(found.begin(), found.end());
    return found;
}

// The first thing on the device. False with the cause in error.
bool begin(panel &p, const std::string &what, std::string &error)
{
    if (const product_name *product = find_product(what)) {
        const outcome done = renew(p.device, switched_on(*product));
        error = done.message;
        p.device.running = true;
        return done.line == 0;
    }
    const std::string path = fs::path(what).lexically_normal().string();
    if (!fs::is_regular_file(path)) {
        error = "'" + what + "' is neither a scenario nor a product; products are " + product_names();
        return false;
    }
    if (std::find(p.scenarios.begin(), p.scenarios.end(), path) == p.scenarios.end()) {
        p.scenarios.push_back(path);
    }
    return begin_story(p.device, path, error);
}

bool listen_on(panel &p, int wanted, int &port)
{
    // A port that another panel uses is refused.
    p.server.set_socket_options([](socket_t fd) {
        const int yes = 1;
        setsockopt(fd, SOL_SOCKET, SO_REUSEADDR, &yes, sizeof yes);
    });
    port = wanted;
    if (wanted != 0) {
        return p.server.bind_to_port(ADDRESS, wanted);
    }
    port = p.server.bind_to_any_port(ADDRESS);
    return port > 0;
}

void open_browser(const std::string &url)
{
    std::string command = "xdg-open";
    std::string address = url;
    std::array<char *, 3> arguments = {command.data(), address.data(), nullptr};
    pid_t pid = 0;
    if (getenv("DISPLAY") || getenv("WAYLAND_DISPLAY")) {
        posix_spawnp(&pid, command.c_str(), nullptr, nullptr, arguments.data(), environ);
    }
}

// Until somebody stops it: what the pages ask for, time, and what came of both.
void run_device(panel &p)
{
    steady_clock::time_point before = steady_clock::now();
    bool was_alive = true;
    for (int tick = 0; !p.stop; tick++) {
        const bool asked = answer(p.questions, TICK_MS);
        const steady_clock::time_point now = steady_clock::now();
        go_on(p.device, std::chrono::duration_cast<std::chrono::nanoseconds>(now - before).count());
        before = now;
        const told &news = p.device.news;
        const bool alive = p.device.device.device.process.pid >= 0;
        const bool has_news = !news.changes.empty() || !news.statements.empty() || !news.lines.empty();
        if (asked || has_news || alive != was_alive || (p.device.running && tick % CLOCK_EVERY == 0)) {
            publish(p.questions, next_batch(p.device));
        }
        was_alive = alive;
    }
}
} // namespace

int run_panel(const panel_options &options)
{
    const auto p = std::make_unique<panel>();
    std::string error;
    int port = 0;
    player_options how;
    how.process = options.process;
    if (!find_daemon(how.process, error)) {
        return refuse(error);
    }
    stop_flag = &p->stop;
    p->device.stop = &p->stop;
    p->scenarios = scenarios_in(options.scenarios);
    p->token = make_token();
    if (!open_session(p->device, how, error) || !begin(*p, options.what, error)) {
        close_session(p->device);
        return refuse(error);
    }
    p->trace_path = p->device.device.device.trace_path;
    add_routes(*p);
    if (!listen_on(*p, options.port, port)) {
        close_session(p->device);
        return refuse("port " + std::to_string(options.port) + " cannot be used");
    }
    p->server.lengthen_queue();
    guard_requests(p->server, port, p->token);
    signal(SIGINT, stop_panel);
    signal(SIGTERM, stop_panel);
    signal(SIGHUP, stop_panel);
    std::thread listener([&] { p->server.listen_after_bind(); });
    const std::string url = "http://" + std::string(ADDRESS) + ":" + std::to_string(port) + "/";
    printf("%s\n", url.c_str());
    fflush(stdout);
    if (options.browser) {
        open_browser(url);
    }
    run_device(*p);
    close_hub(p->questions);
    while (!p->server.is_running()) {
        std::this_thread::sleep_for(std::chrono::milliseconds(1)); // stop has no effect before
    }
    p->server.stop();
    listener.join();
    close_session(p->device);
    return 0;
}
