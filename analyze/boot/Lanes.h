#ifndef VANTOR_ANALYZE_BOOT_LANES_H
#define VANTOR_ANALYZE_BOOT_LANES_H

#include <cstddef>
#include <vector>

#include "boot/BootTimeline.h"

namespace vantor::analyze {

// The entries laid out so that no two that ran at once share a lane. The log does not tell which
// worker ran what; this is an order in which they may have.
struct Lanes {
    std::vector<std::size_t> lane;  // of each entry, counted from 0
    std::size_t count = 0;          // as many as ran at once at most
};

// In the order of their starts, each entry takes the lane that became free last before its start,
// as a worker does that goes on to the next plugin. n log n.
Lanes AssignLanes(const BootTimeline& timeline);

}  // namespace vantor::analyze

#endif
