#include "chart/ChartFrame.h"

#include <fmt/format.h>

#include <algorithm>

#include "chart/MarkupText.h"
#include "chart/TimeText.h"

namespace vantor::analyze {

namespace {

constexpr std::size_t axisTicks = 11;
constexpr double figuresWidth = 84;

std::vector<bool> Marked(const std::vector<ChainLink>& chain, std::size_t entries) {
    std::vector<bool> marked(entries);
    for (const ChainLink& link : chain) {
        marked.at(link.entry) = true;
    }
    return marked;
}

std::size_t LongestName(const BootTimeline& timeline) {
    constexpr std::size_t least = 10;
    constexpr std::size_t most = 30;
    std::size_t longest = least;
    for (const TimelineEntry& entry : timeline.entries) {
        longest = std::max(longest, Columns(Printable(entry.name)));
    }
    return std::min(longest, most);
}

TimeAxis MakeAxis(const BootTimeline& timeline, std::size_t nameColumns) {
    Microseconds first = 0;
    Microseconds last = timeline.end;
    for (const TimelineEntry& entry : timeline.entries) {
        first = std::min({first, entry.start, entry.end});
        last = std::max({last, entry.start, entry.end});
    }
    const double left = 2 * ChartFrame::margin + static_cast<double>(nameColumns) * nameColumn;
    return {first, last, left, ChartFrame::width - ChartFrame::margin - figuresWidth};
}

}  // namespace

ChartFrame::ChartFrame(const BootTimeline& boot)
    : timeline(boot),
      lanes(AssignLanes(boot)),
      chain(CriticalChain(boot)),
      onChain(Marked(chain, boot.entries.size())),
      nameColumns(LongestName(boot)),
      axis(MakeAxis(boot, nameColumns)) {}

std::vector<std::string> ChartFrame::Tooltip(std::size_t index) const {
    const TimelineEntry& entry = timeline.entries.at(index);
    std::vector<std::string> lines{Printable(entry.name)};
    lines.push_back(fmt::format("ran {}, from {} to {}", ExactTime(entry.Ran()),
                                ExactTime(entry.start), ExactTime(entry.end)));
    if (entry.Ran() < 0) {
        lines.emplace_back("ended before it began: the clock was set back");
    }
    lines.push_back(
        fmt::format("waited {} for its barriers", ExactTime(entry.WaitedForBarriers())));
    if (entry.releasedBy != TimelineEntry::none) {
        const TimelineEntry& last = timeline.entries.at(entry.releasedBy);
        lines.back() += fmt::format(", last for {}, until {} had ended",
                                    Printable(entry.releasedThrough), Printable(last.name));
    }
    lines.push_back(fmt::format("waited {} for a worker", ExactTime(entry.WaitedForWorker())));
    if (onChain.at(index)) {
        lines.emplace_back("on the critical chain");
    }
    return lines;
}

void DrawGrid(SvgText& svg, const TimeAxis& axis, double top, double bottom) {
    std::string lines;
    for (const Tick& tick : axis.Ticks(axisTicks)) {
        lines += fmt::format("M{} {}V{}", Coordinate(tick.x), Coordinate(top), Coordinate(bottom));
    }
    svg.Path("grid", lines);
}

void DrawTickLabels(SvgText& svg, const TimeAxis& axis, double baseline) {
    for (const Tick& tick : axis.Ticks(axisTicks)) {
        svg.Text("tick", tick.x, baseline, Anchor::Middle, tick.label);
    }
}

}  // namespace vantor::analyze
