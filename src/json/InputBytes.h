#ifndef VANTOR_JSON_INPUTBYTES_H
#define VANTOR_JSON_INPUTBYTES_H

#include <cstddef>
#include <istream>
#include <streambuf>
#include <string>
#include <string_view>

#include "json/GetArea.h"

namespace vantor {

// The bytes of a stream, read from its buffer past the stream's own functions, which check and
// change the stream's state for every byte; the state is set here as they would set it. Runs of
// bytes are taken from the buffer's get area at once. Where that ends, or if there is none, bytes
// are taken one by one and the buffer fills it again, so that the stream is left where the last
// byte was consumed whatever buffer it has.
class InputBytes {
public:
    static constexpr int end = std::char_traits<char>::eof();

    // The stream has a buffer.
    explicit InputBytes(std::istream& source);

    bool Good() const { return !state.fail(); }  // neither bad nor failed
    void Fail() { state.setstate(std::ios_base::failbit); }

    // The next byte, left in the stream; `end` at the end of the input.
    int Peek() {
        const int byte = buffer.sgetc();
        if (byte == end) {
            state.setstate(std::ios_base::eofbit);
        }
        return byte;
    }

    // The next byte, consumed. At the end of the input the stream fails.
    int Take() {
        const int byte = buffer.sbumpc();
        if (byte == end) {
            state.setstate(std::ios_base::eofbit | std::ios_base::failbit);
        }
        return byte;
    }

    // Consumes the byte, or fails if the next one is another.
    void Expect(char byte) {
        const int taken = Take();
        if (taken != end && taken != std::char_traits<char>::to_int_type(byte)) {
            Fail();
        }
    }

    // Consumes the byte if it is the next one.
    bool Accept(char byte) {
        if (Peek() != std::char_traits<char>::to_int_type(byte)) {
            return false;
        }
        Take();
        return true;
    }

    void PutBack();

    // Consumes so many bytes. Where there are fewer they are consumed and the stream fails.
    bool Take(char* bytes, std::size_t count);

    void SkipWhiteSpace();

    // Consumes some of the bytes before the next quote or backslash: those that the get area holds,
    // and of many only the first; there may be none. Valid until the next byte is read.
    std::string_view TakePlainText();

    // As the stream's extraction of a double.
    void Number(double& number);

private:
    bool NumberFromGetArea(double& number);

    std::istream& stream;
    std::ios& state;  // the stream's, found once: it is asked for after every byte
    std::streambuf& buffer;
    const bool plainNumbers;  // the stream's locale writes numbers as the C locale does
};

}  // namespace vantor

#endif
