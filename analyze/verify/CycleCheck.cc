#include "verify/CycleCheck.h"

#include <algorithm>
#include <string>

#include "model/Cycles.h"
#include "verify/Wording.h"

namespace vantor::analyze {

namespace {

// "'a' provides "x", which 'b' requires; 'b' provides "y", which 'a' requires".
std::string Tell(const BootGraph& graph, const Cycle& cycle) {
    std::string text;
    for (std::size_t i = 0; i < cycle.ring.size(); i += 2) {
        const PluginDescription& provider = graph.Plugin(cycle.ring[i]);
        const PluginDescription& requirer = graph.Plugin(cycle.ring[(i + 2) % cycle.ring.size()]);
        text += (i == 0 ? "" : "; ") + Quoted(provider) + " provides " +
                QuotedBarrier(graph.BarrierName(cycle.ring[i + 1])) + ", which " +
                (cycle.ring.size() == 2 ? "it requires itself" : Quoted(requirer) + " requires");
    }
    return text;
}

std::string Extent(const Cycle& cycle) {
    const std::size_t length = cycle.ring.size() / 2;
    std::string text = Counted(length, "plugin");
    if (cycle.plugins > length) {
        text += (cycle.isShortest ? ", a shortest of the cycles among "
                                  : ", one of the cycles among ") +
                Counted(cycle.plugins, "plugin");
    }
    return text;
}

// Where the first plugin requires what the last one provides.
Place PlaceOfCycle(const BootGraph& graph, const Cycle& cycle) {
    const PluginDescription& first = graph.Plugin(cycle.ring.front());
    return PlaceOf(first, first.required, graph.BarrierName(cycle.ring.back()));
}

}  // namespace

void CheckCycles(const BootModel& model, Findings& findings) {
    const BootGraph waiting(model, GraphScope::Waiting);
    for (const Cycle& cycle : FindCycles(waiting)) {
        findings.push_back({Severity::Error, "cycle", PlaceOfCycle(waiting, cycle),
                            "the boot never ends: dependency cycle of " + Extent(cycle) + ": " +
                                Tell(waiting, cycle)});
    }
    const bool everythingRuns = std::all_of(
        model.plugins.begin(), model.plugins.end(),
        [](const PluginDescription& plugin) { return plugin.fate == PluginFate::Runs; });
    if (everythingRuns) {
        return;
    }
    const BootGraph all(model, GraphScope::All);
    for (const Cycle& cycle : FindCycles(all)) {
        // A ring without a plugin that is done from the start has been told above, or is one of a
        // group of which another ring has been.
        std::vector<std::string> done;
        for (const Digraph::Node node : cycle.ring) {
            if (all.IsPlugin(node) && all.Plugin(node).fate != PluginFate::Runs) {
                done.push_back(Reason(all.Plugin(node)));
            }
        }
        if (!done.empty()) {
            findings.push_back({Severity::Note, "open-cycle", PlaceOfCycle(all, cycle),
                                "other boots would never end: dependency cycle of " +
                                    Extent(cycle) + ": " + Tell(all, cycle) +
                                    "; in this one: " + Enumerate(done)});
        }
    }
}

}  // namespace vantor::analyze
