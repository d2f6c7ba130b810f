#include "fuzz/PlainReader.h"

#include <algorithm>
#include <map>
#include <sstream>
#include <utility>

namespace vantor::support {

namespace {

constexpr int end = -1;
constexpr int deepest = 1000;

bool IsDigit(int byte) { return byte >= '0' && byte <= '9'; }

}  // namespace

int PlainReader::Next() const {
    return position < text.size() ? static_cast<unsigned char>(text[position]) : end;
}

int PlainReader::Take() {
    const int byte = Next();
    if (byte == end) {
        failed = true;
    } else {
        ++position;
    }
    return byte;
}

void PlainReader::Expect(char byte) {
    if (Take() != byte) {
        failed = true;
    }
}

void PlainReader::SkipBlanks() {
    while (!failed) {
        while (Next() != end && std::string(" \t\n\v\f\r").find(text[position]) < 6) {
            Take();
        }
        if (Next() != '/') {
            return;
        }
        Take();
        if (Next() == '*') {
            int taken = 0;
            do {
                taken = Take();
            } while (!failed && !(taken == '*' && Next() == '/'));
            if (!failed) {
                Take();
            }
        } else if (Next() == '/') {
            while (!failed && Take() != '\n') {
            }
        } else {
            endless = failed = true;
        }
    }
}

void PlainReader::ReadValue(JsonValue& value) {
    SkipBlanks();
    if (failed) {
        return;
    }
    JsonKind kind = JsonKind::None;
    const int first = Next();
    if (first == '"') {
        ReadString(value.text);
        kind = JsonKind::String;
    } else if (first == '-' || IsDigit(first)) {
        ReadNumber(value.number);
        kind = JsonKind::Number;
    } else if (first == '{') {
        ReadObject(value);
        kind = JsonKind::Object;
    } else if (first == '[') {
        ReadArray(value);
        kind = JsonKind::Array;
    } else if (first == 't' || first == 'f') {
        ReadBool(value.flag);
        kind = JsonKind::Boolean;
    } else if (first == 'n') {
        ReadNull();
        kind = JsonKind::Null;
    } else {
        Take();
        return;
    }
    if (!failed) {
        value.kind = kind;
    }
}

void PlainReader::ReadString(std::string& result) {
    std::string collected;
    Expect('"');
    while (!failed) {
        const int byte = Take();
        if (byte == '"') {
            result = collected;
            return;
        }
        if (byte == '\\') {
            ReadEscape(collected);
        } else if (byte != end) {
            collected += static_cast<char>(byte);
        }
    }
}

void PlainReader::ReadEscape(std::string& result) {
    static const std::map<int, std::string> known = {
        {'"', "\""}, {'/', "/"},  {'\\', "\\"}, {'b', "\b"}, {'f', "\f"},
        {'n', "\n"}, {'r', "\r"}, {'t', "\t"},  {'u', ""},
    };
    const int byte = Take();
    if (byte == end) {
        return;
    }
    const auto found = known.find(byte);
    result += found != known.end() ? found->second : "\\" + std::string(1, static_cast<char>(byte));
}

void PlainReader::ReadNumber(double& number) {
    std::istringstream rest(text.substr(position));
    rest >> number;
    failed = rest.fail();
    rest.clear();
    position += static_cast<std::size_t>(rest.tellg());
}

void PlainReader::ReadBool(bool& flag) {
    const std::string bytes = text.substr(position, 5);
    position += bytes.size();
    if (bytes.size() == 5 && bytes.substr(0, 4) == "true") {
        --position;
        flag = true;
    } else if (bytes == "false") {
        flag = false;
    } else {
        failed = true;
    }
}

void PlainReader::ReadNull() {
    const std::string bytes = text.substr(position, 4);
    position += bytes.size();
    failed = bytes != "null";
}

bool PlainReader::ReadSeparator() {
    SkipBlanks();
    if (failed || Next() != ',') {
        return false;
    }
    Take();
    return true;
}

void PlainReader::ReadObject(JsonValue& value) {
    value.members.clear();
    Expect('{');
    failed = failed || ++depth > deepest;
    bool more = !failed;
    while (more) {
        if (Next() == ',') {
            Take();
        }
        SkipBlanks();
        if (failed || Next() == '}') {
            break;
        }
        std::string key;
        ReadString(key);
        SkipBlanks();
        if (!failed) {
            Expect(':');
        }
        if (failed) {
            break;
        }
        JsonValue member;
        ReadValue(member);
        value.members[key] = std::move(member);
        more = !failed && ReadSeparator();
    }
    --depth;
    if (!failed) {
        Expect('}');
    }
}

void PlainReader::ReadArray(JsonValue& value) {
    std::vector<JsonValue> collected;
    Expect('[');
    failed = failed || ++depth > deepest;
    bool more = !failed;
    while (more) {
        if (Next() == ',') {
            Take();
        }
        SkipBlanks();
        if (failed || Next() == ']') {
            break;
        }
        JsonValue element;
        ReadValue(element);
        collected.push_back(std::move(element));
        more = !failed && ReadSeparator();
    }
    --depth;
    if (!failed) {
        Expect(']');
    }
    if (!failed) {
        value.elements = std::move(collected);
    }
}

bool SameValue(const JsonValue& left, const JsonValue& right) {
    const auto sameMember = [](const auto& one, const auto& other) {
        return one.first == other.first && SameValue(one.second, other.second);
    };
    if (left.kind != right.kind) {
        return false;
    }
    switch (left.kind) {
    case JsonKind::String:
        return left.text == right.text;
    case JsonKind::Number:
        return left.number == right.number;
    case JsonKind::Boolean:
        return left.flag == right.flag;
    case JsonKind::Object:
        return std::equal(left.members.begin(), left.members.end(), right.members.begin(),
                          right.members.end(), sameMember);
    case JsonKind::Array:
        return std::equal(left.elements.begin(), left.elements.end(), right.elements.begin(),
                          right.elements.end(), SameValue);
    case JsonKind::None:
    case JsonKind::Null:
        break;
    }
    return true;
}

}  // namespace vantor::support
