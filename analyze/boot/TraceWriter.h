#ifndef VANTOR_ANALYZE_BOOT_TRACEWRITER_H
#define VANTOR_ANALYZE_BOOT_TRACEWRITER_H

#include <ostream>

#include "boot/BootTimeline.h"

namespace vantor::analyze {

// Writes the boot in the Trace Event Format, which Perfetto and Chromium's tracing page open: a
// slice for each plugin, on the lanes of AssignLanes(); an arrow to each plugin from the one that
// released it; a mark for each barrier that some plugin waited for. One event a line, so that
// memory does not grow with their number. Bytes of a name that are no UTF-8 are replaced.
void WriteTrace(const BootTimeline& timeline, std::ostream& stream);

}  // namespace vantor::analyze

#endif
