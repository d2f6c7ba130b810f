#ifndef VANTOR_BASEKIT_JSONDOCUMENT_H
#define VANTOR_BASEKIT_JSONDOCUMENT_H

#include <initializer_list>
#include <nlohmann/json.hpp>
#include <optional>
#include <string>
#include <string_view>

#include "basekit/Mistakes.h"

// Reading JSON so that every slip in it is reported with its place.
namespace BaseKit::impl {

using Json = nlohmann::json;
using JsonPointer = Json::json_pointer;

// Parses a whole document. Returns nothing, with a mistake, when the text is no JSON document or
// when a key stands twice in one object of it, because nobody knows which of the two was meant.
std::optional<Json> ParseJson(const std::string& text, Mistakes& mistakes);

// One object of a document. Each operation notes what it finds wrong; its caller only asks, in the
// end, whether there were mistakes.
class JsonObject {
public:
    // Notes a mistake when `value` is not an object; it then reads like an empty one, about which
    // nothing more is said. Refers to both arguments.
    JsonObject(const Json& valueArg, JsonPointer whereArg, Mistakes& mistakesArg);

    // Notes every key that is none of `known`.
    void CheckKeys(std::initializer_list<std::string_view> known);

    // The value of a key, or null. Require notes a missing one, Find does not; both note one of
    // another type.
    const Json* Require(const char* key, Json::value_t type);
    const Json* Find(const char* key, Json::value_t type);

    bool Has(const char* key) const;
    // false for a missing one.
    bool Boolean(const char* key);
    // The empty text for a missing one.
    std::string String(const char* key);

    JsonPointer At(const char* key) const { return where / key; }
    void AddMistake(const JsonPointer& place, const std::string& reason);
    const JsonPointer& Where() const { return where; }

private:
    const Json& value;
    JsonPointer where;
    Mistakes& mistakes;
};

// Notes that the value at `place` is not of the type, when it is not.
bool CheckType(const Json& value, Json::value_t type, const JsonPointer& place, Mistakes& mistakes);

}  // namespace BaseKit::impl

#endif
