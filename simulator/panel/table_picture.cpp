#include "panel/table_picture.h"

#include "panel/front.h"
#include "panel/svg.h"

#include <algorithm>

namespace
{
constexpr int LEFT = 230;
constexpr int HEAD = 44;
constexpr int BAND = 24;
constexpr int ROW = 46;
constexpr int RADIUS = 9;

int column_width(size_t columns)
{
    return (PICTURE_WIDTH - LEFT - 10) / static_cast<int>(columns);
}

bool has_led(const indicator &lens, int led)
{
    return std::find(lens.leds.begin(), lens.leds.end(), led) != lens.leds.end();
}

// A table on its way to paper.
struct sheet {
    const std::vector<table_row> &rows;
    std::vector<indicator> columns; // the indicators that are lit in some state
    std::array<int, LED_ID_COUNT> brightest = {};
};

std::string number_of(int led)
{
    const std::string_view name = led_name(led);
    return colour_of(led).empty() ? std::string(name.substr(name.rfind('_') + 1)) : "";
}

// "green", "blinks blue", "dim blue"; the number of an LED whose colour nobody has named.
std::string caption(int led, const led_look &look, int brightest)
{
    const std::string_view colour = colour_of(led);
    const std::string word = colour.empty() ? "LED " + number_of(led) : std::string(colour);
    if (look.mode == led_mode::BLINK) {
        return "blinks " + word;
    }
    return look.brightness < brightest ? "dim " + word : word;
}

void draw_led(std::string &svg, int led, const led_look &look, int x, int y)
{
    draw(svg,
         "<circle class=\"led\" data-led=\"%s\" data-look=\"%s\" cx=\"%d\" cy=\"%d\" r=\"%d\" fill=\"%s\" "
         "stroke=\"#333\" "
         "stroke-width=\"1.5\"%s/>\n",
         std::string(led_name(led)).c_str(), describe(look).c_str(), x, y, RADIUS, led_fill(led, look).c_str(),
         look.mode == led_mode::BLINK ? " stroke-dasharray=\"3 2\"" : "");
    draw(svg, "<text x=\"%d\" y=\"%d\" class=\"small middle\">%s</text>\n", x, y + 4, number_of(led).c_str());
}

void draw_lens(std::string &svg, const sheet &page, const indicator &lens, const table_row &row, int middle, int top)
{
    std::vector<int> lit;
    std::copy_if(lens.leds.begin(), lens.leds.end(), std::back_inserter(lit),
                 [&](int led) { return led != NO_LED && is_lit(row.leds[static_cast<size_t>(led)]); });
    if (lit.empty()) {
        draw(svg, "<circle cx=\"%d\" cy=\"%d\" r=\"%d\" fill=\"none\" stroke=\"#bbb\"/>\n", middle, top + 13,
             RADIUS - 3);
        return;
    }
    int x = middle - (RADIUS + 2) * (static_cast<int>(lit.size()) - 1);
    std::string words;
    std::string rhythm;
    for (const int led : lit) {
        const led_look &look = row.leds[static_cast<size_t>(led)];
        draw_led(svg, led, look, x, top + 13);
        x += 2 * (RADIUS + 2);
        words += (words.empty() ? "" : " + ") + caption(led, look, page.brightest[static_cast<size_t>(led)]);
        if (look.mode == led_mode::BLINK) {
            rhythm = seconds(look.blink_time1) + " / " + seconds(look.blink_time2);
        }
    }
    draw(svg, "<text x=\"%d\" y=\"%d\" class=\"small middle\">%s</text>\n", middle, top + 33, words.c_str());
    draw(svg, "<text x=\"%d\" y=\"%d\" class=\"small middle\">%s</text>\n", middle, top + 43, rhythm.c_str());
}

// In lines of about thirty characters.
void draw_state(std::string &svg, const std::string &state, int top)
{
    constexpr size_t longest = 34;
    std::string rest = state;
    int y = top + (state.size() > longest ? 20 : 27);
    while (!rest.empty()) {
        size_t cut = rest.size() <= longest ? rest.size() : rest.rfind(' ', longest);
        cut = cut == std::string::npos ? longest : cut;
        draw(svg, "<text x=\"14\" y=\"%d\">%s</text>\n", y, xml_text(rest.substr(0, cut)).c_str());
        rest.erase(0, std::min(cut + 1, rest.size()));
        y += 15;
    }
}

bool is_used(const std::vector<table_row> &rows, const indicator &lens)
{
    return std::any_of(rows.begin(), rows.end(), [&](const table_row &row) {
        return std::any_of(lens.leds.begin(), lens.leds.end(),
                           [&](int led) { return led != NO_LED && is_lit(row.leds[static_cast<size_t>(led)]); });
    });
}

bool lay_out(sheet &page, const product_name &product, std::string &error)
{
    const std::span<const indicator> front = front_of(product);
    for (const indicator &lens : front) {
        if (is_used(page.rows, lens)) {
            page.columns.push_back(lens);
        }
    }
    for (const table_row &row : page.rows) {
        for (size_t led = 0; led < row.leds.size(); led++) {
            page.brightest[led] = std::max(page.brightest[led], row.leds[led].brightness);
            const auto has_it = [&](const indicator &lens) { return has_led(lens, static_cast<int>(led)); };
            if (is_lit(row.leds[led]) && std::none_of(front.begin(), front.end(), has_it)) {
                error = std::string(led_name(static_cast<int>(led))) + " is lit, which the front of " +
                        std::string(product.name) + " lacks";
                return false;
            }
        }
    }
    return true;
}

void draw_heading(std::string &svg, const table_row &row, int top)
{
    draw(svg, "<rect x=\"8\" y=\"%d\" width=\"%d\" height=\"%d\" fill=\"#eee\" stroke=\"#ddd\"/>\n", top,
         PICTURE_WIDTH - 16, BAND);
    draw(svg, "<text x=\"14\" y=\"%d\" class=\"bold\">%s</text>\n", top + 16, xml_text(row.state).c_str());
}
} // namespace

