#include "boot/Blame.h"

#include <algorithm>
#include <numeric>
#include <tuple>

#include "boot/CriticalChain.h"
#include "boot/FlowGraph.h"

namespace vantor::analyze {

namespace {

// The entries in an order in which each stands behind those that released it. Of runs of no length
// at one moment the graph knows which came first.
std::vector<std::size_t> OrderOfRuns(const BootTimeline& timeline, const FlowGraph& graph) {
    std::vector<std::size_t> place(timeline.entries.size());
    for (std::size_t index = 0; index < graph.Order().size(); ++index) {
        if (graph.Order()[index] < place.size()) {
            place[graph.Order()[index]] = index;
        }
    }
    std::vector<std::size_t> order(timeline.entries.size());
    std::iota(order.begin(), order.end(), std::size_t{0});
    std::sort(order.begin(), order.end(), [&](std::size_t left, std::size_t right) {
        const TimelineEntry& a = timeline.entries[left];
        const TimelineEntry& b = timeline.entries[right];
        return std::tie(a.start, a.end, place[left]) < std::tie(b.start, b.end, place[right]);
    });
    return order;
}

// For each entry the latest moment at which it could have ended.
std::vector<Microseconds> LatestEnds(const BootTimeline& timeline, const FlowGraph& graph) {
    const std::vector<Release> releases = FindReleases(timeline);
    const std::vector<std::size_t> order = OrderOfRuns(timeline, graph);
    Microseconds last = 0;
    for (const TimelineEntry& entry : timeline.entries) {
        last = std::max(last, entry.end);
    }
    std::vector<Microseconds> latest(timeline.entries.size(), last);
    std::vector<Microseconds> latestDone(timeline.barriers.size(), last);
    for (auto index = order.rbegin(); index != order.rend(); ++index) {
        const TimelineEntry& entry = timeline.entries[*index];
        for (const std::size_t barrier : entry.provided) {
            latest[*index] = std::min(latest[*index], latestDone[barrier]);
        }
        const Microseconds latestStart = latest[*index] - entry.Ran();
        for (const std::size_t barrier : entry.required) {
            // What the plugin did not wait for, though it should have, did not release it.
            if (timeline.barriers[barrier].done <= entry.start) {
                latestDone[barrier] = std::min(latestDone[barrier], latestStart);
            }
        }
        if (releases[*index].cause == ReleaseCause::Worker) {
            Microseconds& before = latest[releases[*index].by];
            before = std::min(before, latestStart);
        }
    }
    return latest;
}

}  // namespace

std::vector<BlameRow> Blame(const BootTimeline& timeline) {
    const FlowGraph graph(timeline);
    std::vector<Microseconds> runs;
    runs.reserve(timeline.entries.size());
    for (const TimelineEntry& entry : timeline.entries) {
        runs.push_back(entry.Ran());
    }
    const std::vector<Microseconds> paths = graph.LongestPathsWithout(runs);
    const std::vector<Microseconds> latest = LatestEnds(timeline, graph);
    const Microseconds makespan = timeline.Makespan();
    const Microseconds work = timeline.Work();
    const auto workers = static_cast<Microseconds>(timeline.workers);

    std::vector<BlameRow> rows;
    rows.reserve(runs.size());
    for (std::size_t entry = 0; entry < runs.size(); ++entry) {
        const Microseconds spread = (work - runs[entry] + workers - 1) / workers;
        const Microseconds bound = makespan - std::max(paths[entry], spread);
        rows.push_back(
            {entry, latest[entry] - timeline.entries[entry].end, std::max(bound, Microseconds{0})});
    }
    std::sort(rows.begin(), rows.end(), [&timeline](const BlameRow& left, const BlameRow& right) {
        return std::tie(right.savesAtMost, timeline.entries[left.entry].name, left.entry) <
               std::tie(left.savesAtMost, timeline.entries[right.entry].name, right.entry);
    });
    return rows;
}

}  // namespace vantor::analyze
