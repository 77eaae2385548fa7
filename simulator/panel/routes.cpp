#include "panel/routes.h"

#include "evidence/why.h"
#include "language/words.h"
#include "panel/view.h"
#include "table.h"

#include <algorithm>

namespace
{
using httplib::Request;
using httplib::Response;

constexpr int STREAMS_MAX = 16;
constexpr const char *JSON = "application/json";
constexpr const char *TEXT = "text/plain; charset=utf-8";
constexpr std::string_view TOKEN_MARK = "{{token}}";

void answer_with(panel &p, Response &response, const char *type, const question &what)
{
    if (const std::optional<std::string> text = ask(p.questions, what)) {
        response.set_content(*text, type);
    } else {
        response.status = 503;
        response.set_content("the device is busy\n", TEXT);
    }
}

std::string set_time(session &s, const std::string &text)
{
    constexpr std::array speeds = {1, 10, 60, 3600};
    if (text == "pause") {
        s.running = false;
    } else if (text == "step") {
        s.running = false;
        if (!step_to_deadline(s)) {
            return failure_of("the daemon waits for nothing that is due");
        }
    } else if (text == "run") {
        s.running = true;
    } else {
        const auto speed = parse_number(text, 1, speeds.back());
        if (!speed || std::find(speeds.begin(), speeds.end(), *speed) == speeds.end()) {
            return failure_of("pause, step, run, 1, 10, 60 or 3600");
        }
        s.speed = static_cast<int>(*speed);
        s.running = true;
    }
    return answer_of(outcome());
}

std::string make_new(session &s, const std::string &name)
{
    const product_name *product = find_product(name);
    if (!product) {
        return failure_of("products are " + product_names());
    }
    return answer_of(renew(s, switched_on(*product)));
}

std::string play(panel &p, const std::string &name)
{
    std::string error = "no such scenario";
    if (std::find(p.scenarios.begin(), p.scenarios.end(), name) == p.scenarios.end() ||
        !begin_story(p.device, name, error)) {
        return failure_of(error);
    }
    return answer_of(outcome());
}

void serve_page(panel &p)
{
    for (const page_file &file : page_files()) {
        std::string text(file.text);
        if (const size_t mark = text.find(TOKEN_MARK); mark != std::string::npos) {
            text.replace(mark, TOKEN_MARK.size(), p.token);
        }
        p.server.Get(std::string(file.path), [text, &file](const Request &, Response &response) {
            response.set_content(text, std::string(file.type));
        });
    }
}

void serve_why(panel &p, const Request &request, Response &response)
{
    recording trace;
    std::string text;
    const std::optional<int> led = find_led(request.get_param_value("led"));
    if (!led) {
        response.status = 404;
        text = "no such LED\n";
    } else if (load_recording(p.trace_path, trace, text)) {
        text = why(history_of(trace), *led, trace.entries.size());
    }
    response.set_content(text, TEXT);
}

// Each page goes through the batches at its own pace; one that has missed some is told to look at the whole state.
bool write_batch(panel &p, uint64_t &number, httplib::DataSink &sink)
{
    bool missed = false;
    std::string text = ": still here\n\n";
    if (const std::optional<std::string> batch = wait_for_batch(p.questions, number, missed)) {
        text = "data: " + *batch + "\n\n";
        number++;
    } else if (missed) {
        const std::lock_guard lock(p.questions.guard);
        number = p.questions.next_batch;
        text = "event: missed\ndata: {}\n\n";
    }
    const bool written = sink.write(text.data(), text.size());
    if (p.stop) {
        sink.done();
    }
    return written;
}

void serve_events(panel &p, Response &response)
{
    if (p.streams.fetch_add(1) >= STREAMS_MAX) {
        p.streams--;
        response.status = 503;
        response.set_content("too many pages\n", TEXT);
        return;
    }
    auto number = std::make_shared<uint64_t>(0);
    {
        const std::lock_guard lock(p.questions.guard);
        *number = p.questions.next_batch;
    }
    response.set_chunked_content_provider(
        "text/event-stream", [&p, number](size_t, httplib::DataSink &sink) { return write_batch(p, *number, sink); },
        [&p](bool) { p.streams--; });
}
} // namespace

void add_routes(panel &p)
{
    session &s = p.device;
    serve_page(p);
    p.server.Get("/state", [&](const Request &, Response &response) {
        answer_with(p, response, JSON, [&] {
            publish(p.questions, next_batch(s)); // a page that comes gets nothing twice
            return whole_state(s, p.scenarios);
        });
    });
    p.server.Get("/keep",
                 [&](const Request &, Response &response) { answer_with(p, response, TEXT, [&] { return keep(s); }); });
    p.server.Get("/events", [&](const Request &, Response &response) { serve_events(p, response); });
    p.server.Get("/why", [&](const Request &request, Response &response) { serve_why(p, request, response); });
    p.server.Post("/do", [&](const Request &request, Response &response) {
        answer_with(p, response, JSON, [&] { return answer_of(do_text(s, request.body)); });
    });
    p.server.Post("/time", [&](const Request &request, Response &response) {
        answer_with(p, response, JSON, [&] { return set_time(s, request.body); });
    });
    p.server.Post("/new", [&](const Request &request, Response &response) {
        answer_with(p, response, JSON, [&] { return make_new(s, request.body); });
    });
    p.server.Post("/play", [&](const Request &request, Response &response) {
        answer_with(p, response, JSON, [&] { return play(p, request.body); });
    });
}
