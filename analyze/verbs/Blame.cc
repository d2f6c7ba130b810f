#include "verbs/Blame.h"

#include <fmt/format.h>

#include <string>
#include <vector>

#include "boot/Blame.h"
#include "boot/BootTimeline.h"
#include "verbs/BootOutput.h"
#include "verbs/TextTable.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

void WriteBlame(const BootTimeline& timeline, const Invocation& invocation) {
    using Kind = TextTable::Kind;
    invocation.out << fmt::format(
        "{} on {}: {} ms from the first start to the last end, {} ms of work; all times in ms\n",
        Counted(timeline.entries.size(), "plugin"), Counted(timeline.workers, "worker"),
        Milliseconds(timeline.Makespan()), Milliseconds(timeline.Work()));
    TextTable table({{"PLUGIN", Kind::Name},
                     {"FOR BARRIERS", Kind::Number},
                     {"FOR A WORKER", Kind::Number},
                     {"RAN", Kind::Number},
                     {"SLACK", Kind::Number},
                     {"SAVES AT MOST", Kind::Number}});
    for (const BlameRow& row : Blame(timeline)) {
        const TimelineEntry& entry = timeline.entries[row.entry];
        table.Add({entry.name, Milliseconds(entry.WaitedForBarriers()),
                   Milliseconds(entry.WaitedForWorker()), Milliseconds(entry.Ran()),
                   Milliseconds(row.slack), Milliseconds(row.savesAtMost)});
    }
    table.Write(invocation.out, invocation.width);
}

Json BlameDocument(const BootTimeline& timeline) {
    Json plugins = Json::array();
    for (const BlameRow& row : Blame(timeline)) {
        const TimelineEntry& entry = timeline.entries[row.entry];
        plugins.push_back({{"plugin", entry.name},
                           {"waitedForBarriers", entry.WaitedForBarriers()},
                           {"waitedForWorker", entry.WaitedForWorker()},
                           {"ran", entry.Ran()},
                           {"slack", row.slack},
                           {"savesAtMost", row.savesAtMost}});
    }
    return {{"workers", timeline.workers},
            {"makespan", timeline.Makespan()},
            {"work", timeline.Work()},
            {"plugins", std::move(plugins)},
            {"remarks", timeline.remarks}};
}

}  // namespace

void AddBlame(CLI::App& app, Invocation& invocation) {
    AddReportVerb(app, invocation, "blame",
                  "Show what each plugin waited for, how long it ran, and what that cost the boot",
                  {BlameDocument, WriteBlame});
}

}  // namespace vantor::analyze
