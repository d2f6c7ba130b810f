#include <string_view>

#include "basekit/HostStorage.h"
#include "basekit/Text.h"
#include "basekit/Tokenizer.h"
#include "platform/BaseKit.h"

// A line is "word... option...". An option is one of
//   --name=value   --name value   --name   -nvalue   -n value   -n
// and a value that is a word of its own does not look like an option: it starts with no dash, is
// "-" alone, or is a dash and something other than a letter or a dash, as negative numbers are.
// Which options are flags is for the dispatcher to know; here an option without a value has an
// empty one.
namespace BaseKit {

namespace impl {

namespace {

bool StartsWithDash(std::string_view word) { return !word.empty() && word[0] == '-'; }

bool LooksLikeOption(std::string_view word) {
    return StartsWithDash(word) && word.size() > 1 && (word[1] == '-' || IsLetter(word[1]));
}

struct Option {
    std::string name;
    std::string value;
    bool hasValue = false;  // within the word itself
};

// `word` looks like an option.
Option SplitOption(const std::string& word) {
    if (word[1] != '-') {
        return {word.substr(1, 1), word.substr(2), word.size() > 2};
    }
    const std::size_t equals = word.find('=');
    if (equals == std::string::npos) {
        return {word.substr(2), "", false};
    }
    return {word.substr(2, equals - 2), word.substr(equals + 1), true};
}

}  // namespace

// What an OptionParser knows of the line that it parsed last.
class ParsedLine {
public:
    explicit ParsedLine(std::string toolNameArg) : toolName(std::move(toolNameArg)) {}

    bool Parse(const std::string& line) {
        path.clear();
        parameters.clear();
        errors.clear();
        help = false;

        Tokens tokens = Tokenize(line);
        if (!tokens.error.empty()) {
            errors.push_back(std::move(tokens.error));
            return false;
        }
        const std::vector<std::string>& words = tokens.words;
        ReadOptions(words, ReadPath(words));
        if (help || words.empty()) {
            errors.clear();
            return true;
        }
        if (path.empty() && errors.empty()) {
            errors.push_back("the command line starts with the option " + Quoted(words.front()) +
                             ": " + toolName + " needs the words of a command before it");
        }
        return false;
    }

    std::list<std::string> path;
    std::vector<std::pair<std::string, std::string>> parameters;
    std::vector<std::string> errors;

private:
    // Returns the index of the first word that is not the path's.
    std::size_t ReadPath(const std::vector<std::string>& words) {
        std::size_t at = 0;
        for (; at < words.size() && !StartsWithDash(words[at]); ++at) {
            if (words[at].empty()) {
                errors.push_back(at == 0 ? "the command line starts with an empty command word"
                                         : "the command word after " + Quoted(words[at - 1]) +
                                               " is empty");
            }
            path.push_back(words[at]);
        }
        return at;
    }

    void ReadOptions(const std::vector<std::string>& words, const std::size_t first) {
        for (std::size_t at = first; at < words.size(); ++at) {
            const std::string& word = words[at];
            if (!LooksLikeOption(word)) {
                errors.push_back(at == first
                                     ? "the option " + Quoted(word) + " has no name"
                                     : "the value " + Quoted(word) + " belongs to no option");
                continue;
            }
            Option option = SplitOption(word);
            if (option.name == "help" || option.name == "h") {
                ReadHelp(option);
                continue;
            }
            if (!option.hasValue && at + 1 < words.size() && !LooksLikeOption(words[at + 1])) {
                option.value = words[++at];
            }
            if (option.name.empty()) {
                errors.push_back("the option " + Quoted(word) + " has no name");
                continue;
            }
            parameters.emplace_back(std::move(option.name), std::move(option.value));
        }
    }

    void ReadHelp(const Option& option) {
        if (option.hasValue) {
            errors.push_back("the option " + QuotedOption(option.name) + " takes no value");
        } else {
            help = true;
        }
    }

    const std::string toolName;
    bool help = false;
};

}  // namespace impl

namespace AutoCli {

using Storage = impl::HostStorage<impl::ParsedLine>;

OptionParser::OptionParser(const std::string& toolName) {
    Storage::Put(hostStorage, std::make_unique<impl::ParsedLine>(toolName));
}

OptionParser::~OptionParser() { Storage::Release(hostStorage); }

bool OptionParser::ParseString(const std::string& commandLine) {
    return Storage::In(hostStorage).Parse(commandLine);
}

std::vector<std::string> OptionParser::GetParseErrors() const {
    return Storage::In(hostStorage).errors;
}

std::vector<std::pair<std::string, std::string>> OptionParser::GetCommandParameters() const {
    return Storage::In(hostStorage).parameters;
}

std::list<std::string> OptionParser::GetCommandPath() const {
    return Storage::In(hostStorage).path;
}

}  // namespace AutoCli

}  // namespace BaseKit
