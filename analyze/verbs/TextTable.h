#ifndef VANTOR_ANALYZE_VERBS_TEXTTABLE_H
#define VANTOR_ANALYZE_VERBS_TEXTTABLE_H

#include <cstddef>
#include <ostream>
#include <string>
#include <utility>
#include <vector>

#include "boot/BootLog.h"

namespace vantor::analyze {

// A table of text. On a terminal its columns are aligned, and its names are cut so that a row fits
// on a line; elsewhere cells are apart by one tab, so that `cut` and `sort` take them as they are.
class TextTable {
public:
    enum class Kind { Name, Number };
    struct Column {
        std::string title;
        Kind kind = Kind::Name;
    };

    explicit TextTable(std::vector<Column> named) : columns(std::move(named)) {}

    // As many cells as there are columns. Control characters in them are shown as '?'.
    void Add(std::vector<std::string> cells);

    // `width` as Invocation has it: the columns of the terminal, 0 for none.
    void Write(std::ostream& stream, int width) const;

private:
    std::vector<std::size_t> Widths(int width) const;
    void WriteAligned(std::ostream& stream, const std::vector<std::string>& cells,
                      const std::vector<std::size_t>& widths) const;

    std::vector<Column> columns;
    std::vector<std::vector<std::string>> rows;
};

// A text with its control characters shown as '?', so that a name takes one line and cannot steer a
// terminal.
std::string OneLine(std::string text);

// Microseconds as milliseconds: "1234.567", "-0.002".
std::string Milliseconds(Microseconds time);

}  // namespace vantor::analyze

#endif
