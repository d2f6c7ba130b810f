#include "chart/BarrierFlags.h"

#include <algorithm>
#include <numeric>

namespace vantor::analyze {

namespace {

bool Collide(const Flag& flag, int level, const Flag& placed) {
    if (level == placed.level) {
        return flag.x < placed.x + placed.width && placed.x < flag.x + flag.width;
    }
    // The pole of the higher one goes through the level of the lower one.
    const Flag& higher = level > placed.level ? flag : placed;
    const Flag& lower = level > placed.level ? placed : flag;
    return higher.x > lower.x && higher.x < lower.x + lower.width;
}

}  // namespace

void PlaceFlags(std::vector<Flag>& flags, int levels, double right) {
    std::vector<std::size_t> order(flags.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    std::stable_sort(order.begin(), order.end(), [&flags](std::size_t one, std::size_t other) {
        return flags[one].first != flags[other].first ? flags[one].first
                                                      : flags[one].x < flags[other].x;
    });
    std::vector<const Flag*> placed;
    for (const std::size_t index : order) {
        Flag& flag = flags[index];
        flag.level = Flag::noLevel;
        // From the highest level down: a later label finds room beneath an earlier one.
        for (int level = levels - 1; level >= 0 && flag.x + flag.width <= right; --level) {
            const bool free =
                std::none_of(placed.begin(), placed.end(), [&flag, level](const Flag* other) {
                    return Collide(flag, level, *other);
                });
            if (free) {
                flag.level = level;
                placed.push_back(&flag);
                break;
            }
        }
    }
}

}  // namespace vantor::analyze
