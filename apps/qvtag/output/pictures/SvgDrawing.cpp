#include "output/pictures/SvgDrawing.h"

#include <algorithm>
#include <utility>

#include <fmt/format.h>

namespace qvct {
namespace {

std::string escaped(std::string_view text) {
    std::string out;
    for (const char c : text) {
        switch (c) {
            case '&':
                out += "&amp;";
                break;
            case '<':
                out += "&lt;";
                break;
            case '>':
                out += "&gt;";
                break;
            default:
                out += static_cast<unsigned char>(c) < 0x20 ? ' ' : c;
        }
    }
    return out;
}

}  // namespace

SvgDrawing::SvgDrawing(double width, double height)
    : svg_(fmt::format("<svg xmlns=\"http://www.w3.org/2000/svg\" viewBox=\"0 0 {0} {1:.0f}\" width=\"{0}\" "
                       "height=\"{1:.0f}\" font-family=\"sans-serif\" font-size=\"12\">\n"
                       "<rect width=\"100%\" height=\"100%\" fill=\"white\"/>\n",
                       width, height)) {}

void SvgDrawing::text(double left, double top, std::string_view content, std::string_view attributes) {
    svg_ +=
        fmt::format("<text x=\"{:.1f}\" y=\"{:.1f}\"{}>{}</text>\n", left, top, attributes, escaped(content));
}

void SvgDrawing::rectangle(double left, double top, double width, double height, std::string_view fill,
                           double opacity) {
    const std::string faded = opacity < 1 ? fmt::format(" fill-opacity=\"{:.2f}\"", opacity) : std::string();
    svg_ +=
        fmt::format("<rect x=\"{:.2f}\" y=\"{:.2f}\" width=\"{:.2f}\" height=\"{:.2f}\" fill=\"{}\"{}/>\n",
                    left, top, std::max(width, 0.5), std::max(height, 0.0), fill, faded);
}

void SvgDrawing::line(double left, double top, double bottom, std::string_view colour, double width) {
    svg_ += fmt::format(
        "<line x1=\"{0:.2f}\" x2=\"{0:.2f}\" y1=\"{1:.2f}\" y2=\"{2:.2f}\" stroke=\"{3}\" "
        "stroke-width=\"{4}\"/>\n",
        left, top, bottom, colour, width);
}

std::string SvgDrawing::finish() && {
    return std::move(svg_) + "</svg>\n";
}

}  // namespace qvct
