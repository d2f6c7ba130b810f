#ifndef VANTOR_JSON_TESTS_JSONTEXT_H
#define VANTOR_JSON_TESTS_JSONTEXT_H

#include <istream>
#include <map>
#include <ostream>
#include <string>
#include <vector>

#include "json/JsonValue.h"

namespace vantor::support {

// A value as text that tells all that a reader can make of it: members by key, strings in quotes
// with their odd bytes as \xNN, numbers to their last digit, "none" for a value without a kind.
std::string Show(const JsonValue& value);
std::string Show(const std::map<std::string, JsonValue>& members);
std::string Show(const std::vector<JsonValue>& elements);
std::string Show(const std::string& text);
std::string Show(const char* text) = delete;  // it would be taken for a boolean
std::string Show(double number);
std::string Show(bool flag);

// "read", "failed" or "bad" (which counts as failed as well).
std::string StateOf(const std::istream& stream);

// What a reading operation left: its output, the stream's state and the bytes still in the stream.
struct Reading {
    std::string output;
    std::string state;
    std::string rest;

    bool operator==(const Reading& other) const {
        return output == other.output && state == other.state && rest == other.rest;
    }
};

std::ostream& operator<<(std::ostream& stream, const Reading& reading);

// What is expected of a reading that succeeds, and of one that fails and leaves its output as it
// was (the functions below begin with the outputs that they name).
Reading Accepted(const std::string& output, const std::string& rest = "");
Reading Failed(const std::string& output, const std::string& rest = "");

// Each reads once from the beginning of the text, from buffers of several kinds, and fails the
// current test unless all of them agree.
Reading ValueOf(const std::string& text);   // begins with none
Reading ObjectOf(const std::string& text);  // begins with {"old": none}
Reading ArrayOf(const std::string& text);   // begins with [none]
Reading StringOf(const std::string& text);  // begins with "old"
Reading NumberOf(const std::string& text);  // begins with 7
Reading BoolOf(const std::string& text, bool old);
Reading NullOf(const std::string& text);    // there is no output: it is shown as ""
Reading BlanksOf(const std::string& text);  // likewise

}  // namespace vantor::support

#endif
