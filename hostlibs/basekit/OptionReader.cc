#include "basekit/OptionReader.h"

#include <algorithm>
#include <map>

#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

using AutoCli::CommandOption;
using AutoCli::ValueKind;

bool IsLetterOrDigit(char c) { return IsLetter(c) || (c >= '0' && c <= '9'); }

// One option on its way from the document to the description.
class OptionReader {
public:
    OptionReader(const Json& value, const JsonPointer& where, Mistakes& mistakesArg,
                 const std::vector<CommandOption>& othersArg)
        : object(value, where, mistakesArg), mistakes(mistakesArg), others(othersArg) {}

    CommandOption Read() {
        object.CheckKeys({"name", "letter", "summary", "kind", "values", "required", "allowEmpty"});
        ReadName();
        ReadLetter();
        option.summary = object.String("summary");
        if (!IsOneLine(option.summary)) {
            object.AddMistake(object.At("summary"), "must be one line of text");
        }
        option.required = object.Boolean("required");
        option.allowEmpty = object.Boolean("allowEmpty");
        if (ReadKind()) {
            ReadChoices();
            CheckAgainstKind();
        }
        return std::move(option);
    }

private:
    void ReadName() {
        const Json* const found = object.Require("name", Json::value_t::string);
        if (found == nullptr) {
            return;
        }
        option.name = found->get<std::string>();
        const bool taken = std::any_of(others.begin(), others.end(), [this](const auto& other) {
            return other.name == option.name;
        });
        if (option.name.size() < 2 || !IsName(option.name)) {
            object.AddMistake(object.At("name"),
                              Quoted(option.name) +
                                  " is not an option's name: two or more letters, digits, \"-\", "
                                  "\"_\" and \".\", the first a letter or a digit");
        } else if (option.name == "help") {
            object.AddMistake(object.At("name"), "\"help\" is an option of every command already");
        } else if (taken) {
            object.AddMistake(object.At("name"),
                              Quoted(option.name) + " is the name of an earlier option already");
        }
    }

    void ReadLetter() {
        const Json* const found = object.Find("letter", Json::value_t::string);
        if (found == nullptr) {
            return;
        }
        const auto& text = found->get_ref<const std::string&>();
        if (text.size() != 1 || !IsLetter(text[0])) {
            object.AddMistake(object.At("letter"),
                              Quoted(text) + " is not one letter from a to z or A to Z");
            return;
        }
        option.letter = text[0];
        const bool taken = std::any_of(others.begin(), others.end(), [this](const auto& other) {
            return other.letter == option.letter;
        });
        if (text == "h") {
            object.AddMistake(object.At("letter"),
                              "\"h\" asks for help with every command already");
        } else if (taken) {
            object.AddMistake(object.At("letter"),
                              Quoted(text) + " is the letter of an earlier option already");
        }
    }

    bool ReadKind() {
        static const std::map<std::string, ValueKind> kinds = {{"flag", ValueKind::Flag},
                                                               {"string", ValueKind::String},
                                                               {"integer", ValueKind::Integer},
                                                               {"boolean", ValueKind::Boolean},
                                                               {"choice", ValueKind::Choice}};
        const Json* const found = object.Require("kind", Json::value_t::string);
        if (found == nullptr) {
            return false;
        }
        const auto& name = found->get_ref<const std::string&>();
        const auto kind = kinds.find(name);
        if (kind == kinds.end()) {
            object.AddMistake(object.At("kind"),
                              Quoted(name) + " is none of \"flag\", \"string\", \"integer\", "
                                             "\"boolean\" and \"choice\"");
            return false;
        }
        option.kind = kind->second;
        return true;
    }

    void CheckAgainstKind() {
        if (option.required && option.kind == ValueKind::Flag) {
            object.AddMistake(object.At("required"), "a flag cannot be required");
        }
        if (option.allowEmpty && option.kind != ValueKind::String) {
            object.AddMistake(object.At("allowEmpty"),
                              "only the value of an option of kind \"string\" can be empty");
        }
    }

    void ReadChoices() {
        if (option.kind != ValueKind::Choice) {
            if (object.Has("values")) {
                object.AddMistake(object.At("values"),
                                  "only an option of kind \"choice\" lists values");
            }
            return;
        }
        const Json* const values = object.Require("values", Json::value_t::array);
        if (values == nullptr) {
            return;
        }
        if (values->empty()) {
            object.AddMistake(object.At("values"), "must list at least one value");
        }
        for (std::size_t i = 0; i < values->size(); ++i) {
            const JsonPointer place = object.At("values") / i;
            if (CheckType((*values)[i], Json::value_t::string, place, mistakes)) {
                ReadChoice((*values)[i].get<std::string>(), place);
            }
        }
    }

    void ReadChoice(const std::string& choice, const JsonPointer& place) {
        if (choice.empty() || !IsOneLine(choice)) {
            object.AddMistake(place, "must be one line of text that is not empty");
        } else if (std::find(option.choices.begin(), option.choices.end(), choice) !=
                   option.choices.end()) {
            object.AddMistake(place, Quoted(choice) + " stands in the list already");
        } else {
            option.choices.push_back(choice);
        }
    }

    JsonObject object;
    Mistakes& mistakes;
    const std::vector<CommandOption>& others;
    CommandOption option;
};

}  // namespace

void ReadOption(const Json& value, const JsonPointer& where, Mistakes& mistakes,
                std::vector<CommandOption>& options) {
    options.push_back(OptionReader(value, where, mistakes, options).Read());
}

bool IsName(std::string_view text) {
    return !text.empty() && IsLetterOrDigit(text[0]) &&
           std::all_of(text.begin(), text.end(), [](char c) {
               return IsLetterOrDigit(c) || c == '-' || c == '_' || c == '.';
           });
}

bool IsOneLine(std::string_view text) {
    return std::none_of(text.begin(), text.end(),
                        [](char c) { return static_cast<unsigned char>(c) < 0x20 || c == 0x7f; });
}

}  // namespace BaseKit::impl
