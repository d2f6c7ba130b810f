#ifndef VANTOR_ANALYZE_CHART_MARKUPTEXT_H
#define VANTOR_ANALYZE_CHART_MARKUPTEXT_H

#include <cstddef>
#include <string>
#include <string_view>

namespace vantor::analyze {

// Names come from file names and logs, so they may hold any bytes. These functions turn them into
// text that can be put into SVG and HTML, and measure it.

// The bytes as UTF-8 that every XML document may hold and that shows where it stands: a byte that
// is no UTF-8 becomes "\xff", and a character that is not allowed, controls the terminal or turns
// the direction of writing becomes "\u202e". Line ends among them: a name is one line.
std::string Printable(std::string_view bytes);

// Printable text with the characters that mean something to XML replaced, for elements and
// attributes.
std::string Escaped(std::string_view printable);

// How many columns of a fixed-width font the text takes at most: 1 for ASCII, 2 for anything else.
std::size_t Columns(std::string_view printable);

// Whether all of it is ASCII, so that its width in a fixed-width font is known.
bool IsAscii(std::string_view text);

// The text, or if it takes more than `columns` its beginning and its end with "…" between. At least
// 3 columns.
std::string Shortened(std::string_view printable, std::size_t columns);

}  // namespace vantor::analyze

#endif
