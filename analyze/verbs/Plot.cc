#include "verbs/Plot.h"

#include <memory>
#include <stdexcept>
#include <string>
#include <vector>

#include "chart/Chart.h"
#include "verbs/BootOutput.h"
#include "verbs/CommonOptions.h"
#include "verbs/OutputFile.h"
#include "verbs/Progress.h"

namespace vantor::analyze {

namespace {

struct PlotOptions {
    LogSource source;
    std::string output;  // empty: standard output
    bool html = false;
};

std::string Draw(const PlotOptions& options, const BootTimeline& timeline) {
    const std::string& log = options.source.log;
    const std::string source = log.empty() ? HostImage::profilingLog : log;
    return options.html ? ChartAsHtml(timeline, source) : ChartAsSvg(timeline, source);
}

// The first few remarks: the picture is of use without the others, and a page holds them all.
std::vector<std::string> FirstRemarks(const BootTimeline& timeline) {
    constexpr std::size_t most = 5;
    std::vector<std::string> remarks = timeline.remarks;
    if (remarks.size() > most) {
        remarks.resize(most);
        remarks.push_back(std::to_string(timeline.remarks.size() - most) + " more like these");
    }
    return remarks;
}

int Run(const PlotOptions& options, const Invocation& invocation) {
    if (options.output.empty() && invocation.width > 0) {
        throw std::runtime_error(
            "a chart is nothing for a terminal; name a file for it with --output");
    }
    BootTimeline timeline;
    std::string chart;
    {
        const Progress progress(invocation, "drawing the boot");
        timeline = options.source.Read();
        chart = Draw(options, timeline);
    }
    if (options.output.empty()) {
        invocation.out << chart;
    } else {
        WriteOutput(options.output, chart);
    }
    TellRemarks(FirstRemarks(timeline), invocation);
    return statusClean;
}

}  // namespace

void AddPlot(CLI::App& app, Invocation& invocation) {
    auto options = std::make_shared<PlotOptions>();
    CLI::App* const verb =
        app.add_subcommand("plot", "Draw the boot as an SVG picture or an HTML page");
    AddLogOptions(*verb, options->source);
    AddOutputOption(*verb, options->output);
    verb->add_flag("--html", options->html, "Write a page with the picture in it");
    verb->callback([options, &invocation] {
        invocation.action = [options, &invocation] { return Run(*options, invocation); };
    });
}

}  // namespace vantor::analyze
