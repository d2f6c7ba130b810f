#include "basekit/ArgumentTemplate.h"

#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

using AutoCli::ArgumentPiece;
using AutoCli::ArgumentTemplate;
using AutoCli::CommandOption;
using AutoCli::ValueKind;

// `at` is the index of the "$" of a placeholder; set behind it on success.
std::string ParsePlaceholder(const std::string& text, const std::vector<CommandOption>& options,
                             std::size_t& at, std::optional<std::size_t>& option) {
    const std::size_t end = text.find('}', at);
    if (end == std::string::npos) {
        return "the placeholder " + Quoted(text.substr(at)) + " is not closed";
    }
    const std::string name = text.substr(at + 2, end - at - 2);
    option = FindOption(options, name);
    if (!option.has_value()) {
        return "the placeholder " + Quoted(text.substr(at, end + 1 - at)) + " names no option";
    }
    if (options[*option].kind == ValueKind::Flag) {
        return "the placeholder " + Quoted(text.substr(at, end + 1 - at)) +
               " names a flag, which has no value: use \"when\"";
    }
    at = end + 1;
    return "";
}

}  // namespace

std::optional<std::size_t> FindOption(const std::vector<CommandOption>& options,
                                      const std::string& name) {
    for (std::size_t i = 0; i < options.size(); ++i) {
        if (options[i].name == name) {
            return i;
        }
    }
    return std::nullopt;
}

std::string ParseArgument(const std::string& text, const std::vector<CommandOption>& options,
                          std::vector<ArgumentPiece>& pieces) {
    if (text.find('\0') != std::string::npos) {
        return "an argument cannot hold a null character";
    }
    pieces.emplace_back();
    std::size_t at = 0;
    while (at < text.size()) {
        const std::size_t dollar = std::min(text.find('$', at), text.size());
        pieces.back().text.append(text, at, dollar - at);
        at = dollar;
        if (text.compare(at, 2, "$$") == 0) {
            pieces.back().text += '$';
            at += 2;
        } else if (text.compare(at, 2, "${") == 0) {
            std::string reason = ParsePlaceholder(text, options, at, pieces.back().option);
            if (!reason.empty()) {
                return reason;
            }
            pieces.emplace_back();
        } else if (at < text.size()) {
            return "a \"$\" that starts no placeholder is written \"$$\"";
        }
    }
    return "";
}

std::vector<std::string> ExpandArguments(const AutoCli::CommandDescription& command,
                                         const OptionValues& values) {
    std::vector<std::string> expanded = {command.program};
    for (const ArgumentTemplate& argument : command.arguments) {
        bool present = !argument.when.has_value() || values[*argument.when].has_value();
        std::string text;
        for (const ArgumentPiece& piece : argument.pieces) {
            text += piece.text;
            if (piece.option.has_value()) {
                const std::optional<std::string>& value = values[*piece.option];
                present = present && value.has_value();
                text += value.value_or("");
            }
        }
        if (present) {
            expanded.push_back(std::move(text));
        }
    }
    return expanded;
}

}  // namespace BaseKit::impl
