#include "fuzz/ReadingComparison.h"

#include <cstdint>
#include <istream>
#include <sstream>
#include <vector>

#include "fuzz/PlainReader.h"
#include "json/JsonReader.h"
#include "json/TestBuffers.h"

namespace vantor::support {

namespace {

// Operations of the buffer that a read of so many bytes may take. Looking at a byte and consuming
// it are two, short numbers take some more, and the end of the input may be met several times.
std::uint64_t OperationLimit(std::size_t size) { return 16 * std::uint64_t{size} + 64; }

// What is to become of reading one value.
struct Expectation {
    JsonValue value;
    bool failed = false;
    bool endless = false;
    std::size_t position = 0;  // behind it
};

// For every value of the text, up to the first that fails.
std::vector<Expectation> ExpectationsOf(const std::string& text) {
    PlainReader reader(text);
    std::vector<Expectation> expectations;
    while (!reader.Failed()) {
        expectations.emplace_back();
        Expectation& expectation = expectations.back();
        reader.ReadValue(expectation.value);
        expectation.failed = reader.Failed();
        expectation.endless = reader.Endless();
        expectation.position = reader.Position();
    }
    return expectations;
}

std::string CompareValue(std::istream& stream, const Expectation& expected) {
    JsonValue value;
    ReadValue(stream, value);
    if (expected.endless) {
        return stream.bad() ? "" : "the endless read has ended";
    }
    if (stream.bad()) {
        return "the stream is bad";
    }
    if (stream.fail() != expected.failed) {
        return expected.failed ? "read, but should fail" : "failed, but should be read";
    }
    return SameValue(value, expected.value) ? "" : "another value";
}

// Reads as many values as are expected, but none that does not end unless the buffer ends it.
std::string CompareAll(const std::vector<Expectation>& expectations, std::streambuf& buffer,
                       std::size_t size, bool mayBeEndless) {
    std::istream stream(&buffer);
    for (const Expectation& expected : expectations) {
        if (expected.endless && !mayBeEndless) {
            return "";
        }
        std::string difference = CompareValue(stream, expected);
        if (!difference.empty() || expected.endless) {
            return difference;
        }
    }
    const std::size_t left = size - expectations.back().position;
    return RestOf(buffer).size() == left ? "" : "another number of bytes consumed";
}

}  // namespace

std::string CompareReadings(const std::string& text) {
    const std::vector<Expectation> expectations = ExpectationsOf(text);
    std::string difference;
    const auto compare = [&](const std::string& name, std::streambuf& buffer, bool mayBeEndless) {
        const std::string found = CompareAll(expectations, buffer, text.size(), mayBeEndless);
        if (!found.empty() && difference.empty()) {
            difference = name;
            difference += ": " + found;
        }
    };
    CountingBuffer counting(text, OperationLimit(text.size()));
    compare("a buffer that ends too long a read", counting, true);
    std::stringbuf whole(text);
    compare("the whole text", whole, false);
    const std::size_t size = 1 + text.size() % 7;
    PieceBuffer pieces(text, size, PutBackAcrossPieces::Yes);
    compare("pieces", pieces, false);
    PieceBuffer gonePieces(text, size, PutBackAcrossPieces::No);
    compare("pieces that are gone once read", gonePieces, false);
    return difference;
}

bool IsReadToAnEnd(const std::string& text) {
    CountingBuffer buffer(text, OperationLimit(text.size()));
    std::istream stream(&buffer);
    JsonValue value;
    ReadValue(stream, value);
    return !stream.bad();
}

}  // namespace vantor::support
