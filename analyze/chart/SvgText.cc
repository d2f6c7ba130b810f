#include "chart/SvgText.h"

#include <fmt/format.h>

#include <cmath>
#include <iterator>

#include "chart/MarkupText.h"

namespace vantor::analyze {

namespace {

const char* Attribute(Anchor anchor) {
    switch (anchor) {
    case Anchor::Middle:
        return " text-anchor=\"middle\"";
    case Anchor::End:
        return " text-anchor=\"end\"";
    case Anchor::Start:
        break;
    }
    return "";
}

}  // namespace

std::string Coordinate(double value) {
    // Hundredths, so that neither "-0" nor needless zeros come out.
    const auto hundredths = static_cast<long long>(std::llround(value * 100));
    std::string number = fmt::format("{:.2f}", static_cast<double>(hundredths) / 100);
    number.erase(number.find_last_not_of('0') + 1);
    if (number.back() == '.') {
        number.pop_back();
    }
    return number;
}

double NameWidth(std::string_view printable) {
    return static_cast<double>(Columns(printable)) * nameColumn;
}

void SvgText::OpenGroup(std::string_view styles, const std::vector<std::string>& tooltip) {
    fmt::format_to(std::back_inserter(text), "<g class=\"{}\"><title>", styles);
    const char* separator = "";
    for (const std::string& line : tooltip) {
        text += separator + Escaped(line);
        separator = "\n";
    }
    text += "</title>";
}

void SvgText::CloseGroup() { text += "</g>\n"; }

void SvgText::Rect(std::string_view styles, double x, double y, double width, double height) {
    fmt::format_to(std::back_inserter(text),
                   "<rect class=\"{}\" x=\"{}\" y=\"{}\" width=\"{}\" height=\"{}\"/>", styles,
                   Coordinate(x), Coordinate(y), Coordinate(width), Coordinate(height));
}

void SvgText::Line(std::string_view styles, double x1, double y1, double x2, double y2) {
    fmt::format_to(std::back_inserter(text),
                   "<line class=\"{}\" x1=\"{}\" y1=\"{}\" x2=\"{}\" y2=\"{}\"/>", styles,
                   Coordinate(x1), Coordinate(y1), Coordinate(x2), Coordinate(y2));
}

void SvgText::Path(std::string_view styles, std::string_view commands) {
    fmt::format_to(std::back_inserter(text), "<path class=\"{}\" d=\"{}\"/>", styles, commands);
}

void SvgText::Text(std::string_view styles, double x, double y, Anchor anchor,
                   std::string_view words) {
    fmt::format_to(std::back_inserter(text), "<text class=\"{}\" x=\"{}\" y=\"{}\"{}>{}</text>",
                   styles, Coordinate(x), Coordinate(y), Attribute(anchor), Escaped(words));
}

void SvgText::Name(std::string_view styles, double x, double y, Anchor anchor,
                   std::string_view name) {
    std::string width;
    if (!IsAscii(name)) {
        width = fmt::format(" textLength=\"{}\" lengthAdjust=\"spacingAndGlyphs\"",
                            Coordinate(NameWidth(name)));
    }
    fmt::format_to(std::back_inserter(text),
                   "<text class=\"name {}\" x=\"{}\" y=\"{}\"{}{}>{}</text>", styles, Coordinate(x),
                   Coordinate(y), Attribute(anchor), width, Escaped(name));
}

}  // namespace vantor::analyze
