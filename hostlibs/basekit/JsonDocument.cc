#include "basekit/JsonDocument.h"

#include <algorithm>
#include <set>
#include <vector>

#include "basekit/Text.h"

namespace BaseKit::impl {

namespace {

// Hears of every key while a document is parsed, and knows where it stands. The parser itself keeps
// the last of equal keys and says nothing.
class DuplicateKeys {
public:
    explicit DuplicateKeys(Mistakes& mistakesArg) : mistakes(mistakesArg) {}

    void Hear(Json::parse_event_t event, const Json& parsed) {
        switch (event) {
        case Json::parse_event_t::object_start:
        case Json::parse_event_t::array_start:
            EnterElement();
            open.push_back({event == Json::parse_event_t::array_start, 0, "", {}});
            break;
        case Json::parse_event_t::object_end:
        case Json::parse_event_t::array_end:
            open.pop_back();
            break;
        case Json::parse_event_t::key:
            HearKey(parsed.get_ref<const std::string&>());
            break;
        case Json::parse_event_t::value:
            EnterElement();
            break;
        }
    }

private:
    struct Level {
        bool isArray;
        std::size_t elements;  // of an array, so far
        std::string key;       // of an object, the last
        std::set<std::string> keys;
    };

    void EnterElement() {
        if (!open.empty() && open.back().isArray) {
            ++open.back().elements;
        }
    }

    void HearKey(const std::string& key) {
        open.back().key = key;
        if (!open.back().keys.insert(key).second) {
            mistakes.Add(Place().to_string(), "the key " + Quoted(key) + " stands twice");
        }
    }

    // Of the innermost object.
    JsonPointer Place() const {
        JsonPointer place;
        for (auto level = open.begin(); level + 1 != open.end(); ++level) {
            if (level->isArray) {
                place.push_back(std::to_string(level->elements - 1));
            } else {
                place.push_back(level->key);
            }
        }
        return place;
    }

    Mistakes& mistakes;
    std::vector<Level> open;
};

// The parser's own words for what it found where, without the number of the error. They hold what
// it read last, which can be as long as the document.
void AddParserMistake(const std::string& what, Mistakes& mistakes) {
    std::string text = what;
    if (const std::size_t end = text.find("] "); text[0] == '[' && end != std::string::npos) {
        text.erase(0, end + 2);
    }
    constexpr std::string_view parseError = "parse error at ";
    if (text.compare(0, parseError.size(), parseError) == 0) {
        text.erase(0, parseError.size());
    }
    mistakes.Add("", Shortened(text, 400));
}

const char* NameOf(Json::value_t type) {
    switch (type) {
    case Json::value_t::null:
        return "null";
    case Json::value_t::object:
        return "an object";
    case Json::value_t::array:
        return "an array";
    case Json::value_t::string:
        return "a string";
    case Json::value_t::boolean:
        return "true or false";
    default:
        return "a number";
    }
}

}  // namespace

std::optional<Json> ParseJson(const std::string& text, Mistakes& mistakes) {
    const std::size_t before = mistakes.Texts().size();
    DuplicateKeys duplicates(mistakes);
    try {
        Json document =
            Json::parse(text, [&duplicates](int, Json::parse_event_t event, Json& parsed) {
                duplicates.Hear(event, parsed);
                return true;
            });
        if (mistakes.Texts().size() != before) {
            return std::nullopt;
        }
        return document;
    } catch (const Json::exception& error) {
        AddParserMistake(error.what(), mistakes);
        return std::nullopt;
    }
}

bool CheckType(const Json& value, Json::value_t type, const JsonPointer& place,
               Mistakes& mistakes) {
    if (value.type() == type) {
        return true;
    }
    mistakes.Add(place.to_string(),
                 std::string("must be ") + NameOf(type) + ", not " + NameOf(value.type()));
    return false;
}

JsonObject::JsonObject(const Json& valueArg, JsonPointer whereArg, Mistakes& mistakesArg)
    : value(valueArg), where(std::move(whereArg)), mistakes(mistakesArg) {
    CheckType(value, Json::value_t::object, where, mistakes);
}

void JsonObject::CheckKeys(std::initializer_list<std::string_view> known) {
    if (!value.is_object()) {
        return;
    }
    for (const auto& [key, ignored] : value.items()) {
        if (std::find(known.begin(), known.end(), key) == known.end()) {
            AddMistake(where, "the key " + Quoted(key) + " is not known");
        }
    }
}

const Json* JsonObject::Require(const char* key, Json::value_t type) {
    if (value.is_object() && !Has(key)) {
        AddMistake(where, "the key " + Quoted(key) + " is missing");
    }
    return Find(key, type);
}

const Json* JsonObject::Find(const char* key, Json::value_t type) {
    if (!Has(key)) {
        return nullptr;
    }
    const Json& found = value.at(key);
    return CheckType(found, type, At(key), mistakes) ? &found : nullptr;
}

bool JsonObject::Has(const char* key) const { return value.is_object() && value.contains(key); }

bool JsonObject::Boolean(const char* key) {
    const Json* const found = Find(key, Json::value_t::boolean);
    return found != nullptr && found->get<bool>();
}

std::string JsonObject::String(const char* key) {
    const Json* const found = Find(key, Json::value_t::string);
    return found == nullptr ? "" : found->get<std::string>();
}

void JsonObject::AddMistake(const JsonPointer& place, const std::string& reason) {
    mistakes.Add(place.to_string(), reason);
}

}  // namespace BaseKit::impl
