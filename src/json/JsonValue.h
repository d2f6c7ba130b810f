#ifndef VANTOR_JSON_JSONVALUE_H
#define VANTOR_JSON_JSONVALUE_H

#include <cstdint>
#include <map>
#include <string>
#include <vector>

namespace vantor {

// Which member of a JsonValue holds the value.
enum class JsonKind : std::int32_t {
    None = 0,  // no value: a fresh one, a failed read, an absent member
    String = 1,
    Number = 2,
    Object = 3,
    Array = 4,
    Boolean = 5,
    Null = 6,
};

// One JSON value. All members exist at once; only the one that `kind` names means anything. Copying
// copies everything below.
struct JsonValue {
    std::string text;
    double number = 0.0;
    std::map<std::string, JsonValue> members;  // ordered by the bytes of the keys
    std::vector<JsonValue> elements;           // in document order
    bool flag = false;
    JsonKind kind = JsonKind::None;

    // The member of that key, inserted without a kind if it was absent.
    JsonValue& operator[](const std::string& key) { return members[key]; }

    // The member of that key, or null. Inserts nothing; valid while the value is not changed.
    const JsonValue* Find(const std::string& key) const;
};

}  // namespace vantor

#endif
