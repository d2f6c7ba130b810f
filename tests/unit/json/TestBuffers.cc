#include "json/TestBuffers.h"

#include <algorithm>
#include <stdexcept>
#include <utility>

namespace vantor::support {

std::string RestOf(std::streambuf& buffer) {
    std::string rest;
    int byte = 0;
    while ((byte = buffer.sbumpc()) != std::streambuf::traits_type::eof()) {
        rest += std::streambuf::traits_type::to_char_type(byte);
    }
    return rest;
}

void CountingBuffer::Count() {
    if (operations == limit) {
        throw std::runtime_error("the buffer has made its last operation");
    }
    ++operations;
}

CountingBuffer::int_type CountingBuffer::underflow() {
    Count();
    return position < bytes.size() ? traits_type::to_int_type(bytes[position]) : traits_type::eof();
}

CountingBuffer::int_type CountingBuffer::uflow() {
    const int_type byte = CountingBuffer::underflow();
    if (byte != traits_type::eof()) {
        ++position;
    }
    return byte;
}

CountingBuffer::int_type CountingBuffer::pbackfail(int_type byte) {
    Count();
    if (position == 0) {
        return traits_type::eof();
    }
    --position;
    const int_type back = traits_type::to_int_type(bytes[position]);
    return byte == traits_type::eof() || byte == back ? back : traits_type::eof();
}

// As many operations as it is given bytes, and one for finding the end.
std::streamsize CountingBuffer::xsgetn(char* out, std::streamsize count) {
    std::streamsize done = 0;
    while (done < count) {
        const int_type byte = CountingBuffer::uflow();
        if (byte == traits_type::eof()) {
            break;
        }
        out[done] = traits_type::to_char_type(byte);
        ++done;
    }
    return done;
}

void PieceBuffer::Load(std::size_t from) {
    std::string next = bytes.substr(from, pieceSize);
    next.shrink_to_fit();
    piece.swap(next);
    pieceStart = from;
    setg(piece.data(), piece.data(), piece.data() + piece.size());
}

PieceBuffer::int_type PieceBuffer::underflow() {
    const std::size_t next = pieceStart + piece.size();
    if (next >= bytes.size()) {
        return traits_type::eof();
    }
    Load(next);
    return traits_type::to_int_type(piece.front());
}

PieceBuffer::int_type PieceBuffer::pbackfail(int_type byte) {
    if (byte != traits_type::eof() || putBack == PutBackAcrossPieces::No || pieceStart == 0) {
        return traits_type::eof();
    }
    Load(pieceStart - std::min(pieceStart, pieceSize));
    setg(eback(), egptr() - 1, egptr());
    return traits_type::to_int_type(piece.back());
}

}  // namespace vantor::support
