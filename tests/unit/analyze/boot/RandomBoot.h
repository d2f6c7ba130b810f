#ifndef VANTOR_ANALYZE_TESTS_RANDOMBOOT_H
#define VANTOR_ANALYZE_TESTS_RANDOMBOOT_H

#include <cstddef>
#include <cstdint>

#include "boot/BootTimeline.h"

namespace vantor::support {

// A boot of `plugins` plugins without circles, the same for the same seed on every machine: some
// barriers with many plugins on either side, some that nobody requires, some plugins alone, runs of
// 0 to 1000 microseconds. Of times only the lengths of the runs mean anything.
analyze::BootTimeline MakeRandomBoot(std::uint32_t seed, std::size_t plugins);

// The makespan of the boot with so many workers: the rules of the choice written down once more, as
// plainly as they can be, at a cost that grows with the square of the plugins.
analyze::Microseconds PlainMakespan(const analyze::BootTimeline& timeline, std::size_t workers);

}  // namespace vantor::support

#endif
