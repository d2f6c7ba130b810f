#include "model/ImpliedRequirements.h"

#include <algorithm>
#include <array>
#include <numeric>
#include <tuple>

namespace vantor::analyze {

namespace {

// Barriers are looked for so many at a time, a bit each; a node's set of those that are done before
// it is, is a row of words.
constexpr std::size_t rowWords = 16;
constexpr std::size_t blockSize = rowWords * 64;
using Row = std::array<std::uint64_t, rowWords>;

bool AlwaysRuns(const PluginDescription& plugin) {
    return plugin.fate == PluginFate::Runs && !plugin.runOnce && plugin.requiredFlags.empty() &&
           plugin.disablingFlags.empty();
}

class Search {
public:
    Search(const BootGraph& searched, std::uint64_t limit)
        : graph(searched),
          backward(searched.Edges().Reversed()),
          firstBarrier(searched.Model().plugins.size()),
          left(limit),
          rows(searched.Edges().Size()) {
        SortByDependency();
    }

    ImpliedRequirements Run() {
        const std::uint64_t cost = rowWords * (rows.size() + 2 * backward.EdgeCount());
        for (blockStart = firstBarrier; blockStart < rows.size(); blockStart += blockSize) {
            if (left < cost) {
                result.endedAt = graph.BarrierName(blockStart);
                break;
            }
            left -= cost;
            for (const Digraph::Node node : order) {
                FillRow(node);
            }
            for (Digraph::Node plugin = 0; plugin < firstBarrier; ++plugin) {
                if (isOnCycle[plugin] == 0) {
                    Look(plugin);
                }
            }
        }
        std::sort(result.found.begin(), result.found.end(), [](const auto& one, const auto& other) {
            return std::tie(one.plugin, one.barrier) < std::tie(other.plugin, other.barrier);
        });
        return std::move(result);
    }

private:
    // Nodes behind all that they wait for. Components are numbered from the far end of the edges.
    void SortByDependency() {
        const Components components = FindComponents(graph.Edges());
        std::vector<std::size_t> sizes(components.count);
        for (const std::size_t component : components.of) {
            ++sizes[component];
        }
        order.resize(rows.size());
        isOnCycle.resize(rows.size());
        for (Digraph::Node node = 0; node < rows.size(); ++node) {
            isOnCycle[node] = sizes[components.of[node]] > 1 ? 1 : 0;
        }
        std::vector<std::size_t> next(components.count);
        std::size_t position = 0;
        for (std::size_t component = components.count; component-- > 0;) {
            next[component] = position;
            position += sizes[component];
        }
        for (Digraph::Node node = 0; node < rows.size(); ++node) {
            order[next[components.of[node]]++] = node;
        }
    }

    void FillRow(Digraph::Node node) {
        Row& row = rows[node];
        row.fill(0);
        if (isOnCycle[node] != 0 || (graph.IsPlugin(node) && !AlwaysRuns(graph.Plugin(node)))) {
            return;
        }
        for (const Digraph::Node before : backward.From(node)) {
            for (std::size_t word = 0; word < rowWords; ++word) {
                row[word] |= rows[before][word];
            }
            if (IsInBlock(before)) {
                row[Word(before)] |= Bit(before);
            }
        }
    }

    void Look(Digraph::Node plugin) {
        const Digraph::Targets required = backward.From(plugin);
        if (required.Size() < 2) {
            return;
        }
        Row wanted{};
        for (const Digraph::Node barrier : required) {
            if (IsInBlock(barrier)) {
                wanted[Word(barrier)] |= Bit(barrier);
            }
        }
        for (const Digraph::Node later : required) {
            for (std::size_t word = 0; word < rowWords; ++word) {
                const std::uint64_t implied = wanted[word] & rows[later][word];
                wanted[word] &= ~implied;
                Tell(plugin, later, word, implied);
            }
        }
    }

    void Tell(std::size_t plugin, Digraph::Node later, std::size_t word, std::uint64_t bits) {
        for (std::size_t bit = 0; bits != 0; ++bit, bits >>= 1) {
            if ((bits & 1) != 0) {
                const Digraph::Node barrier = blockStart + word * 64 + bit;
                result.found.push_back(
                    {plugin, graph.BarrierName(barrier), graph.BarrierName(later)});
            }
        }
    }

    bool IsInBlock(Digraph::Node node) const {
        return node >= blockStart && node - blockStart < blockSize;
    }
    std::size_t Word(Digraph::Node node) const { return (node - blockStart) / 64; }
    std::uint64_t Bit(Digraph::Node node) const {
        return std::uint64_t{1} << ((node - blockStart) % 64);
    }

    const BootGraph& graph;
    const Digraph backward;
    const Digraph::Node firstBarrier;
    std::uint64_t left;
    std::vector<Row> rows;
    std::vector<Digraph::Node> order;
    std::vector<char> isOnCycle;
    Digraph::Node blockStart = 0;
    ImpliedRequirements result;
};

}  // namespace

ImpliedRequirements FindImpliedRequirements(const BootGraph& graph, std::uint64_t limit) {
    return Search(graph, limit).Run();
}

}  // namespace vantor::analyze
