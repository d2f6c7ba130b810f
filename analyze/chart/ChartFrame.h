#ifndef VANTOR_ANALYZE_CHART_CHARTFRAME_H
#define VANTOR_ANALYZE_CHART_CHARTFRAME_H

#include <cstddef>
#include <string>
#include <vector>

#include "boot/BootTimeline.h"
#include "boot/CriticalChain.h"
#include "boot/Lanes.h"
#include "chart/SvgText.h"
#include "chart/TimeAxis.h"

namespace vantor::analyze {

// What the panels of a chart have in common: the boot, what is computed from it, and the columns of
// the drawing: names on the left, the time axis, figures on the right.
struct ChartFrame {
    // The timeline outlives the frame.
    explicit ChartFrame(const BootTimeline& timeline);

    static constexpr double width = 1200;
    static constexpr double margin = 16;

    const BootTimeline& timeline;
    Lanes lanes;
    std::vector<ChainLink> chain;
    std::vector<bool> onChain;  // of each entry
    std::size_t nameColumns;    // to which longer names are shortened
    TimeAxis axis;

    // The lines of an entry's tooltip: its name and all figures.
    std::vector<std::string> Tooltip(std::size_t entry) const;
};

// Draws the vertical lines of a time axis, and its labels.
void DrawGrid(SvgText& svg, const TimeAxis& axis, double top, double bottom);
void DrawTickLabels(SvgText& svg, const TimeAxis& axis, double baseline);

}  // namespace vantor::analyze

#endif
