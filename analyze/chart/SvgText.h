#ifndef VANTOR_ANALYZE_CHART_SVGTEXT_H
#define VANTOR_ANALYZE_CHART_SVGTEXT_H

#include <cstddef>
#include <string>
#include <string_view>
#include <vector>

namespace vantor::analyze {

// The fixed-width font of names, in the drawing's units, and how wide a column of it is at most.
constexpr double nameSize = 11;
constexpr double nameColumn = 0.61 * nameSize;

// Where a text stands: its baseline, and which of its ends is at x.
enum class Anchor { Start, Middle, End };

// Puts an SVG document together. Every text that is handed in is printable (MarkupText.h) and not
// escaped yet; every class is one of ChartStyle.cc. Elements that are opened are closed in turn.
class SvgText {
public:
    // A group with a tooltip of these lines.
    void OpenGroup(std::string_view styles, const std::vector<std::string>& tooltip);
    void CloseGroup();

    void Rect(std::string_view styles, double x, double y, double width, double height);
    void Line(std::string_view styles, double x1, double y1, double x2, double y2);

    // A path as SVG writes it: "M 0 0 V 10".
    void Path(std::string_view styles, std::string_view commands);

    // Words of the drawing itself.
    void Text(std::string_view styles, double x, double y, Anchor anchor, std::string_view text);

    // A name, in the fixed-width font. Where its characters may be of any width, it is set to be as
    // wide as Columns() says.
    void Name(std::string_view styles, double x, double y, Anchor anchor, std::string_view name);

    // Markup as it stands.
    void Raw(std::string_view markup) { text += markup; }

    const std::string& Result() const { return text; }

private:
    std::string text;
};

// A coordinate as the drawing writes it: two decimals at most.
std::string Coordinate(double value);

// How wide a name is drawn at most.
double NameWidth(std::string_view printable);

}  // namespace vantor::analyze

#endif
