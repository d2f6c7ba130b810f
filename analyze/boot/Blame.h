#ifndef VANTOR_ANALYZE_BOOT_BLAME_H
#define VANTOR_ANALYZE_BOOT_BLAME_H

#include <cstddef>
#include <vector>

#include "boot/BootTimeline.h"

namespace vantor::analyze {

// What a plugin's run meant for the length of a boot.
struct BlameRow {
    std::size_t entry = 0;
    // So much longer it could have run without the last plugin ending later, every plugin being
    // released by the end of the same ones as it was, workers that had to be waited for included.
    Microseconds slack = 0;
    // No more than this would have been saved, in whatever order, had the plugin taken no time: the
    // makespan less the greater of the longest chain of runs that would be left and the work that
    // would be left, spread evenly over all workers.
    Microseconds savesAtMost = 0;
};

// A row for each entry: by what it saves at most, greatest first, then by name, then in the order
// of the log. n log n. Throws std::runtime_error when the plugins wait for each other in a circle.
std::vector<BlameRow> Blame(const BootTimeline& timeline);

}  // namespace vantor::analyze

#endif
