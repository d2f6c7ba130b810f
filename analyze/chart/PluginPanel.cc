#include "chart/PluginPanel.h"

#include <fmt/format.h>

#include <algorithm>
#include <numeric>
#include <tuple>

#include "chart/MarkupText.h"
#include "chart/TimeText.h"

namespace vantor::analyze {

namespace {

constexpr double rowHeight = 16;
constexpr double barHeight = 10;
constexpr double panelHeadHeight = 20;
constexpr double blockAxisHeight = 24;
constexpr std::size_t mostRowsOfOneBlock = 100;
constexpr std::size_t rowsOfBlock = 40;
constexpr double leastRowBar = 1.5;
constexpr double leastWait = 0.5;  // what is shorter on the paper is not drawn

std::vector<std::size_t> InOrderOfStart(const BootTimeline& timeline) {
    std::vector<std::size_t> order(timeline.entries.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    std::sort(order.begin(), order.end(), [&timeline](std::size_t one, std::size_t other) {
        const TimelineEntry& first = timeline.entries[one];
        const TimelineEntry& second = timeline.entries[other];
        return std::tie(first.start, first.end, one) < std::tie(second.start, second.end, other);
    });
    return order;
}

double RowsHeight(std::size_t rows) { return rowHeight * static_cast<double>(rows); }

}  // namespace

PluginPanel::PluginPanel(const ChartFrame& chartFrame, double top)
    : frame(chartFrame), panelTop(top), order(InOrderOfStart(chartFrame.timeline)) {
    const std::size_t step = order.size() <= mostRowsOfOneBlock ? mostRowsOfOneBlock : rowsOfBlock;
    double blockTop = panelTop + panelHeadHeight;
    for (std::size_t begin = 0; begin < order.size(); begin += step) {
        const std::size_t end = std::min(begin + step, order.size());
        blocks.push_back({begin, end, BlockAxis(begin, end), blockTop});
        blockTop += RowsHeight(end - begin) + blockAxisHeight;
    }
}

// From the first start to the last end, but for the few that go on for long: those are cut, rather
// than all others squeezed.
TimeAxis PluginPanel::BlockAxis(std::size_t begin, std::size_t end) const {
    if (order.size() <= mostRowsOfOneBlock) {
        return frame.axis;
    }
    const std::vector<TimelineEntry>& entries = frame.timeline.entries;
    std::vector<Microseconds> ends;
    for (std::size_t row = begin; row < end; ++row) {
        ends.push_back(entries[order[row]].end);
    }
    std::sort(ends.begin(), ends.end());
    const Microseconds first = entries[order[begin]].start;
    // Nine in ten end by then; half as long again is allowed for the others.
    const Microseconds most =
        std::max(ends[(ends.size() - 1) * 9 / 10], entries[order[end - 1]].start);
    const Microseconds limit = most + (most - first) / 2;
    const auto beyond = std::upper_bound(ends.begin(), ends.end(), limit);
    const Microseconds last = std::max(beyond == ends.begin() ? first : *(beyond - 1), most);
    return {first, last, frame.axis.Left(), frame.axis.Right()};
}

double PluginPanel::Bottom() const {
    if (blocks.empty()) {
        return panelTop;
    }
    const Block& last = blocks.back();
    return last.top + RowsHeight(last.end - last.begin) + blockAxisHeight;
}

std::vector<PluginPanel::Place> PluginPanel::Places() const {
    std::vector<Place> places(order.size());
    for (const Block& block : blocks) {
        for (std::size_t row = block.begin; row < block.end; ++row) {
            places[order[row]] = {&block,
                                  block.top + RowsHeight(row - block.begin) + rowHeight / 2};
        }
    }
    return places;
}

void PluginPanel::DrawWaits(SvgText& svg, const TimeAxis& axis, const TimelineEntry& entry,
                            double middle) const {
    const double start = axis.X(entry.start);
    const double released = std::min(axis.X(entry.released), start);
    const double requested = std::min(axis.X(entry.requested), released);
    if (released - requested >= leastWait) {
        svg.Line("barrier-wait", requested, middle, released, middle);
    }
    if (start - released >= leastWait) {
        svg.Rect("worker-wait", released, middle - 3.5, start - released, 7);
    }
}

void PluginPanel::DrawRow(SvgText& svg, const Block& block, std::size_t row) const {
    const std::size_t index = order[row];
    const TimelineEntry& entry = frame.timeline.entries[index];
    const double top = block.top + RowsHeight(row - block.begin);
    const double middle = top + rowHeight / 2;
    const Span span = block.axis.Between(entry.start, entry.end, leastRowBar);
    svg.OpenGroup(frame.onChain[index] ? "plugin chain" : "plugin", frame.Tooltip(index));
    svg.Rect(row % 2 == 0 ? "row" : "row odd", ChartFrame::margin / 2, top,
             ChartFrame::width - ChartFrame::margin, rowHeight);
    svg.Name("label", block.axis.Left() - 8, middle + 4, Anchor::End,
             Shortened(Printable(entry.name), frame.nameColumns));
    DrawWaits(svg, block.axis, entry, middle);
    svg.Rect("bar", span.x, middle - barHeight / 2, span.width, barHeight);
    if (block.axis.IsBeyond(entry.end)) {
        svg.Path("more", fmt::format("M{} {}l6 {}l-6 {}z", Coordinate(block.axis.Right() + 1),
                                     Coordinate(middle - barHeight / 2), Coordinate(barHeight / 2),
                                     Coordinate(barHeight / 2)));
    }
    svg.Text("figure", ChartFrame::width - ChartFrame::margin, middle + 4, Anchor::End,
             RoundedTime(entry.Ran()));
    svg.CloseGroup();
}

// The critical chain: down from the end of each link to the row of the next, and there to its
// start; between blocks as far as the edge of one, and on from the edge of the other.
void PluginPanel::DrawLinks(SvgText& svg) const {
    const std::vector<Place> places = Places();
    std::string path;
    for (std::size_t i = 1; i < frame.chain.size(); ++i) {
        const std::size_t from = frame.chain[i - 1].entry;
        const std::size_t to = frame.chain[i].entry;
        const Block& upper = *places[from].block;
        const Block& lower = *places[to].block;
        const Microseconds end = frame.timeline.entries[from].end;
        const std::string begin =
            fmt::format("M{} {}", Coordinate(upper.axis.X(end)), Coordinate(places[from].middle));
        path += begin;
        if (&upper != &lower) {
            path += fmt::format("V{}M{} {}",
                                Coordinate(upper.top + RowsHeight(upper.end - upper.begin)),
                                Coordinate(lower.axis.X(end)), Coordinate(lower.top));
        }
        path += fmt::format("V{}H{}", Coordinate(places[to].middle),
                            Coordinate(lower.axis.X(frame.timeline.entries[to].start)));
    }
    if (!path.empty()) {
        svg.Path("link", path);
    }
}

void PluginPanel::DrawBlock(SvgText& svg, const Block& block) const {
    const double bottom = block.top + RowsHeight(block.end - block.begin);
    DrawGrid(svg, block.axis, block.top, bottom + 4);
    DrawTickLabels(svg, block.axis, bottom + 15);
}

void PluginPanel::Draw(SvgText& svg) const {
    const double head = panelTop + panelHeadHeight - 6;
    svg.Text("quiet", frame.axis.Left() - 8, head, Anchor::End, "plugin");
    svg.Text("quiet", ChartFrame::width - ChartFrame::margin, head, Anchor::End, "ran");
    if (blocks.size() > 1) {
        svg.Text("quiet", frame.axis.Left(), head, Anchor::Start,
                 fmt::format("blocks of {} plugins, each with a time axis of its own; waits that "
                             "began earlier begin at its edge; \u25b8 ran on beyond it",
                             rowsOfBlock));
    }
    for (const Block& block : blocks) {
        DrawBlock(svg, block);
    }
    DrawLinks(svg);
    for (const Block& block : blocks) {
        for (std::size_t row = block.begin; row < block.end; ++row) {
            DrawRow(svg, block, row);
        }
    }
}

}  // namespace vantor::analyze
