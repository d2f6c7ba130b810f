#include "boot/Lanes.h"

#include <algorithm>
#include <iterator>
#include <numeric>
#include <set>
#include <tuple>
#include <utility>

namespace vantor::analyze {

Lanes AssignLanes(const BootTimeline& timeline) {
    const std::vector<TimelineEntry>& entries = timeline.entries;
    std::vector<std::size_t> order(entries.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    std::sort(order.begin(), order.end(), [&entries](std::size_t left, std::size_t right) {
        return std::tie(entries[left].start, entries[left].end, left) <
               std::tie(entries[right].start, entries[right].end, right);
    });

    Lanes lanes;
    lanes.lane.resize(entries.size());
    // The lanes by the moment from which they are free, counted from the other end: of those that
    // became free at once the lowest is the last, which is taken.
    std::set<std::pair<Microseconds, std::size_t>> free;
    for (const std::size_t entry : order) {
        auto found = free.upper_bound({entries[entry].start, entries.size()});
        std::size_t lane = lanes.count;
        if (found == free.begin()) {
            ++lanes.count;
        } else {
            --found;
            lane = entries.size() - found->second;
            free.erase(found);
        }
        lanes.lane[entry] = lane;
        free.emplace(entries[entry].end, entries.size() - lane);
    }
    return lanes;
}

}  // namespace vantor::analyze
