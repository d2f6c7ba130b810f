#ifndef VANTOR_ANALYZE_MODEL_DIGRAPH_H
#define VANTOR_ANALYZE_MODEL_DIGRAPH_H

#include <cstddef>
#include <utility>
#include <vector>

namespace vantor::analyze {

// A directed graph of nodes 0, 1, ..., packed so that graphs of any size are walked in time linear
// in their nodes and edges. It does not change once it is made.
class Digraph {
public:
    using Node = std::size_t;
    using Edge = std::pair<Node, Node>;  // from, to

    // The targets of one node's edges, as a range.
    class Targets {
    public:
        Targets(const Node* from, const Node* to) : first(from), last(to) {}
        // NOLINTNEXTLINE(readability-identifier-naming): a range-based for calls it by this name
        const Node* begin() const { return first; }
        // NOLINTNEXTLINE(readability-identifier-naming): a range-based for calls it by this name
        const Node* end() const { return last; }
        std::size_t Size() const { return static_cast<std::size_t>(last - first); }
        Node operator[](std::size_t i) const { return first[i]; }

    private:
        const Node* first;
        const Node* last;
    };

    // `nodes` is their number; the edges of a node keep the order they have in `edges`.
    Digraph(std::size_t nodes, const std::vector<Edge>& edges);

    std::size_t Size() const { return start.size() - 1; }
    std::size_t EdgeCount() const { return targets.size(); }
    Targets From(Node node) const {
        return {targets.data() + start[node], targets.data() + start[node + 1]};
    }

    // The same edges, each the other way round.
    Digraph Reversed() const;

private:
    std::vector<std::size_t> start;  // of each node's targets, and behind them all their end
    std::vector<Node> targets;
};

// The strongly connected components of a graph: nodes are in one component when each can be reached
// from the other.
struct Components {
    std::vector<std::size_t> of;  // each node's component
    std::size_t count = 0;        // components, numbered so that edges lead to lower numbers
};

// In linear time, and without recursion.
Components FindComponents(const Digraph& graph);

}  // namespace vantor::analyze

#endif
