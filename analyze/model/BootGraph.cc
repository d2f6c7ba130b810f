#include "model/BootGraph.h"

#include <algorithm>

namespace vantor::analyze {

namespace {

std::vector<std::map<std::string, Barrier>::const_iterator> Entries(const BootModel& model) {
    std::vector<std::map<std::string, Barrier>::const_iterator> entries;
    entries.reserve(model.barriers.size());
    for (auto entry = model.barriers.begin(); entry != model.barriers.end(); ++entry) {
        entries.push_back(entry);
    }
    return entries;
}

std::vector<Digraph::Edge> ListEdges(const BootModel& model, GraphScope scope) {
    const auto isLeftOut = [&](std::size_t plugin) {
        return scope == GraphScope::Waiting && model.plugins[plugin].fate != PluginFate::Runs;
    };
    std::vector<Digraph::Edge> edges;
    Digraph::Node node = model.plugins.size();
    for (const auto& [name, barrier] : model.barriers) {
        for (const std::size_t provider : barrier.providers) {
            if (!isLeftOut(provider)) {
                edges.emplace_back(provider, node);
            }
        }
        for (const std::size_t requirer : barrier.requirers) {
            if (!isLeftOut(requirer)) {
                edges.emplace_back(node, requirer);
            }
        }
        ++node;
    }
    return edges;
}

}  // namespace

BootGraph::BootGraph(const BootModel& described, GraphScope scope)
    : model(described),
      barriers(Entries(described)),
      edges(described.plugins.size() + described.barriers.size(), ListEdges(described, scope)) {}

std::vector<Digraph::Node> BootGraph::PluginsNamed(const std::string& name) const {
    std::vector<Digraph::Node> found;
    for (Digraph::Node node = 0; node < model.plugins.size(); ++node) {
        if (model.plugins[node].name == name) {
            found.push_back(node);
        }
    }
    return found;
}

Digraph::Node BootGraph::BarrierNamed(const std::string& name) const {
    const auto position = std::lower_bound(
        barriers.begin(), barriers.end(), name,
        [](const BarrierEntry& entry, const std::string& wanted) { return entry->first < wanted; });
    if (position == barriers.end() || (*position)->first != name) {
        return edges.Size();
    }
    return model.plugins.size() + static_cast<std::size_t>(position - barriers.begin());
}

}  // namespace vantor::analyze
