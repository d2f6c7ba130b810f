#include "boot/FlowGraph.h"

#include <algorithm>
#include <queue>
#include <stdexcept>
#include <string>
#include <utility>

namespace vantor::analyze {

namespace {

using Node = Digraph::Node;

std::vector<Digraph::Edge> EdgesOf(const BootTimeline& timeline) {
    const std::size_t entries = timeline.entries.size();
    std::vector<Digraph::Edge> edges;
    for (Node entry = 0; entry < entries; ++entry) {
        for (const std::size_t barrier : timeline.entries[entry].provided) {
            edges.emplace_back(entry, entries + barrier);
        }
        for (const std::size_t barrier : timeline.entries[entry].required) {
            edges.emplace_back(entries + barrier, entry);
        }
    }
    return edges;
}

// The number of edges into each node.
std::vector<std::size_t> EntryDegrees(const Digraph& edges) {
    std::vector<std::size_t> degrees(edges.Size());
    for (Node node = 0; node < edges.Size(); ++node) {
        for (const Node target : edges.From(node)) {
            ++degrees[target];
        }
    }
    return degrees;
}

// Of nodes each of which one of the others leads to: back from any until one comes again.
std::string CircleText(const BootTimeline& timeline, const Digraph& edges,
                       const std::vector<std::size_t>& degrees) {
    constexpr std::size_t most = 20;
    const Digraph back = edges.Reversed();
    Node node = 0;
    while (degrees[node] == 0) {
        ++node;
    }
    std::vector<Node> path;
    std::vector<bool> passed(edges.Size());
    while (!passed[node]) {
        passed[node] = true;
        path.push_back(node);
        for (const Node source : back.From(node)) {
            if (degrees[source] != 0) {
                node = source;
                break;
            }
        }
    }
    path.erase(path.begin(), std::find(path.begin(), path.end(), node));
    std::reverse(path.begin() + 1, path.end());
    path.push_back(node);
    std::string text;
    for (std::size_t index = 0; index < path.size(); ++index) {
        const std::size_t entries = timeline.entries.size();
        if (index == most) {
            text += " -> ...";
            break;
        }
        text += index == 0 ? "" : " -> ";
        text += path[index] < entries ? "'" + timeline.entries[path[index]].name + "'"
                                      : "[" + timeline.barriers[path[index] - entries].name + "]";
    }
    return text;
}

}  // namespace

FlowGraph::FlowGraph(const BootTimeline& timeline)
    : entryCount(timeline.entries.size()),
      edges(timeline.entries.size() + timeline.barriers.size(), EdgesOf(timeline)) {
    std::vector<std::size_t> degrees = EntryDegrees(edges);
    for (Node node = 0; node < edges.Size(); ++node) {
        if (degrees[node] == 0) {
            order.push_back(node);
        }
    }
    for (std::size_t next = 0; next < order.size(); ++next) {
        for (const Node target : edges.From(order[next])) {
            if (--degrees[target] == 0) {
                order.push_back(target);
            }
        }
    }
    if (order.size() != edges.Size()) {
        throw std::runtime_error("the plugins wait for each other in a circle, so the log is not "
                                 "that of a boot with them: " +
                                 CircleText(timeline, edges, degrees));
    }
}

FlowGraph::Lengths FlowGraph::Measure(const std::vector<Microseconds>& runs) const {
    Lengths lengths{std::vector<Microseconds>(edges.Size()),
                    std::vector<Microseconds>(edges.Size())};
    for (const Node node : order) {
        lengths.until[node] += RunOf(runs, node);
        for (const Node target : edges.From(node)) {
            lengths.until[target] = std::max(lengths.until[target], lengths.until[node]);
        }
    }
    for (auto node = order.rbegin(); node != order.rend(); ++node) {
        for (const Node target : edges.From(*node)) {
            lengths.from[*node] = std::max(lengths.from[*node], lengths.from[target]);
        }
        lengths.from[*node] += RunOf(runs, *node);
    }
    return lengths;
}

Microseconds FlowGraph::LongestPath(const std::vector<Microseconds>& runs) const {
    Microseconds longest = 0;
    for (const Microseconds length : Measure(runs).until) {
        longest = std::max(longest, length);
    }
    return longest;
}

// Places in `order` stand for time. A chain that passes a node by ends before it, begins behind it,
// or has an edge from before it to behind it: the longest of each kind is kept while the nodes are
// gone through in order, and compared with the longest chain through the node less its run.
std::vector<Microseconds>
FlowGraph::LongestPathsWithout(const std::vector<Microseconds>& runs) const {
    const Lengths lengths = Measure(runs);
    std::vector<std::size_t> place(edges.Size());
    for (std::size_t index = 0; index < order.size(); ++index) {
        place[order[index]] = index;
    }
    std::vector<Microseconds> behind(order.size() + 1);
    for (std::size_t index = order.size(); index-- > 0;) {
        behind[index] = std::max(behind[index + 1], lengths.from[order[index]]);
    }

    std::vector<Microseconds> without(entryCount);
    Microseconds before = 0;
    // The longest chain along an edge, and the place where the edge ends.
    std::priority_queue<std::pair<Microseconds, std::size_t>> across;
    for (std::size_t index = 0; index < order.size(); ++index) {
        const Node node = order[index];
        while (!across.empty() && across.top().second <= index) {
            across.pop();
        }
        if (node < entryCount) {
            const Microseconds through =
                lengths.until[node] + lengths.from[node] - 2 * RunOf(runs, node);
            const Microseconds past = across.empty() ? 0 : across.top().first;
            without[node] = std::max({through, before, behind[index + 1], past});
        }
        before = std::max(before, lengths.until[node]);
        for (const Node target : edges.From(node)) {
            across.emplace(lengths.until[node] + lengths.from[target], place[target]);
        }
    }
    return without;
}

}  // namespace vantor::analyze
