#include "panel/picture.h"

#include "panel/front.h"
#include "panel/svg.h"

#include <algorithm>
#include <map>

namespace
{
constexpr int LEFT = 118; // the names of the LEDs
constexpr int RIGHT = PICTURE_WIDTH - 14;
constexpr int HEAD = 34;
constexpr int MARKS = 30;
constexpr int ROW = 24;
constexpr int LINE = 15;
constexpr double CLOSEST = 15; // pixels between two moments, while there is room
constexpr double AXIS_APART = 58;
constexpr size_t MARKS_TOLD = 80;
constexpr int64_t US_PER_S = 1'000'000;

// Where each moment of the run stands.
struct moment {
    double x = 0;
    bool broken = false; // the stretch before it is shortened
};
using time_scale = std::map<picture_place, moment>;

// The longest stretch that is drawn in proportion: a third of the picture at most.
double longest_stretch(const std::vector<double> &stretches)
{
    double longest = *std::max_element(stretches.begin(), stretches.end());
    for (int round = 0; round < 50 && stretches.size() > 3; round++) {
        double total = 0;
        for (const double stretch : stretches) {
            total += std::min(stretch, longest);
        }
        longest = std::min(longest, total / 3);
    }
    return longest;
}

time_scale scale_of(const run_picture &run)
{
    time_scale scale;
    scale[{}];
    for (const picture_mark &mark : run.marks) {
        scale[mark.place];
    }
    for (const picture_change &change : run.changes) {
        scale[change.place];
    }
    if (run.end_us > scale.rbegin()->first.time_us) {
        scale[{run.end_us, scale.rbegin()->first.step}];
    }
    std::vector<double> stretches;
    for (auto at = std::next(scale.begin()); at != scale.end(); ++at) {
        stretches.push_back(static_cast<double>(at->first.time_us - std::prev(at)->first.time_us));
    }
    if (stretches.empty()) {
        scale.begin()->second.x = LEFT + CLOSEST;
        return scale;
    }
    const double longest = longest_stretch(stretches);
    double total = 0;
    for (const double stretch : stretches) {
        total += std::min(stretch, longest);
    }
    const double room = RIGHT - LEFT - 2 * CLOSEST;
    const double even = room / static_cast<double>(stretches.size());
    const double least = total > 0 ? std::min(CLOSEST, even) : even;
    const double spare = (room - least * static_cast<double>(stretches.size())) / std::max(total, 1.0);
    double x = LEFT + CLOSEST;
    size_t index = 0;
    scale.begin()->second.x = x;
    for (auto at = std::next(scale.begin()); at != scale.end(); ++at, index++) {
        x += least + spare * std::min(stretches[index], longest);
        at->second = {x, stretches[index] > 1.5 * longest};
    }
    return scale;
}

std::string clock_text(int64_t us)
{
    std::array<char, 48> text;
    const auto s = static_cast<long long>(us / US_PER_S);
    if (us < 100 * US_PER_S) {
        const int64_t ms = us / 1000;
        snprintf(text.data(), text.size(), "%g s", static_cast<double>(ms) / 1000);
    } else if (s < 3600) {
        snprintf(text.data(), text.size(), "%lld:%02lld min", s / 60, s % 60);
    } else {
        snprintf(text.data(), text.size(), "%lld:%02lld:%02lld h", s / 3600, s / 60 % 60, s % 60);
    }
    return text.data();
}

std::vector<int> rows_of(const run_picture &run)
{
    std::vector<int> rows;
    for (const picture_change &change : run.changes) {
        if (std::find(rows.begin(), rows.end(), change.led) == rows.end()) {
            rows.push_back(change.led);
        }
    }
    std::sort(rows.begin(), rows.end());
    return rows;
}

void draw_bar(std::string &svg, int led, const led_look &look, double from, double to, int top)
{
    if (!is_lit(look)) {
        return;
    }
    const int height = 6 + 3 * std::min(look.brightness, 4);
    const double width = std::max(to - from, 2.0);
    draw(svg,
         "<rect class=\"bar\" data-led=\"%s\" data-look=\"%s\" x=\"%.1f\" y=\"%.1f\" width=\"%.1f\" height=\"%d\" "
         "fill=\"%s\" stroke=\"#333\"><title>%s</title></rect>\n",
         std::string(led_name(led)).c_str(), describe(look).c_str(), from, top + (ROW - height) / 2.0, width, height,
         led_fill(led, look).c_str(), in_words(led, look).c_str());
}

void draw_row(std::string &svg, const run_picture &run, const time_scale &scale, int led, int top)
{
    led_look look;
    double from = scale.begin()->second.x;
    draw(svg, "<text x=\"%d\" y=\"%d\" class=\"end\">%s</text><path d=\"M%d %.1fH%d\" stroke=\"#ddd\"/>\n", LEFT - 4,
         top + ROW / 2 + 4, std::string(led_name(led)).c_str(), LEFT, top + ROW / 2.0, RIGHT);
    for (const picture_change &change : run.changes) {
        if (change.led != led) {
            continue;
        }
        const double x = scale.at(change.place).x;
        draw_bar(svg, led, look, from, x, top);
        look = change.look;
        from = x;
    }
    draw_bar(svg, led, look, from, RIGHT, top);
}

// The numbers of the marks at one moment share a tick: "3-5".
void draw_marks(std::string &svg, const run_picture &run, const time_scale &scale, int bottom)
{
    constexpr int top = HEAD + MARKS;
    double free_from = 0;
    for (size_t at = 0; at < run.marks.size();) {
        size_t next = at;
        bool has_failed = false;
        while (next < run.marks.size() && run.marks[next].place == run.marks[at].place) {
            has_failed |= run.marks[next++].kind == mark_kind::FAILED;
        }
        const double x = scale.at(run.marks[at].place).x;
        const std::string numbers = std::to_string(at + 1) + (next > at + 1 ? "-" + std::to_string(next) : "");
        draw(svg, "<path class=\"tick\" d=\"M%.1f %dV%d\" stroke=\"%s\" stroke-dasharray=\"%s\"/>\n", x, top - 8,
             bottom, has_failed ? "#b00020" : "#888", has_failed ? "none" : "2 3");
        if (x >= free_from || has_failed) {
            draw(svg, "<text x=\"%.1f\" y=\"%d\" class=\"middle small%s\">%s%s</text>\n", x, top - 12,
                 has_failed ? " failed" : "", numbers.c_str(), has_failed ? " ✗" : "");
            free_from = x + 7 + 6 * static_cast<double>(numbers.size());
        }
        at = next;
    }
}

void draw_axis(std::string &svg, const time_scale &scale, int top, int y)
{
    double free_from = 0;
    for (auto at = scale.begin(); at != scale.end(); ++at) {
        const double x = at->second.x;
        if (at->second.broken) {
            const double middle = (x + std::prev(at)->second.x) / 2;
            draw(svg,
                 "<rect class=\"break\" x=\"%.1f\" y=\"%d\" width=\"7\" height=\"%d\" fill=\"#fff\"/>"
                 "<path d=\"M%.1f %dl-4 5l8 5l-4 5M%.1f %dl-4 5l8 5l-4 5\" fill=\"none\" stroke=\"#333\"/>\n",
                 middle - 3.5, top, y - top - 12, middle - 3.5, y - 20, middle + 3.5, y - 20);
        }
        const bool is_new = at == scale.begin() || std::prev(at)->first.time_us != at->first.time_us;
        if (is_new && x >= free_from) {
            draw(svg, "<text x=\"%.1f\" y=\"%d\" class=\"middle small\">%s</text>\n", x, y,
                 clock_text(at->first.time_us).c_str());
            free_from = x + AXIS_APART;
        }
    }
}

const char *sign_of(mark_kind kind)
{
    switch (kind) {
    case mark_kind::STIMULUS:
        break;
    case mark_kind::HELD:
        return "✓ ";
    case mark_kind::FAILED:
        return "✗ ";
    }
    return "";
}

void draw_legend(std::string &svg, const run_picture &run, int top)
{
    for (size_t at = 0; at < std::min(run.marks.size(), MARKS_TOLD); at++) {
        const picture_mark &mark = run.marks[at];
        const int y = top + LINE * static_cast<int>(at);
        draw(svg,
             "<text x=\"36\" y=\"%d\" class=\"small end\">%zu</text><text x=\"106\" y=\"%d\" class=\"small "
             "end\">%s</text>",
             y, at + 1, y, clock_text(mark.place.time_us).c_str());
        svg += "<text x=\"118\" y=\"" + std::to_string(y) + "\"" +
               (mark.kind == mark_kind::FAILED ? " class=\"failed\">" : ">") + sign_of(mark.kind) +
               xml_text(mark.text.substr(0, 100)) + "</text>\n";
    }
    if (run.marks.size() > MARKS_TOLD) {
        draw(svg, "<text x=\"118\" y=\"%d\">and %zu more</text>\n", top + LINE * static_cast<int>(MARKS_TOLD),
             run.marks.size() - MARKS_TOLD);
    }
}
} // namespace

std::string draw_run(const run_picture &run)
{
    const std::vector<int> rows = rows_of(run);
    const time_scale scale = scale_of(run);
    const int bottom = HEAD + MARKS + ROW * static_cast<int>(std::max(rows.size(), size_t{1}));
    const int legend = bottom + 44;
    const int told = static_cast<int>(std::min(run.marks.size(), MARKS_TOLD + 1));
    std::string svg = begin_svg(legend + LINE * told, run.title);
    svg += "<text x=\"14\" y=\"22\" class=\"bold\">" + xml_text(run.title) + "</text>\n";
    int top = HEAD + MARKS;
    for (const int led : rows) {
        draw_row(svg, run, scale, led, top);
        top += ROW;
    }
    draw_marks(svg, run, scale, bottom);
    draw_axis(svg, scale, HEAD + MARKS, bottom + 18);
    draw_legend(svg, run, legend);
    return svg + "</svg>\n";
}