bool draw_table(const product_name &product, const std::vector<table_row> &rows, std::string &svg, std::string &error)
{
    sheet page = {.rows = rows, .columns = {}, .brightest = {}};
    if (!lay_out(page, product, error)) {
        return false;
    }
    const int width = column_width(page.columns.size());
    int height = HEAD + 24;
    for (const table_row &row : rows) {
        height += row.heading ? BAND : ROW;
    }
    svg = begin_svg(height, std::string(product.name) + ": what its LEDs mean");
    draw(svg, "<text x=\"14\" y=\"26\" class=\"bold\">%s</text>\n", std::string(product.name).c_str());
    const auto middle = [&](size_t column) { return LEFT + width * static_cast<int>(column) + width / 2; };
    for (size_t column = 0; column < page.columns.size(); column++) {
        draw(svg, "<text x=\"%d\" y=\"26\" class=\"middle bold\">%s</text>\n", middle(column),
             std::string(page.columns[column].word).c_str());
    }
    int top = HEAD;
    for (const table_row &row : rows) {
        if (row.heading) {
            draw_heading(svg, row, top);
            top += BAND;
            continue;
        }
        draw(svg, "<rect x=\"8\" y=\"%d\" width=\"%d\" height=\"%d\" fill=\"none\" stroke=\"#ddd\"/>\n", top,
             PICTURE_WIDTH - 16, ROW);
        draw_state(svg, row.state, top);
        for (size_t column = 0; column < page.columns.size(); column++) {
            draw_lens(svg, page, page.columns[column], row, middle(column), top);
        }
        top += ROW;
    }
    draw(svg, "<text x=\"14\" y=\"%d\" class=\"small\">Hatched: blinks, time on / time off. Empty ring: dark.</text>\n",
         top + 16);
    svg += "</svg>\n";
    return true;
}
