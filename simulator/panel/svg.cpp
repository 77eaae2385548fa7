#include "panel/svg.h"

#include "panel/front.h"

#include <cstdarg>
#include <cstdio>

namespace
{
struct paint {
    std::string_view colour; // empty: a LED whose colour nobody has named
    const char *fill;
};

constexpr std::array paints = {
    paint{"red",    "#d92626"},
    paint{"green",  "#1f9d3a"},
    paint{"blue",   "#2f6fde"},
    paint{"yellow", "#e8b200"},
    paint{"white",  "#ffffff"},
    paint{"",       "#9b6fd0"},
};

const char *fill_of(std::string_view colour)
{
    for (const paint &row : paints) {
        if (row.colour == colour) {
            return row.fill;
        }
    }
    return paints.back().fill;
}

// How many bytes the UTF-8 character at the beginning has; 0 when there is none.
size_t utf8_length(std::string_view text)
{
    const auto first = static_cast<unsigned char>(text[0]);
    const size_t length = first < 0x80 ? 1 : first >= 0xf0 ? 4 : first >= 0xe0 ? 3 : 2;
    if (first >= 0xf5 || (first >= 0x80 && first < 0xc2) || length > text.size() || (length == 1 && first < 0x20) ||
        first == 0x7f) {
        return 0;
    }
    for (size_t at = 1; at < length; at++) {
        if ((static_cast<unsigned char>(text[at]) & 0xc0) != 0x80) {
            return 0;
        }
    }
    return length;
}
} // namespace

std::string xml_text(std::string_view text)
{
    std::string escaped;
    while (!text.empty()) {
        const size_t length = utf8_length(text);
        if (length != 1) {
            escaped += length == 0 ? "?" : text.substr(0, length);
        } else if (text[0] == '&' || text[0] == '<' || text[0] == '>' || text[0] == '"') {
            escaped += "&#" + std::to_string(text[0]) + ";";
        } else {
            escaped += text[0];
        }
        text.remove_prefix(length == 0 ? 1 : length);
    }
    return escaped;
}

void draw(std::string &svg, const char *format, ...)
{
    std::array<char, 1024> text;
    va_list arguments;
    va_start(arguments, format);
    vsnprintf(text.data(), text.size(), format, arguments);
    va_end(arguments);
    svg += text.data();
}

std::string begin_svg(int height, std::string_view title)
{
    std::string svg;
    draw(svg,
         "<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 %d %d\" width=\"%d\" height=\"%d\" role=\"img\">\n",
         PICTURE_WIDTH, height, PICTURE_WIDTH, height);
    svg += "<title>" + xml_text(title) + "</title>\n";
    svg += "<style>text{font:12px sans-serif;fill:#222}.small{font-size:10px;fill:#444}.bold{font-weight:bold}"
           ".failed{fill:#b00020;font-weight:bold}.middle{text-anchor:middle}.end{text-anchor:end}</style>\n<defs>\n";
    for (const paint &row : paints) {
        const std::string name(row.colour.empty() ? "other" : row.colour);
        draw(svg,
             "<pattern id=\"blink-%s\" width=\"7\" height=\"7\" patternUnits=\"userSpaceOnUse\" "
             "patternTransform=\"rotate(45)\"><rect width=\"7\" height=\"7\" fill=\"%s\"/>"
             "<rect width=\"3\" height=\"7\" fill=\"%s\"/></pattern>\n",
             name.c_str(), row.colour == "white" ? "#999" : "#fff", row.fill);
    }
    draw(svg, "</defs>\n<rect width=\"%d\" height=\"%d\" fill=\"#fff\"/>\n", PICTURE_WIDTH, height);
    return svg;
}

std::string led_fill(int led, const led_look &look)
{
    const std::string_view colour = colour_of(led);
    if (look.mode != led_mode::BLINK) {
        return fill_of(colour);
    }
    return "url(#blink-" + std::string(colour.empty() ? "other" : colour) + ")";
}
