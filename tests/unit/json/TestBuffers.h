#ifndef VANTOR_JSON_TESTS_TESTBUFFERS_H
#define VANTOR_JSON_TESTS_TESTBUFFERS_H

#include <cstddef>
#include <cstdint>
#include <limits>
#include <streambuf>
#include <string>

namespace vantor::support {

// What is left in a buffer: from the next byte to the end. Consumes it.
std::string RestOf(std::streambuf& buffer);

// A buffer without a get area, so that every byte a reader looks at, consumes or puts back is an
// operation of its own and counted. Once `limit` operations have been made it throws.
class CountingBuffer : public std::streambuf {
public:
    static constexpr std::uint64_t noLimit = std::numeric_limits<std::uint64_t>::max();

    explicit CountingBuffer(std::string content, std::uint64_t operationLimit = noLimit)
        : bytes(std::move(content)), limit(operationLimit) {}

    std::uint64_t Operations() const { return operations; }
    // Bytes consumed so far.
    std::size_t Position() const { return position; }
    // From now on nothing throws.
    void EndLimit() { limit = noLimit; }

protected:
    int_type underflow() override;
    int_type uflow() override;
    int_type pbackfail(int_type byte) override;
    std::streamsize xsgetn(char* out, std::streamsize count) override;

private:
    void Count();

    std::string bytes;
    std::uint64_t limit;
    std::uint64_t operations = 0;
    std::size_t position = 0;
};

// Whether a byte can be put back that stood in the piece before.
enum class PutBackAcrossPieces { Yes, No };

// A buffer whose get area holds no more than a piece of so many bytes at a time. Each piece lies in
// storage of its own, so that a pointer kept beyond a refill is found by an address checker.
class PieceBuffer : public std::streambuf {
public:
    PieceBuffer(std::string content, std::size_t size, PutBackAcrossPieces across)
        : bytes(std::move(content)), pieceSize(size), putBack(across) {}

protected:
    int_type underflow() override;
    int_type pbackfail(int_type byte) override;

private:
    void Load(std::size_t from);

    std::string bytes;
    std::size_t pieceSize;
    PutBackAcrossPieces putBack;
    std::size_t pieceStart = 0;
    std::string piece;
};

}  // namespace vantor::support

#endif
