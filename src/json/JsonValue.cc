#include "json/JsonValue.h"

namespace vantor {

const JsonValue* JsonValue::Find(const std::string& key) const {
    const auto member = members.find(key);
    return member == members.end() ? nullptr : &member->second;
}

}  // namespace vantor
