#ifndef VANTOR_ANALYZE_BOOT_FLOWGRAPH_H
#define VANTOR_ANALYZE_BOOT_FLOWGRAPH_H

#include <cstddef>
#include <vector>

#include "boot/BootTimeline.h"
#include "model/Digraph.h"

namespace vantor::analyze {

// Who waits for whom among the plugins that were run, whatever their times were: nodes are the
// timeline's entries, in their order, and behind them its barriers. Free of circles.
class FlowGraph {
public:
    // Throws std::runtime_error that tells a circle, if there is one.
    explicit FlowGraph(const BootTimeline& timeline);

    std::size_t EntryCount() const { return entryCount; }
    const Digraph& Edges() const { return edges; }  // from provider to barrier to requirer

    // All nodes, each behind those it waits for.
    const std::vector<Digraph::Node>& Order() const { return order; }

    // The length of the longest chain of runs, each entry's run being as long as `runs` says.
    Microseconds LongestPath(const std::vector<Microseconds>& runs) const;

    // For each entry the length that the longest chain would have if that entry's run took no time.
    // n log n for all of them together.
    std::vector<Microseconds> LongestPathsWithout(const std::vector<Microseconds>& runs) const;

private:
    struct Lengths {
        std::vector<Microseconds> until;  // of the longest chain that ends with the node
        std::vector<Microseconds> from;   // of the longest chain that begins with it
    };

    Lengths Measure(const std::vector<Microseconds>& runs) const;
    Microseconds RunOf(const std::vector<Microseconds>& runs, Digraph::Node node) const {
        return node < entryCount ? runs[node] : 0;
    }

    std::size_t entryCount;
    Digraph edges;
    std::vector<Digraph::Node> order;
};

}  // namespace vantor::analyze

#endif
