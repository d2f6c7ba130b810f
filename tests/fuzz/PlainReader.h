#ifndef VANTOR_FUZZ_PLAINREADER_H
#define VANTOR_FUZZ_PLAINREADER_H

#include <cstddef>
#include <string>

#include "json/JsonValue.h"

namespace vantor::support {

// A second reader of the same language, to compare the program's with: over a text in memory, one
// rule after the other, without a thought for speed.
class PlainReader {
public:
    explicit PlainReader(const std::string& content) : text(content) {}

    void ReadValue(JsonValue& value);

    bool Failed() const { return failed; }
    // The read would never end: a "/" that begins no comment stands where white space may. Such a
    // read also counts as failed.
    bool Endless() const { return endless; }
    // Bytes consumed so far.
    std::size_t Position() const { return position; }

private:
    int Next() const;
    int Take();
    void Expect(char byte);

    void SkipBlanks();
    void ReadObject(JsonValue& value);
    void ReadArray(JsonValue& value);
    void ReadString(std::string& result);
    void ReadEscape(std::string& result);
    void ReadNumber(double& number);
    void ReadBool(bool& flag);
    void ReadNull();
    // What stands between two items: false when the list is to be closed.
    bool ReadSeparator();

    const std::string& text;
    std::size_t position = 0;
    int depth = 0;
    bool failed = false;
    bool endless = false;
};

// Whether both are the same in everything that their kinds give a meaning to.
bool SameValue(const JsonValue& left, const JsonValue& right);

}  // namespace vantor::support

#endif
