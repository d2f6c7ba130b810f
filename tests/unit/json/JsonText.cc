#include "json/JsonText.h"

#include <gtest/gtest.h>

#include <cstdio>
#include <sstream>

#include "json/JsonReader.h"
#include "json/TestBuffers.h"

namespace vantor::support {

namespace {

struct NoOutput {};

std::string Show(const NoOutput& /*none*/) { return ""; }

template <typename Output, typename Operation>
Reading ReadFrom(std::streambuf& buffer, Output output, Operation operation) {
    using support::Show;
    std::istream stream(&buffer);
    operation(stream, output);
    return {Show(output), StateOf(stream), RestOf(buffer)};
}

template <typename Output, typename Operation>
Reading ReadAs(const std::string& text, const Output& old, Operation operation) {
    std::stringbuf whole(text);
    Reading reading = ReadFrom(whole, old, operation);
    CountingBuffer single(text);
    EXPECT_EQ(ReadFrom(single, old, operation), reading) << "from a buffer without a get area";
    for (const std::size_t size : {1U, 2U, 3U, 5U}) {
        PieceBuffer withPutBack(text, size, PutBackAcrossPieces::Yes);
        EXPECT_EQ(ReadFrom(withPutBack, old, operation), reading) << "in pieces of " << size;
        PieceBuffer without(text, size, PutBackAcrossPieces::No);
        EXPECT_EQ(ReadFrom(without, old, operation), reading)
            << "in pieces of " << size << " that are gone once read";
    }
    return reading;
}

}  // namespace

std::string Show(const JsonValue& value) {
    switch (value.kind) {
    case JsonKind::None:
        return "none";
    case JsonKind::String:
        return Show(value.text);
    case JsonKind::Number:
        return Show(value.number);
    case JsonKind::Object:
        return Show(value.members);
    case JsonKind::Array:
        return Show(value.elements);
    case JsonKind::Boolean:
        return Show(value.flag);
    case JsonKind::Null:
        return "null";
    }
    return "(no such kind)";
}

std::string Show(const std::map<std::string, JsonValue>& members) {
    std::string text = "{";
    for (const auto& [key, value] : members) {
        text += (text.size() > 1 ? ", " : "") + Show(key) + ": " + Show(value);
    }
    return text + "}";
}

std::string Show(const std::vector<JsonValue>& elements) {
    std::string text = "[";
    for (const JsonValue& element : elements) {
        text += (text.size() > 1 ? ", " : "") + Show(element);
    }
    return text + "]";
}

std::string Show(const std::string& text) {
    std::string shown = "\"";
    for (const char c : text) {
        const auto byte = static_cast<unsigned char>(c);
        if (byte >= 32 && byte < 127) {
            shown += c;
        } else {
            char hexadecimal[sizeof "\\xff"];
            std::snprintf(hexadecimal, sizeof hexadecimal, "\\x%02x", unsigned{byte});
            shown += hexadecimal;
        }
    }
    return shown + "\"";
}

std::string Show(double number) {
    char text[64];
    std::snprintf(text, sizeof text, "%.17g", number);
    return text;
}

std::string Show(bool flag) { return flag ? "true" : "false"; }

std::string StateOf(const std::istream& stream) {
    if (stream.bad()) {
        return "bad";
    }
    return stream.fail() ? "failed" : "read";
}

std::ostream& operator<<(std::ostream& stream, const Reading& reading) {
    return stream << reading.state << " " << reading.output << ", before " << Show(reading.rest);
}

Reading Accepted(const std::string& output, const std::string& rest) {
    return {output, "read", rest};
}

Reading Failed(const std::string& output, const std::string& rest) {
    return {output, "failed", rest};
}

Reading ValueOf(const std::string& text) { return ReadAs(text, JsonValue(), ReadValue); }

Reading ObjectOf(const std::string& text) {
    return ReadAs(text, std::map<std::string, JsonValue>{{"old", {}}}, ReadObject);
}

Reading ArrayOf(const std::string& text) {
    return ReadAs(text, std::vector<JsonValue>(1), ReadArray);
}

Reading StringOf(const std::string& text) { return ReadAs(text, std::string("old"), ReadString); }

Reading NumberOf(const std::string& text) { return ReadAs(text, 7.0, ReadNumber); }

Reading BoolOf(const std::string& text, bool old) { return ReadAs(text, old, ReadBool); }

Reading NullOf(const std::string& text) {
    return ReadAs(text, NoOutput(),
                  [](std::istream& stream, NoOutput& /*none*/) { ReadNull(stream); });
}

Reading BlanksOf(const std::string& text) {
    return ReadAs(text, NoOutput(),
                  [](std::istream& stream, NoOutput& /*none*/) { SkipBlanks(stream); });
}

}  // namespace vantor::support
