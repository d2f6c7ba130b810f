#ifndef VANTOR_ANALYZE_BOOT_COMPARISON_H
#define VANTOR_ANALYZE_BOOT_COMPARISON_H

#include <cstddef>
#include <string>
#include <vector>

#include "boot/BootLog.h"

namespace vantor::analyze {

// From when on a difference is one. Both sides are a number of boots; the spread of a side is the
// difference between its greatest and its least value. The medians of the two sides differ when
// they are further apart than
//   - `least`,
//   - the spread of either side, and
//   - where a side has but one value, and so no spread, `margin` of the old median.
struct NoiseRule {
    Microseconds least = 5000;
    double margin = 0.1;
};

// One quantity on both sides.
struct Change {
    Microseconds before = 0;  // medians; of an even number the mean of the two in the middle
    Microseconds after = 0;
    Microseconds beforeSpread = 0;
    Microseconds afterSpread = 0;
    Microseconds noise = 0;  // a greater difference is none by chance

    Microseconds Difference() const { return after - before; }
    bool IsSlower() const { return Difference() > noise; }
    bool IsFaster() const { return -Difference() > noise; }

    // Growth in parts of the old value; infinite for any growth from nothing.
    double Growth() const;
};

// Both sides have at least one value, none of them negative.
Change CompareValues(std::vector<Microseconds> before, std::vector<Microseconds> after,
                     const NoiseRule& rule);

struct PluginChange {
    std::string name;
    Change run;
};

// What differs between two sets of boots. Of plugins of one name in a log the first is compared
// with the first, and so on; from the second on " (2)" and so on is behind their names. Names
// ascend by their bytes in every list but the two of changes, in which the greatest change comes
// first.
struct Comparison {
    std::size_t boots[2] = {0, 0};
    Change total;                      // of the whole run, from its start to its end
    std::vector<std::string> added;    // in a new log, in no old one
    std::vector<std::string> removed;  // in an old log, in no new one
    std::vector<std::string> nowRun;   // listed by old logs, but not run then
    std::vector<std::string> noLongerRun;
    std::vector<PluginChange> slower;
    std::vector<PluginChange> faster;
    std::size_t unchanged = 0;  // run on both sides, and differing by no more than noise
};

// Both sides have at least one log.
Comparison CompareBoots(const std::vector<BootLog>& before, const std::vector<BootLog>& after,
                        const NoiseRule& rule);

// The place of the boot whose total is the median of the side, of an even number the shorter of the
// two in the middle.
std::size_t MedianBoot(const std::vector<BootLog>& boots);

}  // namespace vantor::analyze

#endif
