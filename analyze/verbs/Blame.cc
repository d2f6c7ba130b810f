#include "verbs/Blame.h"

#include <fmt/format.h>

#include <memory>
#include <string>
#include <vector>

#include "boot/Blame.h"
#include "boot/BootTimeline.h"
#include "verbs/BootOutput.h"
#include "verbs/CommonOptions.h"
#include "verbs/TextTable.h"

namespace vantor::analyze {

namespace {

struct BlameOptions {
    LogSource source;
    std::string format = "text";
};

void WriteText(const BootTimeline& timeline, const std::vector<BlameRow>& rows,
               const Invocation& invocation) {
    using Kind = TextTable::Kind;
    invocation.out << fmt::format(
        "{} on {}: {} ms from the first start to the last end, {} ms of work; all times in ms\n",
        Count(timeline.entries.size(), "plugin"), Count(timeline.workers, "worker"),
        Milliseconds(timeline.Makespan()), Milliseconds(timeline.Work()));
    TextTable table({{"PLUGIN", Kind::Name},
                     {"FOR BARRIERS", Kind::Number},
                     {"FOR A WORKER", Kind::Number},
                     {"RAN", Kind::Number},
                     {"SLACK", Kind::Number},
                     {"SAVES AT MOST", Kind::Number}});
    for (const BlameRow& row : rows) {
        const TimelineEntry& entry = timeline.entries[row.entry];
        table.Add({entry.name, Milliseconds(entry.WaitedForBarriers()),
                   Milliseconds(entry.WaitedForWorker()), Milliseconds(entry.Ran()),
                   Milliseconds(row.slack), Milliseconds(row.savesAtMost)});
    }
    table.Write(invocation.out, invocation.width);
}

Json Document(const BootTimeline& timeline, const std::vector<BlameRow>& rows) {
    Json plugins = Json::array();
    for (const BlameRow& row : rows) {
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

int Run(const BlameOptions& options, const Invocation& invocation) {
    const BootTimeline timeline = options.source.Read();
    const std::vector<BlameRow> rows = Blame(timeline);
    if (options.format == "json") {
        WriteJson(Document(timeline, rows), invocation.out);
    } else {
        WriteText(timeline, rows, invocation);
        TellRemarks(timeline.remarks, invocation);
    }
    return statusClean;
}

}  // namespace

void AddBlame(CLI::App& app, Invocation& invocation) {
    auto options = std::make_shared<BlameOptions>();
    CLI::App* const verb = app.add_subcommand(
        "blame", "Show what each plugin waited for, how long it ran, and what that cost the boot");
    AddLogOptions(*verb, options->source);
    AddFormatOption(*verb, options->format);
    verb->callback([options, &invocation] {
        invocation.action = [options, &invocation] { return Run(*options, invocation); };
    });
}

}  // namespace vantor::analyze
