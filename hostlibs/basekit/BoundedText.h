#ifndef VANTOR_BASEKIT_BOUNDEDTEXT_H
#define VANTOR_BASEKIT_BOUNDEDTEXT_H

#include <cstddef>
#include <string>
#include <string_view>

namespace BaseKit::impl {

// Keeps what a program writes, in bounded memory: all of it up to headLimit + tailLimit bytes, and
// of more the first headLimit and the last tailLimit bytes. Used by one thread.
class BoundedText {
public:
    BoundedText(std::size_t headLimitArg, std::size_t tailLimitArg)
        : headLimit(headLimitArg), tailLimit(tailLimitArg) {}

    void Append(std::string_view text);

    // How many bytes are left out between the first and the last.
    std::size_t LeftOut() const;

    // What is kept, with "[N bytes left out]" on a line of its own where bytes are missing.
    std::string Text() const;

private:
    const std::size_t headLimit;
    const std::size_t tailLimit;
    std::string head;
    std::string tail;             // up to twice tailLimit, so that it is not moved at every byte
    std::size_t tailLeftOut = 0;  // bytes that stood before `tail` and are gone
};

}  // namespace BaseKit::impl

#endif
