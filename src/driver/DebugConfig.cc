#include "driver/DebugConfig.h"

#include <syslog.h>

#include <boost/tokenizer.hpp>
#include <cstddef>
#include <fstream>
#include <stdexcept>
#include <vector>

namespace vantor {

namespace {

constexpr const char* debugConfigFile = "/etc/nuvex/vantor/debug.conf";
constexpr const char* whiteSpace = " \t\n\v\f\r";
constexpr char escapeCharacter = '\\';
constexpr char listSeparator = ',';
constexpr const char* quoteCharacters = "\"'";

std::string Trim(const std::string& text) {
    const std::size_t first = text.find_first_not_of(whiteSpace);
    if (first == std::string::npos) {
        return {};
    }
    return text.substr(first, text.find_last_not_of(whiteSpace) - first + 1);
}

// The tokenizer takes the end of the text for the end of an open quote.
bool HasOpenQuote(const std::string& text) {
    bool open = false;
    for (std::size_t i = 0; i < text.size(); ++i) {
        if (text[i] == escapeCharacter) {
            ++i;
        } else if (std::string(quoteCharacters).find(text[i]) != std::string::npos) {
            open = !open;
        }
    }
    return open;
}

// Throws std::runtime_error for an invalid escape and for an unterminated quote.
std::list<std::string> SplitEscapedList(const std::string& text) {
    using Separator = boost::escaped_list_separator<char>;
    const Separator separator(std::string(1, escapeCharacter), std::string(1, listSeparator),
                              quoteCharacters);
    const boost::tokenizer<Separator> items(text, separator);
    std::list<std::string> result(items.begin(), items.end());
    if (HasOpenQuote(text)) {
        throw std::runtime_error("unterminated quote");
    }
    return result;
}

std::vector<std::string> SplitFields(const std::string& line) {
    using Separator = boost::char_separator<char>;
    const Separator separator(":");
    const boost::tokenizer<Separator> fields(line, separator);
    return {fields.begin(), fields.end()};
}

// Appends the entry that `line` holds and returns true, or returns false for a malformed line.
bool ParseEntry(const std::string& line, std::list<DebugEntry>& entries) {
    const std::vector<std::string> fields = SplitFields(line);
    if (fields.size() != 4) {
        return false;
    }
    try {
        entries.push_back({fields[0], SplitEscapedList(Trim(fields[1])),
                           SplitEscapedList(Trim(fields[2])), fields[3]});
    } catch (const std::runtime_error&) {
        return false;
    }
    return true;
}

}  // namespace

std::list<DebugEntry> ReadDebugConfig() {
    std::ifstream file(debugConfigFile);
    return ParseDebugConfig(file);
}

std::list<DebugEntry> ParseDebugConfig(std::istream& stream) {
    std::list<DebugEntry> entries;
    std::string rawLine;
    for (int lineNumber = 1; std::getline(stream, rawLine); ++lineNumber) {
        const std::string line = Trim(rawLine);
        if (!line.empty() && !ParseEntry(line, entries)) {
            syslog(LOG_INFO, "ignoring malformed debug entry at line %d: %s", lineNumber,
                   line.c_str());
        }
    }
    return entries;
}

}  // namespace vantor
