#include "verbs/Trace.h"

#include <memory>
#include <sstream>
#include <string>

#include "boot/TraceWriter.h"
#include "verbs/BootOutput.h"
#include "verbs/CommonOptions.h"
#include "verbs/OutputFile.h"

namespace vantor::analyze {

namespace {

struct TraceOptions {
    LogSource source;
    std::string output;  // empty: standard output
};

int Run(const TraceOptions& options, const Invocation& invocation) {
    const BootTimeline timeline = options.source.Read(invocation);
    if (options.output.empty()) {
        WriteTrace(timeline, invocation.out);
    } else {
        std::ostringstream trace;
        WriteTrace(timeline, trace);
        WriteOutput(options.output, trace.str());
    }
    TellRemarks(timeline.remarks, invocation);
    return statusClean;
}

}  // namespace

void AddTrace(CLI::App& app, Invocation& invocation) {
    auto options = std::make_shared<TraceOptions>();
    CLI::App* const verb =
        app.add_subcommand("trace", "Write the boot as Trace Event JSON, which Perfetto opens");
    AddLogOptions(*verb, options->source);
    AddOutputOption(*verb, options->output);
    verb->callback([options, &invocation] {
        invocation.action = [options, &invocation] { return Run(*options, invocation); };
    });
}

}  // namespace vantor::analyze
