#include "chart/LanePanel.h"

#include <fmt/format.h>

#include <algorithm>
#include <cmath>
#include <set>
#include <string>
#include <vector>

#include "chart/BarrierFlags.h"
#include "chart/MarkupText.h"
#include "chart/TimeText.h"

namespace vantor::analyze {

namespace {

constexpr int flagLevels = 3;
constexpr double levelHeight = 14;
constexpr double flagsHeight = flagLevels * levelHeight + 12;
constexpr double axisHeight = 24;
constexpr std::size_t flagColumns = 24;
constexpr double leastBar = 1;
constexpr double leastOutlined = 5;    // narrower bars would be all outline
constexpr std::size_t mostPoles = 40;  // with more barriers only those that are named have one

// With lanes for the eight workers there are as many as fit a screen; more of them only come of a
// log whose times overlap in a way that no boot's can.
double LaneHeight(const ChartFrame& frame) {
    return std::clamp(416.0 / static_cast<double>(std::max<std::size_t>(frame.lanes.count, 1)), 6.0,
                      26.0);
}

double LanesHeight(const ChartFrame& frame) {
    return LaneHeight(frame) * static_cast<double>(std::max<std::size_t>(frame.lanes.count, 1));
}

// How much of the boot a lane was busy for, in per cent.
std::vector<int> Busy(const ChartFrame& frame) {
    std::vector<double> busy(frame.lanes.count);
    for (std::size_t i = 0; i < frame.lanes.lane.size(); ++i) {
        const Microseconds ran = frame.timeline.entries[i].Ran();
        busy.at(frame.lanes.lane[i]) += static_cast<double>(std::max<Microseconds>(ran, 0));
    }
    std::vector<int> percent;
    for (const double time : busy) {
        const double whole = static_cast<double>(std::max<Microseconds>(frame.timeline.end, 1));
        percent.push_back(static_cast<int>(std::lround(std::clamp(time / whole, 0.0, 1.0) * 100)));
    }
    return percent;
}

void DrawLaneFloors(SvgText& svg, const ChartFrame& frame, double top) {
    const double height = LaneHeight(frame);
    const double length = frame.axis.Right() - frame.axis.Left();
    const std::vector<int> busy = Busy(frame);
    for (std::size_t lane = 0; lane < frame.lanes.count; ++lane) {
        const double y = top + height * static_cast<double>(lane);
        svg.Rect("lane", frame.axis.Left(), y + 1, length, height - 2);
        if (height < 14) {
            continue;  // no room for words
        }
        const double baseline = y + height / 2 + 4;
        svg.Text("quiet", frame.axis.Left() - 8, baseline, Anchor::End,
                 fmt::format("worker {}", lane + 1));
        svg.Text("figure", ChartFrame::width - ChartFrame::margin, baseline, Anchor::End,
                 fmt::format("busy {} %", busy[lane]));
    }
}

// The time before the first plugin was started.
void DrawLoading(SvgText& svg, const ChartFrame& frame, double top) {
    constexpr double leastForWord = 60;
    const std::vector<TimelineEntry>& entries = frame.timeline.entries;
    const double begin = frame.axis.X(0);
    const double end = entries.empty() ? begin : frame.axis.X(entries.front().requested);
    if (end <= begin) {
        return;
    }
    svg.OpenGroup("before",
                  {"before the first plugin was started", ExactTime(entries.front().requested)});
    svg.Rect("loading", begin, top, end - begin, LanesHeight(frame));
    if (end - begin >= leastForWord) {
        svg.Text("quiet", (begin + end) / 2, top + LanesHeight(frame) / 2 + 4, Anchor::Middle,
                 "loading");
    }
    svg.CloseGroup();
}

void DrawBar(SvgText& svg, const ChartFrame& frame, double top, std::size_t index) {
    const TimelineEntry& entry = frame.timeline.entries[index];
    const double height = LaneHeight(frame);
    const double y = top + height * static_cast<double>(frame.lanes.lane[index]);
    const double gap = height < 14 ? 1 : 3;
    const Span span = frame.axis.Between(entry.start, entry.end, leastBar);
    svg.OpenGroup(frame.onChain[index] ? "run chain" : "run", frame.Tooltip(index));
    svg.Rect(span.width < leastOutlined ? "bar thin" : "bar", span.x, y + gap, span.width,
             height - 2 * gap);
    svg.CloseGroup();
}

// The name within the bar, if it fits there.
void DrawBarName(SvgText& svg, const ChartFrame& frame, double top, std::size_t index) {
    const TimelineEntry& entry = frame.timeline.entries[index];
    const double height = LaneHeight(frame);
    const Span span = frame.axis.Between(entry.start, entry.end, leastBar);
    const std::string name = Printable(entry.name);
    if (height >= 14 && span.width >= NameWidth(name) + 8) {
        const double middle = height * (static_cast<double>(frame.lanes.lane[index]) + 0.5);
        svg.Name(frame.onChain[index] ? "inside on-chain" : "inside", span.x + span.width / 2,
                 top + middle + 4, Anchor::Middle, name);
    }
}

// Names in a row, the first few of them.
std::string Names(const ChartFrame& frame, const std::vector<std::size_t>& entries) {
    constexpr std::size_t most = 8;
    std::string names;
    for (std::size_t i = 0; i < std::min(entries.size(), most); ++i) {
        names += (i == 0 ? "" : ", ") + Printable(frame.timeline.entries.at(entries[i]).name);
    }
    if (names.empty()) {
        return "nobody";
    }
    return entries.size() > most ? fmt::format("{} and {} more", names, entries.size() - most)
                                 : names;
}

// The barriers through which one link of the critical chain released the next.
std::set<std::string> ChainBarriers(const ChartFrame& frame) {
    std::set<std::string> names;
    for (const ChainLink& link : frame.chain) {
        if (link.release.cause == ReleaseCause::Barrier) {
            names.insert(frame.timeline.entries.at(link.entry).releasedThrough);
        }
    }
    return names;
}

void DrawBarrier(SvgText& svg, const ChartFrame& frame, const TimelineBarrier& barrier,
                 const Flag& flag, bool hasPole, double lanesTop) {
    const double marks = lanesTop - 5;
    double poleTop = marks;
    svg.OpenGroup(flag.first ? "barrier chain" : "barrier",
                  {fmt::format("barrier {}", Printable(barrier.name)),
                   fmt::format("reached at {}", ExactTime(barrier.done)),
                   fmt::format("provided by {}", Names(frame, barrier.providers)),
                   fmt::format("required by {}", Names(frame, barrier.requirers))});
    if (flag.level != Flag::noLevel) {
        const double baseline = lanesTop - 14 - levelHeight * flag.level;
        poleTop = baseline - 9;
        svg.Name("flag", flag.x + 4, baseline, Anchor::Start,
                 Shortened(Printable(barrier.name), flagColumns));
    }
    svg.Line("pole", flag.x, poleTop, flag.x, lanesTop + (hasPole ? LanesHeight(frame) : 0));
    svg.Path("mark",
             fmt::format("M{} {}l4 4l-4 4l-4 -4z", Coordinate(flag.x), Coordinate(marks - 4)));
    svg.CloseGroup();
}

void DrawBarriers(SvgText& svg, const ChartFrame& frame, double lanesTop) {
    const std::set<std::string> chain = ChainBarriers(frame);
    std::vector<const TimelineBarrier*> barriers;
    std::vector<Flag> flags;
    for (const TimelineBarrier& barrier : frame.timeline.barriers) {
        if (barrier.providers.empty()) {
            continue;  // never reached by anybody's work
        }
        const std::string label = Shortened(Printable(barrier.name), flagColumns);
        barriers.push_back(&barrier);
        flags.push_back({frame.axis.X(barrier.done), NameWidth(label) + 10,
                         chain.count(barrier.name) != 0, Flag::noLevel});
    }
    PlaceFlags(flags, flagLevels, ChartFrame::width);
    for (std::size_t i = 0; i < barriers.size(); ++i) {
        const bool hasPole =
            flags[i].first || flags[i].level != Flag::noLevel || flags.size() <= mostPoles;
        DrawBarrier(svg, frame, *barriers[i], flags[i], hasPole, lanesTop);
    }
}

// The critical chain's way from lane to lane.
void DrawLinks(SvgText& svg, const ChartFrame& frame, double top) {
    const double height = LaneHeight(frame);
    std::string path;
    for (std::size_t i = 1; i < frame.chain.size(); ++i) {
        const std::size_t from = frame.chain[i - 1].entry;
        const std::size_t to = frame.chain[i].entry;
        const auto middle = [&](std::size_t entry) {
            return top + height * (static_cast<double>(frame.lanes.lane.at(entry)) + 0.5);
        };
        path += fmt::format(
            "M{} {}L{} {}", Coordinate(frame.axis.X(frame.timeline.entries[from].end)),
            Coordinate(middle(from)), Coordinate(frame.axis.X(frame.timeline.entries[to].start)),
            Coordinate(middle(to)));
    }
    if (!path.empty()) {
        svg.Path("link", path);
    }
}

}  // namespace

double LanePanelHeight(const ChartFrame& frame) {
    return flagsHeight + LanesHeight(frame) + axisHeight;
}

void DrawLanePanel(SvgText& svg, const ChartFrame& frame, double top) {
    const double lanesTop = top + flagsHeight;
    const double lanesBottom = lanesTop + LanesHeight(frame);
    DrawLaneFloors(svg, frame, lanesTop);
    DrawGrid(svg, frame.axis, lanesTop, lanesBottom + 4);
    DrawLoading(svg, frame, lanesTop);
    for (const bool chain : {false, true}) {
        for (std::size_t i = 0; i < frame.timeline.entries.size(); ++i) {
            if (frame.onChain[i] == chain) {
                DrawBar(svg, frame, lanesTop, i);
            }
        }
        if (!chain) {
            DrawLinks(svg, frame, lanesTop);
        }
    }
    DrawBarriers(svg, frame, lanesTop);
    svg.Raw("<g class=\"names\">");
    for (std::size_t i = 0; i < frame.timeline.entries.size(); ++i) {
        DrawBarName(svg, frame, lanesTop, i);
    }
    svg.Raw("</g>\n");
    DrawTickLabels(svg, frame.axis, lanesBottom + 16);
}

}  // namespace vantor::analyze
