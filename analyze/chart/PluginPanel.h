#ifndef VANTOR_ANALYZE_CHART_PLUGINPANEL_H
#define VANTOR_ANALYZE_CHART_PLUGINPANEL_H

#include <cstddef>
#include <string>
#include <vector>

#include "chart/ChartFrame.h"
#include "chart/SvgText.h"

namespace vantor::analyze {

// The plugins' part of a chart: a row each in the order of their starts, with what it waited for
// and how long it ran, and the critical chain as a line from row to row. As high as it must be for
// every name to be read. Up to a hundred plugins share the time axis of the whole boot; more of
// them stand in blocks, each with an axis for the time in which its plugins were started, as on the
// axis of the whole boot nearly all of them would be specks.
class PluginPanel {
public:
    // The frame outlives the panel, whose upper edge is at `top`.
    PluginPanel(const ChartFrame& frame, double top);

    double Bottom() const;
    void Draw(SvgText& svg) const;

private:
    // Rows that share an axis.
    struct Block {
        std::size_t begin = 0;  // places in `order`
        std::size_t end = 0;
        TimeAxis axis;
        double top = 0;  // of its first row
    };

    // Where an entry is drawn.
    struct Place {
        const Block* block = nullptr;
        double middle = 0;
    };

    TimeAxis BlockAxis(std::size_t begin, std::size_t end) const;
    std::vector<Place> Places() const;
    void DrawBlock(SvgText& svg, const Block& block) const;
    void DrawRow(SvgText& svg, const Block& block, std::size_t row) const;
    void DrawWaits(SvgText& svg, const TimeAxis& axis, const TimelineEntry& entry,
                   double middle) const;
    void DrawLinks(SvgText& svg) const;

    const ChartFrame& frame;
    double panelTop;
    std::vector<std::size_t> order;  // entries
    std::vector<Block> blocks;
};

}  // namespace vantor::analyze

#endif
