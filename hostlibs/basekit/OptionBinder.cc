#include "basekit/OptionBinder.h"

#include <algorithm>
#include <charconv>
#include <cstdint>

#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

using AutoCli::CommandDescription;
using AutoCli::CommandOption;
using AutoCli::ValueKind;

std::optional<std::size_t> FindByTypedName(const std::vector<CommandOption>& options,
                                           const std::string& name) {
    if (name.size() != 1) {
        return FindOption(options, name);
    }
    for (std::size_t i = 0; i < options.size(); ++i) {
        if (options[i].letter == name[0]) {
            return i;
        }
    }
    return std::nullopt;
}

// What is wrong with an integer; empty when it is one.
std::string CheckInteger(const std::string& value) {
    std::int64_t number = 0;
    const char* const end = value.data() + value.size();
    const std::from_chars_result read = std::from_chars(value.data(), end, number);
    if (read.ptr != end || read.ec == std::errc::invalid_argument) {
        return "is not an integer";
    }
    return read.ec == std::errc{} ? "" : "is not an integer of 64 bits";
}

std::string CheckChoice(const std::string& value, const std::vector<std::string>& choices) {
    if (std::find(choices.begin(), choices.end(), value) != choices.end()) {
        return "";
    }
    std::string known;
    for (const std::string& choice : choices) {
        known.append(known.empty() ? "" : ", ").append(Quoted(choice));
    }
    return "is not one of " + known;
}

// What is wrong with the value, to go on after "the value ... of the option ..."; empty for none.
std::string CheckKind(const CommandOption& option, const std::string& value) {
    switch (option.kind) {
    case ValueKind::Integer:
        return CheckInteger(value);
    case ValueKind::Boolean:
        return value == "true" || value == "false" ? "" : "is neither \"true\" nor \"false\"";
    case ValueKind::Choice:
        return CheckChoice(value, option.choices);
    case ValueKind::Flag:
    case ValueKind::String:
        break;
    }
    // A parsed line has none, but a caller can put any parameter into its input.
    return value.find('\0') == std::string::npos ? "" : "has a null character";
}

// The sentence on what is wrong with the value of an option, typed as `typed`; empty for nothing.
std::string CheckValue(const CommandOption& option, const std::string& typed,
                       const std::string& value) {
    if (option.kind == ValueKind::Flag) {
        return value.empty()
                   ? ""
                   : "the option " + typed + " takes no value, but is given " + Quoted(value);
    }
    if (value.empty()) {
        return option.allowEmpty ? "" : "the option " + typed + " needs a value";
    }
    const std::string wrong = CheckKind(option, value);
    return wrong.empty() ? ""
                         : "the value " + Quoted(value) + " of the option " + typed + " " + wrong;
}

std::string Subject(const CommandDescription& command) {
    return "the command " + Quoted(JoinPath(command.path));
}

}  // namespace

BoundOptions BindOptions(const CommandDescription& command,
                         const std::vector<std::pair<std::string, std::string>>& parameters) {
    BoundOptions bound;
    bound.values.resize(command.options.size());

    for (const auto& [name, value] : parameters) {
        const std::string typed = QuotedOption(name);
        const std::optional<std::size_t> index = FindByTypedName(command.options, name);
        if (!index.has_value()) {
            bound.errors.push_back(Subject(command).append(" has no option ").append(typed));
            continue;
        }
        if (bound.values[*index].has_value()) {
            bound.errors.push_back("the option " + QuotedOption(command.options[*index].name) +
                                   " is given twice");
            continue;
        }
        bound.values[*index] = value;
        std::string error = CheckValue(command.options[*index], typed, value);
        if (!error.empty()) {
            bound.errors.push_back(std::move(error));
        }
    }
    for (std::size_t i = 0; i < command.options.size(); ++i) {
        if (command.options[i].required && !bound.values[i].has_value()) {
            bound.errors.push_back(Subject(command) + " needs the option " +
                                   QuotedOption(command.options[i].name));
        }
    }
    return bound;
}

}  // namespace BaseKit::impl
