#include "boot/CriticalChain.h"

#include <algorithm>
#include <numeric>
#include <tuple>
#include <utility>

namespace vantor::analyze {

namespace {

// The spans of time in which every worker ran a plugin.
class BusySpans {
public:
    explicit BusySpans(const BootTimeline& timeline) {
        std::vector<std::pair<Microseconds, int>> changes;
        changes.reserve(timeline.entries.size() * 2);
        for (const TimelineEntry& entry : timeline.entries) {
            if (entry.Ran() > 0) {
                changes.emplace_back(entry.start, 1);
                changes.emplace_back(entry.end, -1);
            }
        }
        std::sort(changes.begin(), changes.end());  // ends before starts of the same moment
        std::size_t running = 0;
        for (const auto& [moment, change] : changes) {
            if (change < 0 && running == timeline.workers) {
                spans.back().second = moment;
            }
            running = change < 0 ? running - 1 : running + 1;
            if (change > 0 && running == timeline.workers) {
                spans.emplace_back(moment, moment);
            }
        }
    }

    // Whether any of them meets the time from `from` up to `to`.
    bool Meet(Microseconds from, Microseconds to) const {
        auto next = std::lower_bound(spans.begin(), spans.end(), std::make_pair(to, to));
        return next != spans.begin() && std::prev(next)->second > from;
    }

private:
    std::vector<std::pair<Microseconds, Microseconds>> spans;  // ascending, apart from each other
};

// The entries by the moment of their end, and the last of them to end before a moment.
class Ends {
public:
    explicit Ends(const std::vector<TimelineEntry>& all) : entries(all), order(all.size()) {
        std::iota(order.begin(), order.end(), std::size_t{0});
        std::sort(order.begin(), order.end(), [this](std::size_t left, std::size_t right) {
            return std::tie(entries[left].end, entries[left].start, left) <
                   std::tie(entries[right].end, entries[right].start, right);
        });
    }

    // The one that ended last, but not after `moment`; none when there is none.
    std::size_t LastBefore(Microseconds moment) const {
        const auto next = std::upper_bound(
            order.begin(), order.end(), moment,
            [this](Microseconds limit, std::size_t entry) { return limit < entries[entry].end; });
        return next == order.begin() ? TimelineEntry::none : *std::prev(next);
    }

    std::size_t Last() const { return order.empty() ? TimelineEntry::none : order.back(); }

private:
    const std::vector<TimelineEntry>& entries;
    std::vector<std::size_t> order;
};

}  // namespace

std::vector<Release> FindReleases(const BootTimeline& timeline) {
    const BusySpans busy(timeline);
    const Ends ends(timeline.entries);
    std::vector<Release> releases(timeline.entries.size());
    for (std::size_t index = 0; index < timeline.entries.size(); ++index) {
        const TimelineEntry& entry = timeline.entries[index];
        const std::size_t before = ends.LastBefore(entry.start);
        // With a worker idle all the while, what lies between is the time it takes to wake one up.
        if (before != TimelineEntry::none && timeline.entries[before].end > entry.released &&
            before != index && busy.Meet(entry.released, entry.start)) {
            releases[index] = {ReleaseCause::Worker, before};
        } else if (entry.releasedBy != TimelineEntry::none) {
            releases[index] = {ReleaseCause::Barrier, entry.releasedBy};
        }
    }
    return releases;
}

std::vector<ChainLink> CriticalChain(const BootTimeline& timeline,
                                     const std::vector<Release>& releases) {
    std::vector<ChainLink> chain;
    // Runs of no length at one moment may have released each other.
    std::vector<bool> passed(timeline.entries.size());
    std::size_t entry = Ends(timeline.entries).Last();
    while (entry != TimelineEntry::none && !passed[entry]) {
        passed[entry] = true;
        chain.push_back({entry, releases[entry]});
        entry = releases[entry].by;
    }
    if (!chain.empty() && entry != TimelineEntry::none) {
        chain.back().release = {};
    }
    std::reverse(chain.begin(), chain.end());
    return chain;
}

std::vector<ChainLink> CriticalChain(const BootTimeline& timeline) {
    return CriticalChain(timeline, FindReleases(timeline));
}

}  // namespace vantor::analyze
