#include "graph/RandomGraph.h"

#include <algorithm>
#include <numeric>
#include <random>

namespace vantor::support {

namespace {

using Random = std::mt19937;

// Evenly enough; the standard distributions differ from library to library.
std::size_t Below(Random& random, std::size_t bound) { return random() % bound; }

std::vector<std::size_t> Shuffled(Random& random, std::size_t count) {
    std::vector<std::size_t> numbers(count);
    std::iota(numbers.begin(), numbers.end(), 0U);
    for (std::size_t i = count; i > 1; --i) {
        std::swap(numbers[i - 1], numbers[Below(random, i)]);
    }
    return numbers;
}

// Every edge leads from an earlier rank to a later one, which is what keeps cycles out.
void AddEdge(RandomGraph& graph, const std::vector<std::size_t>& byRank, std::size_t from,
             std::size_t to) {
    graph.edges.emplace_back(byRank[from], byRank[to]);
}

void AddAnywhere(RandomGraph& graph, const std::vector<std::size_t>& byRank, Random& random) {
    const std::size_t count = Below(random, 3 * graph.nodes + 1);
    for (std::size_t i = 0; i < count; ++i) {
        const std::size_t from = Below(random, graph.nodes);
        const std::size_t to = Below(random, graph.nodes);
        if (from != to) {
            AddEdge(graph, byRank, std::min(from, to), std::max(from, to));
        }
    }
}

void AddChains(RandomGraph& graph, const std::vector<std::size_t>& byRank, Random& random) {
    const std::size_t chains = 1 + Below(random, 10);
    for (std::size_t rank = chains; rank < graph.nodes; ++rank) {
        AddEdge(graph, byRank, rank - chains, rank);
    }
}

// As plugins and barriers: everything of one layer before everything of the next.
void AddLayers(RandomGraph& graph, const std::vector<std::size_t>& byRank, Random& random) {
    const std::size_t width = 1 + Below(random, 30);
    for (std::size_t rank = 0; rank < graph.nodes; ++rank) {
        const std::size_t next = rank - rank % (width + 1) + width;
        if (next >= graph.nodes) {
            break;
        }
        if (rank != next) {
            AddEdge(graph, byRank, rank, next);
            continue;
        }
        for (std::size_t after = next + 1; after <= std::min(next + width, graph.nodes - 1);
             ++after) {
            AddEdge(graph, byRank, next, after);
        }
    }
}

}  // namespace

RandomGraph MakeRandomGraph(std::uint32_t seed, std::size_t largest) {
    Random random(seed);
    RandomGraph graph;
    graph.nodes = 1 + Below(random, largest);
    const std::vector<std::size_t> byRank = Shuffled(random, graph.nodes);
    switch (Below(random, 5)) {
    case 0:
        break;
    case 1:
        AddChains(graph, byRank, random);
        break;
    case 2:
        AddLayers(graph, byRank, random);
        break;
    default:
        AddAnywhere(graph, byRank, random);
    }
    for (std::size_t again = Below(random, 4); again > 0 && !graph.edges.empty(); --again) {
        graph.edges.push_back(graph.edges[Below(random, graph.edges.size())]);
    }
    graph.markedDone.resize(graph.nodes);
    if (Below(random, 3) == 0) {
        for (std::size_t i = Below(random, graph.nodes); i > 0; i /= 2) {
            graph.markedDone[Below(random, graph.nodes)] = true;
        }
    }
    graph.requested = Shuffled(random, graph.nodes);
    if (Below(random, 3) == 0) {
        graph.requested.resize(1 + Below(random, graph.nodes));
    }
    return graph;
}

}  // namespace vantor::support
