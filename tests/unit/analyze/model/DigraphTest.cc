#include "model/Digraph.h"

#include <gtest/gtest.h>

#include <random>
#include <vector>

namespace vantor::analyze {
namespace {

using Matrix = std::vector<std::vector<bool>>;

// Which node can be reached from which, itself by no step: found by trying every way through.
Matrix Reachability(const Digraph& graph) {
    const std::size_t size = graph.Size();
    Matrix reaches(size, std::vector<bool>(size));
    for (std::size_t node = 0; node < size; ++node) {
        reaches[node][node] = true;
        for (const Digraph::Node target : graph.From(node)) {
            reaches[node][target] = true;
        }
    }
    for (std::size_t via = 0; via < size; ++via) {
        for (std::size_t from = 0; from < size; ++from) {
            for (std::size_t to = 0; to < size; ++to) {
                if (reaches[from][via] && reaches[via][to]) {
                    reaches[from][to] = true;
                }
            }
        }
    }
    return reaches;
}

Digraph RandomDigraph(std::uint32_t seed) {
    std::mt19937 random(seed);
    const std::size_t size = 1 + random() % 20;
    std::vector<Digraph::Edge> edges;
    for (std::size_t i = random() % (2 * size); i > 0; --i) {
        edges.emplace_back(random() % size, random() % size);
    }
    return {size, edges};
}

TEST(DigraphTest, KeepsTheEdgesOfANodeInTheirOrder) {
    const Digraph graph(3, {{2, 1}, {0, 2}, {0, 1}, {0, 2}});
    const auto targets = graph.From(0);
    EXPECT_EQ(std::vector<Digraph::Node>(targets.begin(), targets.end()),
              (std::vector<Digraph::Node>{2, 1, 2}));
    EXPECT_EQ(graph.From(1).Size(), 0U);
    EXPECT_EQ(graph.EdgeCount(), 4U);
}

TEST(DigraphTest, ReversesEveryEdge) {
    const Digraph reversed = Digraph(3, {{0, 2}, {1, 2}}).Reversed();
    const auto targets = reversed.From(2);
    EXPECT_EQ(std::vector<Digraph::Node>(targets.begin(), targets.end()),
              (std::vector<Digraph::Node>{0, 1}));
    EXPECT_EQ(reversed.From(0).Size(), 0U);
}

TEST(DigraphTest, HoldsNoNodes) {
    const Digraph graph(0, {});
    EXPECT_EQ(graph.Size(), 0U);
    EXPECT_EQ(FindComponents(graph).count, 0U);
}

TEST(ComponentsTest, AreTheNodesThatReachEachOther) {
    for (std::uint32_t seed = 0; seed < 500; ++seed) {
        const Digraph graph = RandomDigraph(seed);
        const Matrix reaches = Reachability(graph);
        const Components components = FindComponents(graph);
        for (std::size_t one = 0; one < graph.Size(); ++one) {
            for (std::size_t other = 0; other < graph.Size(); ++other) {
                ASSERT_EQ(components.of[one] == components.of[other],
                          reaches[one][other] && reaches[other][one])
                    << "seed " << seed << ", nodes " << one << " and " << other;
            }
        }
    }
}

TEST(ComponentsTest, AreNumberedAgainstTheEdges) {
    for (std::uint32_t seed = 0; seed < 500; ++seed) {
        const Digraph graph = RandomDigraph(seed);
        const Components components = FindComponents(graph);
        for (std::size_t node = 0; node < graph.Size(); ++node) {
            ASSERT_LT(components.of[node], components.count);
            for (const Digraph::Node target : graph.From(node)) {
                ASSERT_LE(components.of[target], components.of[node]) << "seed " << seed;
            }
        }
    }
}

TEST(ComponentsTest, OfAChainOfAMillionNodesNeedNoDeepStack) {
    constexpr std::size_t size = 1'000'000;
    std::vector<Digraph::Edge> edges;
    for (std::size_t node = 0; node + 1 < size; ++node) {
        edges.emplace_back(node, node + 1);
    }
    EXPECT_EQ(FindComponents(Digraph(size, edges)).count, size);
    edges.emplace_back(size - 1, 0);
    EXPECT_EQ(FindComponents(Digraph(size, edges)).count, 1U);
}

}  // namespace
}  // namespace vantor::analyze
