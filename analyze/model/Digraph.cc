#include "model/Digraph.h"

#include <algorithm>

namespace vantor::analyze {

Digraph::Digraph(std::size_t nodes, const std::vector<Edge>& edges)
    : start(nodes + 1), targets(edges.size()) {
    for (const Edge& edge : edges) {
        ++start[edge.first + 1];
    }
    for (std::size_t node = 0; node < nodes; ++node) {
        start[node + 1] += start[node];
    }
    std::vector<std::size_t> next(start.begin(), start.end() - 1);
    for (const Edge& edge : edges) {
        targets[next[edge.first]++] = edge.second;
    }
}

Digraph Digraph::Reversed() const {
    std::vector<Edge> edges;
    edges.reserve(targets.size());
    for (Node node = 0; node < Size(); ++node) {
        for (const Node target : From(node)) {
            edges.emplace_back(target, node);
        }
    }
    return {Size(), edges};
}

namespace {

// Tarjan's algorithm with a stack of its own in place of calls.
class ComponentSearch {
public:
    explicit ComponentSearch(const Digraph& searched)
        : graph(searched), order(searched.Size(), unseen), lowest(searched.Size()) {
        found.of.assign(searched.Size(), unseen);
    }

    Components Run() {
        for (Digraph::Node node = 0; node < graph.Size(); ++node) {
            if (order[node] == unseen) {
                Walk(node);
            }
        }
        return std::move(found);
    }

private:
    static constexpr std::size_t unseen = static_cast<std::size_t>(-1);

    struct Visit {
        Digraph::Node node;
        std::size_t next;  // the edge to follow
    };

    void Enter(Digraph::Node node) {
        order[node] = lowest[node] = seen++;
        open.push_back(node);
        path.push_back({node, 0});
    }

    void Walk(Digraph::Node root) {
        Enter(root);
        while (!path.empty()) {
            Visit& visit = path.back();
            const Digraph::Node node = visit.node;
            if (visit.next == graph.From(node).Size()) {
                Leave(node);
                continue;
            }
            const Digraph::Node target = graph.From(node)[visit.next++];
            if (order[target] == unseen) {
                Enter(target);
            } else if (found.of[target] == unseen) {
                lowest[node] = std::min(lowest[node], order[target]);
            }
        }
    }

    void Leave(Digraph::Node node) {
        path.pop_back();
        if (!path.empty()) {
            std::size_t& above = lowest[path.back().node];
            above = std::min(above, lowest[node]);
        }
        if (lowest[node] != order[node]) {
            return;
        }
        Digraph::Node member = unseen;
        do {
            member = open.back();
            open.pop_back();
            found.of[member] = found.count;
        } while (member != node);
        ++found.count;
    }

    const Digraph& graph;
    std::vector<std::size_t> order;   // in which nodes were entered
    std::vector<std::size_t> lowest;  // that can be reached and belongs to no component yet
    std::vector<Digraph::Node> open;  // entered, and of no component yet
    std::vector<Visit> path;
    std::size_t seen = 0;
    Components found;
};

}  // namespace

Components FindComponents(const Digraph& graph) { return ComponentSearch(graph).Run(); }

}  // namespace vantor::analyze
