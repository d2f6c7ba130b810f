#include "model/Cycles.h"

#include <algorithm>

namespace vantor::analyze {

namespace {

constexpr std::size_t none = static_cast<std::size_t>(-1);

// Finds a shortest cycle of one group after another. A plugin that was searched from is taken out,
// and with it all that is on no cycle any more: whatever goes through them has been seen.
class ShortestCycles {
public:
    ShortestCycles(const BootGraph& searched, const Components& found, std::uint64_t limit)
        : forward(searched.Edges()),
          backward(searched.Edges().Reversed()),
          components(found),
          left(limit),
          isOut(forward.Size()),
          waitsFor(forward.Size()),
          isWaitedFor(forward.Size()),
          seenFrom(forward.Size(), none),
          distance(forward.Size()),
          parent(forward.Size()) {
        CountEdgesWithin();
    }

    // `plugins`: all of one group, ascending.
    Cycle Search(const std::vector<Digraph::Node>& plugins) {
        Cycle best;
        best.plugins = plugins.size();
        for (const Digraph::Node plugin : plugins) {
            if (isOut[plugin]) {
                continue;
            }
            // The first search is made in any case, so that there is a cycle to show.
            if (left == 0 && !best.ring.empty()) {
                best.isShortest = false;
                break;
            }
            SearchFrom(plugin, best.ring);
            TakeOut(plugin);
        }
        return best;
    }

private:
    bool IsWithin(Digraph::Node from, Digraph::Node to) const {
        return components.of[from] == components.of[to];
    }

    void CountEdgesWithin() {
        for (Digraph::Node node = 0; node < forward.Size(); ++node) {
            for (const Digraph::Node target : forward.From(node)) {
                if (IsWithin(node, target)) {
                    ++isWaitedFor[node];
                    ++waitsFor[target];
                }
            }
        }
    }

    // Breadth first, until the root is met again or no shorter cycle than `ring` can be.
    void SearchFrom(Digraph::Node root, std::vector<Digraph::Node>& ring) {
        queue.assign(1, root);
        seenFrom[root] = root;
        distance[root] = 0;
        for (std::size_t head = 0; head < queue.size(); ++head) {
            const Digraph::Node node = queue[head];
            if (!ring.empty() && distance[node] + 1 >= ring.size()) {
                return;
            }
            left -= std::min<std::uint64_t>(left, forward.From(node).Size());
            for (const Digraph::Node target : forward.From(node)) {
                if (target == root) {
                    ring = PathTo(node);
                    return;
                }
                if (IsWithin(node, target) && !isOut[target] && seenFrom[target] != root) {
                    seenFrom[target] = root;
                    distance[target] = distance[node] + 1;
                    parent[target] = node;
                    queue.push_back(target);
                }
            }
        }
    }

    std::vector<Digraph::Node> PathTo(Digraph::Node node) const {
        std::vector<Digraph::Node> path(distance[node] + 1);
        for (std::size_t i = path.size(); i-- > 0; node = parent[node]) {
            path[i] = node;
        }
        return path;
    }

    void TakeOut(Digraph::Node first) {
        isOut[first] = true;
        queue.assign(1, first);
        for (std::size_t head = 0; head < queue.size(); ++head) {
            const Digraph::Node node = queue[head];
            Release(forward, node, waitsFor);
            Release(backward, node, isWaitedFor);
        }
    }

    // A neighbour that has lost its last edge of one direction is on no cycle.
    void Release(const Digraph& edges, Digraph::Node node, std::vector<std::size_t>& counts) {
        for (const Digraph::Node target : edges.From(node)) {
            if (IsWithin(node, target) && !isOut[target] && --counts[target] == 0) {
                isOut[target] = true;
                queue.push_back(target);
            }
        }
    }

    const Digraph& forward;
    const Digraph backward;
    const Components& components;
    std::uint64_t left;  // edges that may still be followed
    std::vector<char> isOut;
    std::vector<std::size_t> waitsFor;  // edges within the group of nodes that are not out
    std::vector<std::size_t> isWaitedFor;
    std::vector<Digraph::Node> seenFrom;  // the root of the last search that came here
    std::vector<std::size_t> distance;    // from that root
    std::vector<Digraph::Node> parent;    // on the way from there
    std::vector<Digraph::Node> queue;
};

// The plugins of each component, ascending, in the order of the first.
std::vector<std::vector<Digraph::Node>> Groups(const BootGraph& graph,
                                               const Components& components) {
    std::vector<std::size_t> sizes(components.count);
    for (const std::size_t component : components.of) {
        ++sizes[component];
    }
    std::vector<std::size_t> groupOf(components.count, none);
    std::vector<std::vector<Digraph::Node>> groups;
    for (Digraph::Node plugin = 0; graph.IsPlugin(plugin); ++plugin) {
        const std::size_t component = components.of[plugin];
        // A cycle goes through a plugin and a barrier at least.
        if (sizes[component] < 2) {
            continue;
        }
        if (groupOf[component] == none) {
            groupOf[component] = groups.size();
            groups.emplace_back();
        }
        groups[groupOf[component]].push_back(plugin);
    }
    return groups;
}

}  // namespace

std::vector<Cycle> FindCycles(const BootGraph& graph, std::uint64_t limit) {
    const Components components = FindComponents(graph.Edges());
    const std::vector<std::vector<Digraph::Node>> groups = Groups(graph, components);
    std::vector<Cycle> cycles;
    if (!groups.empty()) {
        ShortestCycles search(graph, components, limit);
        for (const std::vector<Digraph::Node>& group : groups) {
            cycles.push_back(search.Search(group));
        }
    }
    return cycles;
}

}  // namespace vantor::analyze
