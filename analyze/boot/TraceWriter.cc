#include "boot/TraceWriter.h"

#include <algorithm>
#include <nlohmann/json.hpp>
#include <string>

#include "boot/CriticalChain.h"
#include "boot/Lanes.h"

namespace vantor::analyze {

namespace {

using Json = nlohmann::ordered_json;

constexpr int process = 1;

class TraceWriter {
public:
    TraceWriter(const BootTimeline& boot, std::ostream& out)
        : timeline(boot), stream(out), lanes(AssignLanes(boot)), releases(FindReleases(boot)) {}

    void Write() {
        stream << "{\"displayTimeUnit\": \"ms\", \"traceEvents\": [";
        WriteNames();
        for (std::size_t entry = 0; entry < timeline.entries.size(); ++entry) {
            WriteSlice(entry);
            WriteArrow(entry);
        }
        for (const TimelineBarrier& barrier : timeline.barriers) {
            if (!barrier.requirers.empty()) {
                WriteMark(barrier);
            }
        }
        stream << "\n]}\n";
    }

private:
    void Put(const Json& event) {
        stream << (isFirst ? "\n" : ",\n")
               << event.dump(-1, ' ', false, Json::error_handler_t::replace);
        isFirst = false;
    }

    std::size_t Thread(std::size_t entry) const { return lanes.lane[entry] + 1; }

    void WriteNames() {
        Put({{"ph", "M"},
             {"pid", process},
             {"name", "process_name"},
             {"args", {{"name", "boot"}}}});
        for (std::size_t lane = 0; lane < lanes.count; ++lane) {
            Put({{"ph", "M"},
                 {"pid", process},
                 {"tid", lane + 1},
                 {"name", "thread_name"},
                 {"args", {{"name", "lane " + std::to_string(lane + 1)}}}});
            Put({{"ph", "M"},
                 {"pid", process},
                 {"tid", lane + 1},
                 {"name", "thread_sort_index"},
                 {"args", {{"sort_index", lane + 1}}}});
        }
    }

    void WriteSlice(std::size_t index) {
        const TimelineEntry& entry = timeline.entries[index];
        const Release& release = releases[index];
        Json details{{"waited for barriers (us)", entry.WaitedForBarriers()},
                     {"waited for a worker (us)", entry.WaitedForWorker()}};
        if (release.by != TimelineEntry::none) {
            details["released by"] = timeline.entries[release.by].name;
            if (release.cause == ReleaseCause::Barrier) {
                details["through barrier"] = entry.releasedThrough;
            }
        }
        Put({{"ph", "X"},
             {"pid", process},
             {"tid", Thread(index)},
             {"ts", entry.start},
             {"dur", entry.Ran()},
             {"name", entry.name},
             {"cat", "plugin"},
             {"args", std::move(details)}});
    }

    // An arrow begins and ends inside of slices: hence a microsecond before the end of the one.
    void WriteArrow(std::size_t index) {
        const Release& release = releases[index];
        if (release.by == TimelineEntry::none) {
            return;
        }
        const TimelineEntry& from = timeline.entries[release.by];
        const bool isBarrier = release.cause == ReleaseCause::Barrier;
        Json arrow{{"ph", "s"},
                   {"pid", process},
                   {"tid", Thread(release.by)},
                   {"ts", std::max(from.start, from.end - 1)},
                   {"id", index + 1},
                   {"name", isBarrier ? timeline.entries[index].releasedThrough : "worker"},
                   {"cat", isBarrier ? "barrier" : "worker"}};
        Put(arrow);
        arrow["ph"] = "f";
        arrow["bp"] = "e";
        arrow["tid"] = Thread(index);
        arrow["ts"] = timeline.entries[index].start;
        Put(arrow);
    }

    void WriteMark(const TimelineBarrier& barrier) {
        Put({{"ph", "i"},
             {"pid", process},
             {"tid", 0},
             {"ts", barrier.done},
             {"s", "p"},
             {"name", barrier.name},
             {"cat", "barrier"}});
    }

    const BootTimeline& timeline;
    std::ostream& stream;
    Lanes lanes;
    std::vector<Release> releases;
    bool isFirst = true;
};

}  // namespace

void WriteTrace(const BootTimeline& timeline, std::ostream& stream) {
    TraceWriter(timeline, stream).Write();
}

}  // namespace vantor::analyze
