#include "basekit/EditDistance.h"

#include <algorithm>
#include <numeric>
#include <vector>

namespace BaseKit::impl {

std::size_t EditDistance(std::string_view from, std::string_view to) {
    constexpr std::size_t lengthLimit = 256;
    from = from.substr(0, lengthLimit);
    to = to.substr(0, lengthLimit);

    // row[j]: the distance from the part of `from` that was seen so far to the first j of `to`.
    std::vector<std::size_t> row(to.size() + 1);
    std::iota(row.begin(), row.end(), std::size_t{0});
    for (const char c : from) {
        std::size_t diagonal = row[0]++;
        for (std::size_t j = 1; j < row.size(); ++j) {
            const std::size_t replaced = diagonal + (c == to[j - 1] ? 0 : 1);
            diagonal = row[j];
            row[j] = std::min({replaced, row[j] + 1, row[j - 1] + 1});
        }
    }
    return row.back();
}

}  // namespace BaseKit::impl
