#include "verbs/TextTable.h"

#include <fmt/format.h>

#include <algorithm>

namespace vantor::analyze {

namespace {

constexpr const char* gap = "  ";
constexpr std::size_t gapWidth = 2;
constexpr std::size_t leastName = 12;  // characters of a name that are shown on any terminal

bool Continues(char byte) { return (static_cast<unsigned char>(byte) & 0xC0U) == 0x80U; }

// Characters of a text in UTF-8; a byte that is none of it counts as one.
std::size_t CountCharacters(const std::string& text) {
    return static_cast<std::size_t>(
        std::count_if(text.begin(), text.end(), [](char byte) { return !Continues(byte); }));
}

// The text, or its first characters and "..." so that it is `most` wide.
std::string Cut(const std::string& text, std::size_t most) {
    if (CountCharacters(text) <= most) {
        return text;
    }
    constexpr std::size_t dots = 3;
    std::size_t kept = 0;
    std::size_t end = 0;
    while (end < text.size() && (Continues(text[end]) || kept < most - dots)) {
        kept += Continues(text[end]) ? 0U : 1U;
        ++end;
    }
    return text.substr(0, end) + "...";
}

}  // namespace

std::string OneLine(std::string text) {
    for (char& byte : text) {
        if (static_cast<unsigned char>(byte) < 0x20U || byte == 0x7F) {
            byte = '?';
        }
    }
    return text;
}

std::string Milliseconds(Microseconds time) {
    const Microseconds size = time < 0 ? -time : time;
    return fmt::format("{}{}.{:03}", time < 0 ? "-" : "", size / 1000, size % 1000);
}

void TextTable::Add(std::vector<std::string> cells) {
    std::transform(cells.begin(), cells.end(), cells.begin(),
                   [](std::string& cell) { return OneLine(std::move(cell)); });
    rows.push_back(std::move(cells));
}

// What the numbers leave of the line is for the names, in equal parts where there are several.
std::vector<std::size_t> TextTable::Widths(int width) const {
    std::vector<std::size_t> widths;
    std::size_t names = 0;
    std::size_t numbers = 0;
    for (std::size_t column = 0; column < columns.size(); ++column) {
        std::size_t widest = CountCharacters(columns[column].title);
        for (const std::vector<std::string>& row : rows) {
            widest = std::max(widest, CountCharacters(row[column]));
        }
        widths.push_back(widest);
        (columns[column].kind == Kind::Name ? names : numbers) +=
            columns[column].kind == Kind::Name ? 1 : widest;
    }
    const std::size_t taken = numbers + gapWidth * (columns.size() - 1);
    const auto line = static_cast<std::size_t>(width);
    const std::size_t most =
        names == 0 || line < taken ? leastName : std::max((line - taken) / names, leastName);
    for (std::size_t column = 0; column < columns.size(); ++column) {
        if (columns[column].kind == Kind::Name) {
            widths[column] = std::min(widths[column], most);
        }
    }
    return widths;
}

void TextTable::WriteAligned(std::ostream& stream, const std::vector<std::string>& cells,
                             const std::vector<std::size_t>& widths) const {
    std::string line;
    for (std::size_t column = 0; column < cells.size(); ++column) {
        const std::string text = Cut(cells[column], widths[column]);
        const std::string blanks(widths[column] - CountCharacters(text), ' ');
        line += column == 0 ? "" : gap;
        line += columns[column].kind == Kind::Name ? text + blanks : blanks + text;
    }
    line.erase(line.find_last_not_of(' ') + 1);
    stream << line << '\n';
}

void TextTable::Write(std::ostream& stream, int width) const {
    std::vector<std::string> titles;
    for (const Column& column : columns) {
        titles.push_back(column.title);
    }
    if (width > 0) {
        const std::vector<std::size_t> widths = Widths(width);
        WriteAligned(stream, titles, widths);
        for (const std::vector<std::string>& row : rows) {
            WriteAligned(stream, row, widths);
        }
        return;
    }
    const auto write = [&stream](const std::vector<std::string>& cells) {
        stream << fmt::format("{}\n", fmt::join(cells, "\t"));
    };
    write(titles);
    std::for_each(rows.begin(), rows.end(), write);
}

}  // namespace vantor::analyze
