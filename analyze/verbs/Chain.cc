#include "verbs/Chain.h"

#include <fmt/format.h>

#include <memory>
#include <string>
#include <vector>

#include "boot/BootTimeline.h"
#include "boot/CriticalChain.h"
#include "verbs/BootOutput.h"
#include "verbs/CommonOptions.h"
#include "verbs/TextTable.h"

namespace vantor::analyze {

namespace {

struct ChainOptions {
    LogSource source;
    std::string format = "text";
};

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

void WriteText(const BootTimeline& timeline, const std::vector<ChainLink>& chain,
               const Invocation& invocation) {
    using Kind = TextTable::Kind;
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
        chain.size(), Count(timeline.entries.size(), "plugin"), Milliseconds(ran),
        Milliseconds(timeline.Makespan()));
    table.Write(invocation.out, invocation.width);
}

Json Document(const BootTimeline& timeline, const std::vector<ChainLink>& chain) {
    Json links = Json::array();
    for (const ChainLink& link : chain) {
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

int Run(const ChainOptions& options, const Invocation& invocation) {
    const BootTimeline timeline = options.source.Read();
    const std::vector<ChainLink> chain = CriticalChain(timeline);
    if (options.format == "json") {
        WriteJson(Document(timeline, chain), invocation.out);
    } else {
        WriteText(timeline, chain, invocation);
        TellRemarks(timeline.remarks, invocation);
    }
    return statusClean;
}

}  // namespace

void AddChain(CLI::App& app, Invocation& invocation) {
    auto options = std::make_shared<ChainOptions>();
    CLI::App* const verb = app.add_subcommand(
        "chain", "Show the plugins that decided when the boot ended, and what released each");
    AddLogOptions(*verb, options->source);
    AddFormatOption(*verb, options->format);
    verb->callback([options, &invocation] {
        invocation.action = [options, &invocation] { return Run(*options, invocation); };
    });
}

}  // namespace vantor::analyze
