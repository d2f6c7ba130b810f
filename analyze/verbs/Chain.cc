#include "verbs/Chain.h"

#include <fmt/format.h>

#include <string>
#include <vector>

#include "boot/BootTimeline.h"
#include "boot/CriticalChain.h"
#include "verbs/BootOutput.h"
#include "verbs/TextTable.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

const std::string& NameOf(const BootTimeline& timeline, std::size_t entry) {
    return timeline.entries[entry].name;
}

// From the end of what released the plugin to the plugin's start.
Microseconds GapBefore(const BootTimeline& timeline, const ChainLink& link) {
    const TimelineEntry& entry = timeline.entries[link.entry];
    return link.release.by == TimelineEntry::none
               ? entry.start - entry.requested
               : entry.start - timeline.entries[link.release.by].end;
}

std::string ReleaseText(const BootTimeline& timeline, const ChainLink& link) {
    switch (link.release.cause) {
    case ReleaseCause::Barrier:
        return fmt::format("barrier {}", timeline.entries[link.entry].releasedThrough);
    case ReleaseCause::Worker:
        return fmt::format("the worker of {}", NameOf(timeline, link.release.by));
    case ReleaseCause::Request:
        break;
    }
    return "nothing";
}

void WriteChain(const BootTimeline& timeline, const Invocation& invocation) {
    using Kind = TextTable::Kind;
    const std::vector<ChainLink> chain = CriticalChain(timeline);
    Microseconds ran = 0;
    TextTable table({{"START", Kind::Number},
                     {"GAP", Kind::Number},
                     {"RAN", Kind::Number},
                     {"PLUGIN", Kind::Name},
                     {"WAITED LAST FOR", Kind::Name}});
    for (const ChainLink& link : chain) {
        const TimelineEntry& entry = timeline.entries[link.entry];
        ran += entry.Ran();
        table.Add({Milliseconds(entry.start), Milliseconds(GapBefore(timeline, link)),
                   Milliseconds(entry.Ran()), entry.name, ReleaseText(timeline, link)});
    }
    invocation.out << fmt::format(
        "{} of {} decided when the boot ended: they ran for {} of {} ms; all times in ms\n",
        chain.size(), Counted(timeline.entries.size(), "plugin"), Milliseconds(ran),
        Milliseconds(timeline.Makespan()));
    table.Write(invocation.out, invocation.width);
}

Json ChainDocument(const BootTimeline& timeline) {
    Json links = Json::array();
    for (const ChainLink& link : CriticalChain(timeline)) {
        const TimelineEntry& entry = timeline.entries[link.entry];
        Json item{{"plugin", entry.name},
                  {"start", entry.start},
                  {"gap", GapBefore(timeline, link)},
                  {"ran", entry.Ran()}};
        if (link.release.cause == ReleaseCause::Barrier) {
            item["releasedBy"] = NameOf(timeline, link.release.by);
            item["barrier"] = entry.releasedThrough;
        } else if (link.release.cause == ReleaseCause::Worker) {
            item["workerOf"] = NameOf(timeline, link.release.by);
        }
        links.push_back(std::move(item));
    }
    return {{"workers", timeline.workers},
            {"makespan", timeline.Makespan()},
            {"chain", std::move(links)},
            {"remarks", timeline.remarks}};
}

}  // namespace

void AddChain(CLI::App& app, Invocation& invocation) {
    AddReportVerb(app, invocation, "chain",
                  "Show the plugins that decided when the boot ended, and what released each",
                  {ChainDocument, WriteChain});
}

}  // namespace vantor::analyze
