#ifndef VANTOR_ANALYZE_MODEL_BOOTGRAPH_H
#define VANTOR_ANALYZE_MODEL_BOOTGRAPH_H

#include <string>
#include <vector>

#include "model/BootModel.h"
#include "model/Digraph.h"

namespace vantor::analyze {

// Whose edges a graph holds.
enum class GraphScope {
    All,      // every plugin's
    Waiting,  // those of plugins that run: the others are done before the boot begins
};

// A boot's plugins and barriers as nodes: first the plugins as the model numbers them, then the
// barriers by name. An edge leads to what waits: from a plugin to each barrier it provides, from a
// barrier to each plugin that requires it, once each, targets ascending. Refers to the model, which
// lives as long and keeps its barriers linked.
class BootGraph {
public:
    BootGraph(const BootModel& described, GraphScope scope);

    const BootModel& Model() const { return model; }
    const Digraph& Edges() const { return edges; }

    bool IsPlugin(Digraph::Node node) const { return node < model.plugins.size(); }
    const PluginDescription& Plugin(Digraph::Node node) const { return model.plugins[node]; }
    const std::string& BarrierName(Digraph::Node node) const { return BarrierAt(node)->first; }
    const Barrier& BarrierOf(Digraph::Node node) const { return BarrierAt(node)->second; }
    const std::string& Name(Digraph::Node node) const {
        return IsPlugin(node) ? Plugin(node).name : BarrierName(node);
    }

    // The plugins of a name, ascending.
    std::vector<Digraph::Node> PluginsNamed(const std::string& name) const;

    // The barrier of a name; Edges().Size() where there is none.
    Digraph::Node BarrierNamed(const std::string& name) const;

private:
    using BarrierEntry = std::map<std::string, Barrier>::const_iterator;

    BarrierEntry BarrierAt(Digraph::Node node) const {
        return barriers[node - model.plugins.size()];
    }

    const BootModel& model;
    std::vector<BarrierEntry> barriers;
    Digraph edges;
};

}  // namespace vantor::analyze

#endif
