#ifndef VANTOR_ANALYZE_CHART_CHARTSTYLE_H
#define VANTOR_ANALYZE_CHART_CHARTSTYLE_H

namespace vantor::analyze {

// The style sheet of the drawing, for light and for dark surroundings. Colours are told apart by
// whoever confuses red and green, or sees none at all: by their lightness and by shape and pattern.
// Written without variables, which not every program that shows SVG knows.
extern const char* const chartStyle;

// The patterns that the style sheet names.
extern const char* const chartPatterns;

// What a page around the drawing adds.
extern const char* const pageStyle;

}  // namespace vantor::analyze

#endif
