#include "driver/DebugConfig.h"

#include <fcntl.h>
#include <syslog.h>
#include <unistd.h>

#include <array>
#include <boost/tokenizer.hpp>
#include <cstddef>
#include <sstream>
#include <stdexcept>
#include <utility>
#include <vector>

#include "io/FileDescriptor.h"

namespace vantor {

namespace {

constexpr const char* debugConfigFile = "/etc/nuvex/vantor/debug.conf";
constexpr const char* whiteSpace = " \t\n\v\f\r";
constexpr char escapeCharacter = '\\';
constexpr char listSeparator = ',';
constexpr const char* quoteCharacters = "\"'";
constexpr const char* special = "\\\"'";  // the escape character and the quote characters

// Empty when the file cannot be read to its end: a command that is cut off is not to be run.
std::string ContentOf(const char* path) {
    std::string content;
    const FileDescriptor file(open(path, O_RDONLY | O_CLOEXEC));
    if (!file.IsOpen()) {
        return content;
    }
    std::array<char, 4096> piece;
    for (;;) {
        const ssize_t count = TEMP_FAILURE_RETRY(read(file.Get(), piece.data(), piece.size()));
        if (count <= 0) {
            return count == 0 ? content : std::string();
        }
        content.append(piece.data(), static_cast<std::size_t>(count));
    }
}

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
    for (std::size_t i = text.find_first_of(special); i != std::string::npos;
         i = text.find_first_of(special, i + 1)) {
        if (text[i] == escapeCharacter) {
            ++i;
        } else {
            open = !open;
        }
    }
    return open;
}

// The items between separators, empty ones included.
std::list<std::string> SplitPlainList(const std::string& text) {
    std::list<std::string> items;
    std::size_t start = 0;
    for (std::size_t end = text.find(listSeparator); end != std::string::npos;
         end = text.find(listSeparator, start)) {
        items.push_back(text.substr(start, end - start));
        start = end + 1;
    }
    items.push_back(text.substr(start));
    return items;
}

// Throws std::runtime_error for an invalid escape and for an unterminated quote. The file is read
// once for each plugin file, and most of its lists need no tokenizer.
std::list<std::string> SplitEscapedList(const std::string& text) {
    if (text.empty()) {
        return {};
    }
    if (text.find_first_of(special) == std::string::npos) {
        return SplitPlainList(text);
    }
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

// The parts between colons, without the empty ones.
std::vector<std::string> SplitFields(const std::string& line) {
    std::vector<std::string> fields;
    for (std::size_t start = line.find_first_not_of(':'); start != std::string::npos;) {
        const std::size_t end = line.find(':', start);
        fields.push_back(line.substr(start, end - start));
        start = line.find_first_not_of(':', end);
    }
    return fields;
}

// Appends the entry that `line` holds and returns true, or returns false for a malformed line.
bool ParseEntry(const std::string& line, int lineNumber, std::list<DebugEntry>& entries) {
    std::vector<std::string> fields = SplitFields(line);
    if (fields.size() != 4) {
        return false;
    }
    try {
        entries.push_back({std::move(fields[0]), SplitEscapedList(Trim(fields[1])),
                           SplitEscapedList(Trim(fields[2])), std::move(fields[3]), lineNumber});
    } catch (const std::runtime_error&) {
        return false;
    }
    return true;
}

}  // namespace

// Asked once for each plugin file, and mostly there is nothing: a stream, which takes longer to
// make than all the rest, is made only for what there is to read.
std::list<DebugEntry> ReadDebugConfig() {
    const std::string content = ContentOf(debugConfigFile);
    if (content.empty()) {
        return {};
    }
    std::istringstream stream(content);
    return ParseDebugConfig(stream);
}

std::list<DebugEntry> ParseDebugConfig(std::istream& stream) {
    return ParseDebugConfig(
        stream, [](int, const std::string& text) { syslog(LOG_INFO, "%s", text.c_str()); });
}

std::list<DebugEntry> ParseDebugConfig(std::istream& stream, const MalformedLineReport& report) {
    std::list<DebugEntry> entries;
    std::string rawLine;
    for (int lineNumber = 1; std::getline(stream, rawLine); ++lineNumber) {
        const std::string line = Trim(rawLine);
        if (!line.empty() && !ParseEntry(line, lineNumber, entries)) {
            report(lineNumber, "ignoring malformed debug entry at line " +
                                   std::to_string(lineNumber) + ": " + line);
        }
    }
    return entries;
}

}  // namespace vantor
