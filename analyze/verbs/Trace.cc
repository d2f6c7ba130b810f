#include "verbs/Trace.h"

#include <cerrno>
#include <cstring>
#include <fstream>
#include <memory>
#include <stdexcept>
#include <string>

#include "boot/TraceWriter.h"
#include "verbs/BootOutput.h"
#include "verbs/CommonOptions.h"

namespace vantor::analyze {

namespace {

struct TraceOptions {
    LogSource source;
    std::string output;  // empty: standard output
};

void WriteFile(const BootTimeline& timeline, const std::string& path) {
    errno = 0;
    std::ofstream file(path);
    if (file) {
        WriteTrace(timeline, file);
        file.close();
    }
    if (!file) {
        throw std::runtime_error(path + ": cannot be written: " + std::strerror(errno));
    }
}

int Run(const TraceOptions& options, const Invocation& invocation) {
    const BootTimeline timeline = options.source.Read();
    if (options.output.empty()) {
        WriteTrace(timeline, invocation.out);
    } else {
        WriteFile(timeline, options.output);
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
    verb->add_option("--output", options->output, "Write to FILE, not to standard output")
        ->type_name("FILE");
    verb->callback([options, &invocation] {
        invocation.action = [options, &invocation] { return Run(*options, invocation); };
    });
}

}  // namespace vantor::analyze
