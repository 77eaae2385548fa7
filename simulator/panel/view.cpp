#include "panel/view.h"

#include "language/words.h"
#include "panel/front.h"

#include <nlohmann/json.hpp>
#include <utility>

using nlohmann::json;

namespace
{
// Bytes that are no UTF-8, which any text of a message may hold, become U+FFFD.
std::string text_of(const json &j)
{
    return j.dump(-1, ' ', false, json::error_handler_t::replace);
}

json clock_of(const session &s)
{
    const rig &r = s.device.device;
    const bool waits = r.process.pid >= 0 && r.process.next_deadline_ns >= r.now_ns;
    return {
        {"now_ms",  r.now_ns / NS_PER_MS                                                },
        {"wall_ms", (r.now_ns + r.wall_offset_ns) / NS_PER_MS                           },
        {"speed",   s.speed                                                             },
        {"running", s.running                                                           },
        {"next_ms", waits ? json(r.process.next_deadline_ns / NS_PER_MS) : json(nullptr)},
    };
}

// The events that a module would tell this daemon of, as a notify names them.
json heard_by(const session &s)
{
    json events = json::array();
    for (const module_row &module : module_rows) {
        for (const event_name &event : all_events()) {
            if (event.module_id == module.module_id && is_heard(s.device.device.wires, event.module_id, event.value)) {
                events.push_back(std::string(module.name) + " " + event_word(event.module_id, event.value));
            }
        }
    }
    return events;
}

json daemon_of(const session &s)
{
    const daemon_process &process = s.device.device.process;
    return {
        {"hears",    heard_by(s)             },
        {"alive",    process.pid >= 0        },
        {"launched", s.device.device.launched},
        {"pid",      process.pid             },
        {"end",      process.end             }
    };
}

const char *word_of(led_mode mode)
{
    switch (mode) {
    case led_mode::OFF:
        return "off";
    case led_mode::ON:
        return "on";
    case led_mode::BLINK:
        break;
    }
    return "blink";
}

json look_of(const led_look &look)
{
    return {
        {"mode",       word_of(look.mode)},
        {"brightness", look.brightness   },
        {"on_ms",      look.blink_time1  },
        {"off_ms",     look.blink_time2  }
    };
}

json leds_of(const session &s)
{
    json leds = json::object();
    for (int led = 0; led < LED_ID_COUNT; led++) {
        const led_look &look = s.device.device.state.leds[static_cast<size_t>(led)];
        if (look.mode != led_mode::OFF) {
            json &one = leds[std::string(led_name(led))];
            one = look_of(look);
            one["since_us"] = s.since_us[static_cast<size_t>(led)];
        }
    }
    return leds;
}

json front_json(const product_name *product)
{
    json front = json::array();
    for (const indicator &lens : product ? front_of(*product) : std::span<const indicator>()) {
        json leds = json::array();
        for (const int led : lens.leds) {
            if (led != NO_LED) {
                leds.push_back({
                    {"id",     led           },
                    {"name",   led_name(led) },
                    {"colour", colour_of(led)}
                });
            }
        }
        front.push_back({
            {"word", lens.word},
            {"leds", leds     }
        });
    }
    return front;
}

const char *word_of(line_state state)
{
    switch (state) {
    case line_state::COMING:
        return "coming";
    case line_state::HELD:
        return "held";
    case line_state::FAILED:
        break;
    }
    return "failed";
}

json story_of(const session &s)
{
    json lines = json::array();
    for (const story_line &line : s.play.lines) {
        lines.push_back({
            {"text",  line.text          },
            {"state", word_of(line.state)},
            {"shown", line.shown         }
        });
    }
    return {
        {"name",   s.play.name  },
        {"next",   s.play.next  },
        {"failed", s.play.failed},
        {"lines",  lines        }
    };
}

// Only where the story stands; its lines do not change.
json progress_of(const session &s)
{
    return {
        {"next",   s.play.next                                                         },
        {"failed", s.play.failed                                                       },
        {"shown",  s.play.failed ? json(s.play.lines[s.play.next - 1].shown) : json("")},
    };
}

json news_of(const told &news)
{
    json changes = json::array();
    json statements = json::array();
    json lines = json::array();
    for (const told_change &change : news.changes) {
        json one = look_of(change.look);
        one["at_us"] = change.time_us;
        one["led"] = led_name(change.led);
        changes.push_back(one);
    }
    for (const told_statement &done : news.statements) {
        statements.push_back({
            {"at_us", done.time_us},
            {"text",  done.text   }
        });
    }
    for (const told_line &line : news.lines) {
        lines.push_back({
            {"at_us",  line.time_us                                          },
            {"level",  line.level                                            },
            {"led",    line.led < 0 ? std::string_view() : led_name(line.led)},
            {"thread", line.thread                                           },
            {"text",   line.text                                             }
        });
    }
    return {
        {"changes",    changes      },
        {"statements", statements   },
        {"lines",      lines        },
        {"left_out",   news.left_out}
    };
}
} // namespace

std::string whole_state(const session &s, const std::vector<std::string> &scenarios)
{
    const product_name *product = product_of(s);
    json products = json::array();
    for (const product_name &row : all_products()) {
        products.push_back(row.name);
    }
    return text_of({
        {"generation", s.generation                                },
        {"batches",    s.batches                                   },
        {"past",       news_of(s.past)                             },
        {"product",    product ? product->name : std::string_view()},
        {"products",   products                                    },
        {"front",      front_json(product)                         },
        {"clock",      clock_of(s)                                 },
        {"daemon",     daemon_of(s)                                },
        {"leds",       leds_of(s)                                  },
        {"story",      story_of(s)                                 },
        {"scenarios",  scenarios                                   },
    });
}

std::string next_batch(session &s)
{
    const product_name *product = product_of(s);
    json batch = news_of(std::exchange(s.news, {}));
    batch["number"] = s.batches++;
    batch["generation"] = s.generation;
    batch["product"] = product ? product->name : std::string_view();
    batch["clock"] = clock_of(s);
    batch["daemon"] = daemon_of(s);
    batch["leds"] = leds_of(s);
    batch["story"] = progress_of(s);
    return text_of(batch);
}

std::string answer_of(const outcome &result)
{
    if (result.line == 0) {
        return text_of({
            {"ok",   true       },
            {"done", result.done}
        });
    }
    return text_of({
        {"ok",      false         },
        {"done",    result.done   },
        {"line",    result.line   },
        {"message", result.message}
    });
}

std::string failure_of(const std::string &message)
{
    return text_of({
        {"ok",      false  },
        {"message", message}
    });
}
