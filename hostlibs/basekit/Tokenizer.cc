#include "basekit/Tokenizer.h"

#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

constexpr std::string_view blanks = " \t\n\r\v\f";

// Walks over one line. A word that it cannot read ends the walk with an error that names it from
// its first character to the end of the line, because nobody knows where it was meant to end.
class Walk {
public:
    explicit Walk(std::string_view lineArg) : line(lineArg) {}

    Tokens Run() {
        if (line.find('\0') != std::string_view::npos) {
            tokens.error = "the command line has a null character";
            return tokens;
        }
        while ((at = line.find_first_not_of(blanks, at)) != std::string_view::npos) {
            wordStart = at;
            if (!ReadWord()) {
                tokens.words.clear();
                break;
            }
        }
        return tokens;
    }

private:
    bool ReadWord() {
        std::string word;
        bool present = false;  // a line end that is quoted by a backslash alone makes no word
        while (at < line.size() && blanks.find(line[at]) == std::string_view::npos) {
            const char c = line[at++];
            if (c == '\'' || c == '"') {
                if (!(c == '\'' ? ReadSingle(word) : ReadDouble(word))) {
                    return false;
                }
                present = true;
            } else if (c == '\\') {
                if (at == line.size()) {
                    return Fail("a backslash with nothing after it");
                }
                if (line[at] != '\n') {
                    word += line[at];
                    present = true;
                }
                ++at;
            } else {
                word += c;
                present = true;
            }
        }
        if (present) {
            tokens.words.push_back(std::move(word));
        }
        return true;
    }

    // `at` stands behind the opening quote.
    bool ReadSingle(std::string& word) {
        const std::size_t end = line.find('\'', at);
        if (end == std::string_view::npos) {
            return Fail("a single quote that is not closed");
        }
        word.append(line.substr(at, end - at));
        at = end + 1;
        return true;
    }

    bool ReadDouble(std::string& word) {
        constexpr std::string_view escaped = "\"\\$`\n";
        for (; at < line.size(); ++at) {
            if (line[at] == '"') {
                ++at;
                return true;
            }
            if (line[at] == '\\' && at + 1 < line.size() &&
                escaped.find(line[at + 1]) != std::string_view::npos) {
                ++at;
                if (line[at] == '\n') {
                    continue;
                }
            }
            word += line[at];
        }
        return Fail("a double quote that is not closed");
    }

    bool Fail(std::string_view what) {
        tokens.error = "the word " + Quoted(line.substr(wordStart)) + " has " + std::string(what);
        return false;
    }

    std::string_view line;
    std::size_t at = 0;
    std::size_t wordStart = 0;
    Tokens tokens;
};

}  // namespace

Tokens Tokenize(std::string_view line) { return Walk(line).Run(); }

std::string QuoteWord(std::string_view word) {
    if (!word.empty() && word.find_first_of(" \t\n\r\v\f'\"\\") == std::string_view::npos) {
        return std::string(word);
    }
    std::string quoted = "'";
    for (const char c : word) {
        if (c == '\'') {
            quoted += "'\\''";
        } else {
            quoted += c;
        }
    }
    return quoted + "'";
}

}  // namespace BaseKit::impl
