#include "basekit/BoundedText.h"

#include <algorithm>

namespace BaseKit::impl {

void BoundedText::Append(std::string_view text) {
    const std::size_t toHead = std::min(text.size(), headLimit - head.size());
    head.append(text.substr(0, toHead));
    text.remove_prefix(toHead);

    if (text.size() > tailLimit) {
        tailLeftOut += tail.size() + text.size() - tailLimit;
        tail.clear();
        text.remove_prefix(text.size() - tailLimit);
    } else if (tail.size() + text.size() > 2 * tailLimit) {
        const std::size_t surplus = tail.size() + text.size() - tailLimit;
        tail.erase(0, surplus);
        tailLeftOut += surplus;
    }
    tail.append(text);
}

std::size_t BoundedText::LeftOut() const {
    return tailLeftOut + (tail.size() > tailLimit ? tail.size() - tailLimit : 0);
}

std::string BoundedText::Text() const {
    const std::size_t leftOut = LeftOut();
    if (leftOut == 0) {
        return head + tail;
    }
    const std::string note = "\n[" + std::to_string(leftOut) + " bytes left out]\n";
    return head + note + tail.substr(tail.size() - std::min(tail.size(), tailLimit));
}

}  // namespace BaseKit::impl
