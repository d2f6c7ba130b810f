#include "basekit/CommandReader.h"

#include <boost/make_shared.hpp>

#include "basekit/ArgumentTemplate.h"
#include "basekit/OptionReader.h"
#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

using AutoCli::ArgumentTemplate;
using AutoCli::CommandDescription;

constexpr std::size_t wordLimit = 16;

class CommandReader {
public:
    CommandReader(const Json& value, const JsonPointer& where, const std::string& file,
                  Mistakes& mistakesArg)
        : object(value, where, mistakesArg), mistakes(mistakesArg) {
        command.file = file;
    }

    CommandDescription Read() {
        object.CheckKeys({"path", "summary", "options", "execute"});
        ReadPath();
        ReadSummary();
        ReadOptions();
        ReadExecute();
        return std::move(command);
    }

private:
    void ReadPath() {
        const Json* const found = object.Require("path", Json::value_t::string);
        if (found == nullptr) {
            return;
        }
        const auto& text = found->get_ref<const std::string&>();
        std::size_t start = 0;
        while (start <= text.size()) {
            const std::size_t end = std::min(text.find(' ', start), text.size());
            command.path.push_back(text.substr(start, end - start));
            if (!IsName(command.path.back()) || command.path.size() > wordLimit) {
                object.AddMistake(object.At("path"),
                                  Quoted(text) +
                                      " is not a command path: at most 16 words with one blank "
                                      "between them, each of letters, digits, \"-\", \"_\" and "
                                      "\".\", the first a letter or a digit");
                return;
            }
            start = end + 1;
        }
    }

    void ReadSummary() {
        const Json* const found = object.Require("summary", Json::value_t::string);
        if (found == nullptr) {
            return;
        }
        command.summary = found->get<std::string>();
        if (command.summary.empty() || !IsOneLine(command.summary)) {
            object.AddMistake(object.At("summary"), "must be one line of text that is not empty");
        }
    }

    void ReadOptions() {
        const Json* const found = object.Find("options", Json::value_t::array);
        if (found == nullptr) {
            return;
        }
        for (std::size_t i = 0; i < found->size(); ++i) {
            ReadOption((*found)[i], object.At("options") / i, mistakes, command.options);
        }
    }

    void ReadExecute() {
        const Json* const found = object.Require("execute", Json::value_t::array);
        if (found == nullptr) {
            return;
        }
        if (found->empty()) {
            object.AddMistake(object.At("execute"), "must name the program to execute");
        }
        for (std::size_t i = 0; i < found->size(); ++i) {
            const JsonPointer place = object.At("execute") / i;
            const Json& element = (*found)[i];
            if (i == 0) {
                ReadProgram(element, place);
            } else if (element.is_object()) {
                ReadConditional(element, place);
            } else if (element.is_string()) {
                ReadArgument(element.get_ref<const std::string&>(), place, std::nullopt);
            } else {
                object.AddMistake(place, "must be a string, or an object with \"when\" and "
                                         "\"arguments\"");
            }
        }
    }

    void ReadProgram(const Json& element, const JsonPointer& place) {
        if (!CheckType(element, Json::value_t::string, place, mistakes)) {
            return;
        }
        command.program = element.get<std::string>();
        if (command.program.empty() || command.program[0] != '/' ||
            command.program.find('\0') != std::string::npos) {
            object.AddMistake(place,
                              Quoted(command.program) + " is not the absolute path of a program");
        }
    }

    void ReadConditional(const Json& element, const JsonPointer& place) {
        JsonObject conditional(element, place, mistakes);
        conditional.CheckKeys({"when", "arguments"});
        const Json* const when = conditional.Require("when", Json::value_t::string);
        const Json* const list = conditional.Require("arguments", Json::value_t::array);
        if (when == nullptr || list == nullptr) {
            return;
        }
        const std::optional<std::size_t> option =
            FindOption(command.options, when->get<std::string>());
        if (!option.has_value()) {
            object.AddMistake(conditional.At("when"),
                              Quoted(when->get<std::string>()) + " names no option");
        }
        for (std::size_t i = 0; i < list->size(); ++i) {
            const JsonPointer argumentPlace = conditional.At("arguments") / i;
            if (CheckType((*list)[i], Json::value_t::string, argumentPlace, mistakes)) {
                ReadArgument((*list)[i].get_ref<const std::string&>(), argumentPlace, option);
            }
        }
    }

    void ReadArgument(const std::string& text, const JsonPointer& place,
                      std::optional<std::size_t> when) {
        ArgumentTemplate argument;
        argument.when = when;
        const std::string reason = ParseArgument(text, command.options, argument.pieces);
        if (!reason.empty()) {
            object.AddMistake(place, reason);
        }
        command.arguments.push_back(std::move(argument));
    }

    JsonObject object;
    Mistakes& mistakes;
    CommandDescription command;
};

}  // namespace

AutoCli::CommandPointer ReadCommand(const Json& value, const JsonPointer& where,
                                    const std::string& file, Mistakes& mistakes) {
    const std::size_t before = mistakes.Texts().size();
    CommandDescription command = CommandReader(value, where, file, mistakes).Read();
    if (mistakes.Texts().size() != before) {
        return nullptr;
    }
    return boost::make_shared<const CommandDescription>(std::move(command));
}

}  // namespace BaseKit::impl
