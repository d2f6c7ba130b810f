#ifndef VANTOR_JSON_GETAREA_H
#define VANTOR_JSON_GETAREA_H

#include <algorithm>
#include <cstddef>
#include <limits>
#include <streambuf>
#include <string_view>

namespace vantor {

// What a stream's buffer holds ready, to be looked at before it is consumed and without a copy. The
// functions that tell it are protected: only a class derived from the buffer may name them.
class GetArea : private std::streambuf {
public:
    // From the next byte on. Empty when the buffer has to be filled first, and always in a buffer
    // that holds nothing ready. Valid until the buffer is filled again or put back to.
    static std::string_view Of(const std::streambuf& buffer) {
        const char* const next = (buffer.*(&GetArea::gptr))();
        const char* const end = (buffer.*(&GetArea::egptr))();
        return {next, std::min(static_cast<std::size_t>(end - next), largestSkip)};
    }

    // Consumes so many of the bytes that Of() shows.
    static void Skip(std::streambuf& buffer, std::size_t count) {
        (buffer.*(&GetArea::gbump))(static_cast<int>(count));
    }

private:
    static constexpr std::size_t largestSkip = std::numeric_limits<int>::max();
};

}  // namespace vantor

#endif
