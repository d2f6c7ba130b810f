#include "verbs/Graph.h"

#include <limits>
#include <memory>
#include <sstream>
#include <stdexcept>
#include <string>

#include "verbs/CommonOptions.h"
#include "verbs/Graphviz.h"
#include "verbs/OutputFile.h"
#include "verbs/Progress.h"
#include "verify/Drawing.h"
#include "verify/Explanation.h"

namespace vantor::analyze {

namespace {

struct GraphOptions {
    BootSource source;
    bool isWhole = true;  // nothing was said of `around`; that may be any name, an empty one too
    std::string around;
    int depth = 2;
    std::string format = "dot";
    std::string output;  // empty: the result
};

Shown Choose(const BootGraph& graph, const Findings& findings, const GraphOptions& options) {
    if (options.isWhole) {
        return Everything(graph);
    }
    std::vector<Digraph::Node> centres = graph.PluginsNamed(options.around);
    const Digraph::Node barrier = graph.BarrierNamed(options.around);
    if (barrier != graph.Edges().Size()) {
        centres.push_back(barrier);
    }
    if (centres.empty()) {
        throw std::runtime_error(UnknownName(graph.Model(), findings, options.around));
    }
    return Neighbourhood(graph, centres, static_cast<std::size_t>(options.depth));
}

std::string Draw(const GraphOptions& options, const Invocation& invocation, Findings& findings) {
    const Progress progress(invocation, "drawing the graph");
    const BootModel model = ReadPlugins(options.source.Image(), options.source.options, findings);
    const BootGraph graph(model, GraphScope::All);
    std::ostringstream drawing;
    WriteDrawing(graph, Choose(graph, findings, options), drawing);
    return options.format == "svg" ? DrawAsSvg(drawing.str()) : drawing.str();
}

int DrawGraph(const GraphOptions& options, const Invocation& invocation) {
    Findings findings;
    const std::string drawing = Draw(options, invocation, findings);
    if (options.output.empty()) {
        invocation.out << drawing;
    } else {
        WriteOutput(options.output, drawing);
    }
    TellUnread(findings, invocation);
    return statusClean;
}

}  // namespace

void AddGraph(CLI::App& app, Invocation& invocation) {
    const auto options = std::make_shared<GraphOptions>();
    CLI::App& verb = *app.add_subcommand("graph", "Draw which plugin waits for which barrier");
    AddBootOptions(verb, options->source, DirectoryAs::Argument);
    CLI::Option* const around = verb.add_option("--around", options->around,
                                                "Draw only what is near this plugin or barrier")
                                    ->type_name("NAME");
    verb.add_option("--depth", options->depth, "How many edges away from it")
        ->type_name("N")
        ->check(CLI::Range(0, std::numeric_limits<int>::max()))
        ->needs(around)
        ->capture_default_str();
    verb.add_option("--format", options->format, "dot, or svg where Graphviz is installed")
        ->type_name("FORMAT")
        ->check(CLI::IsMember({"dot", "svg"}))
        ->capture_default_str();
    AddOutputOption(verb, options->output);
    verb.callback([options, around, &invocation] {
        options->isWhole = around->count() == 0;
        invocation.action = [options, &invocation] { return DrawGraph(*options, invocation); };
    });
}

}  // namespace vantor::analyze
