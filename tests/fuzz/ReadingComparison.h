#ifndef VANTOR_FUZZ_READINGCOMPARISON_H
#define VANTOR_FUZZ_READINGCOMPARISON_H

#include <string>

namespace vantor::support {

// Reads the text to its end or to its first failure, value by value, with the program's reader from
// buffers of several kinds and with PlainReader. Returns what they disagree about; empty when they
// agree, the program's reader has made no more than a few operations of the buffer a byte, and it
// runs on for ever where it must and only there.
std::string CompareReadings(const std::string& text);

// Whether the program's reader comes to an end with the text.
bool IsReadToAnEnd(const std::string& text);

}  // namespace vantor::support

#endif
