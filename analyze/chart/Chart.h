#ifndef VANTOR_ANALYZE_CHART_CHART_H
#define VANTOR_ANALYZE_CHART_CHART_H

#include <string>

#include "boot/BootTimeline.h"

namespace vantor::analyze {

// The picture of a boot that has taken place, as text. Above, a lane for each worker with the
// plugins that it ran and the barriers as vertical marks; below, a row for each plugin with its
// waits. What belongs to the critical chain is marked; every bar and mark has a tooltip with its
// figures.
//
// The result needs no other file, no font and no script. It is well-formed whatever bytes the names
// hold and however the clock was set, and the same for the same timeline. `source` says where the
// timeline comes from, for whoever looks at the picture.
std::string ChartAsSvg(const BootTimeline& timeline, const std::string& source);

// The same within a page, which also shows the timeline's remarks.
std::string ChartAsHtml(const BootTimeline& timeline, const std::string& source);

}  // namespace vantor::analyze

#endif
