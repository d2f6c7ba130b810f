#ifndef VANTOR_JSON_JSONREADER_H
#define VANTOR_JSON_JSONREADER_H

#include <istream>
#include <map>
#include <string>
#include <vector>

#include "json/JsonValue.h"

namespace vantor {

// Reads JSON (RFC 8259) from a byte stream, one value at a time, leaving what follows it in the
// stream. More lenient than the RFC in these ways and no other:
//   - "/* */" and "//" comments stand wherever white space may, and "/*/" is a whole comment;
//   - in an object or array a comma may follow the opening bracket, or another comma, at once, and
//     a last comma may stand before the closing bracket;
//   - of equal keys the last one wins;
//   - an escape that is not known keeps its backslash; "\u" gives nothing, so that the digits
//     behind it are ordinary text; any byte may stand in a string;
//   - numbers are whatever the stream's own extraction of a double accepts;
//   - a byte that begins no value is a value without a kind;
//   - "true" needs one more byte behind it, as it has in every complete document.
// A "/" that begins no comment, where white space may stand, is never got past: the read does not
// end. Values nested deeper than 1,000 levels are a failure.
//
// Failures are told by the stream's state alone (success: neither bad nor failed); nothing is
// thrown by the reader or logged. Each function takes time in proportion to the bytes it reads, and
// memory in proportion to the value. They may be called by several threads on different streams.

// Reads a value of any kind. `value` gets its kind only when the read succeeds; give it a fresh
// one.
void ReadValue(std::istream& stream, JsonValue& value);

// Replaces `members` also after a failure, by what was read until then.
void ReadObject(std::istream& stream, std::map<std::string, JsonValue>& members);

// Each replaces its output when the read succeeds, and leaves it alone otherwise.
void ReadArray(std::istream& stream, std::vector<JsonValue>& elements);
void ReadString(std::istream& stream, std::string& text);
void ReadBool(std::istream& stream, bool& flag);

// As the stream's extraction operator, which sets the number to 0 or to the nearest limit when it
// fails.
void ReadNumber(std::istream& stream, double& number);
void ReadNull(std::istream& stream);

// Skips white space and comments.
void SkipBlanks(std::istream& stream);

// A process-wide option of the reader, false at start. Documents are loaded with it set; no reading
// function looks at it.
void SetReaderOption(bool option);
bool ReaderOption();

}  // namespace vantor

#endif
