#include "model/Cycles.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <set>
#include <string>
#include <vector>

#include "analyze/model/ModelText.h"

namespace vantor::analyze {
namespace {

std::vector<std::string> RingNames(const BootGraph& graph, const Cycle& cycle) {
    std::vector<std::string> names;
    for (const Digraph::Node node : cycle.ring) {
        names.push_back(graph.Name(node));
    }
    return names;
}

std::vector<std::vector<std::string>> RingsOf(const BootModel& model) {
    const BootGraph graph(model, GraphScope::Waiting);
    std::vector<std::vector<std::string>> rings;
    for (const Cycle& cycle : FindCycles(graph)) {
        rings.push_back(RingNames(graph, cycle));
    }
    return rings;
}

using Rings = std::vector<std::vector<std::string>>;
using Distances = std::vector<std::vector<std::size_t>>;

// The least number of steps, one at least, from each node to each; `far` where there is no way.
constexpr std::size_t far = 1'000'000;

Distances AllDistances(const Digraph& edges) {
    Distances distances(edges.Size(), std::vector<std::size_t>(edges.Size(), far));
    for (std::size_t node = 0; node < edges.Size(); ++node) {
        for (const Digraph::Node target : edges.From(node)) {
            distances[node][target] = 1;
        }
    }
    for (std::size_t via = 0; via < edges.Size(); ++via) {
        for (std::size_t from = 0; from < edges.Size(); ++from) {
            for (std::size_t to = 0; to < edges.Size(); ++to) {
                distances[from][to] =
                    std::min(distances[from][to], distances[from][via] + distances[via][to]);
            }
        }
    }
    return distances;
}

void ExpectToBeARing(const BootGraph& graph, const std::vector<Digraph::Node>& ring) {
    for (std::size_t i = 0; i < ring.size(); ++i) {
        const auto targets = graph.Edges().From(ring[i]);
        EXPECT_NE(std::find(targets.begin(), targets.end(), ring[(i + 1) % ring.size()]),
                  targets.end());
    }
}

// Compares with the distances: which plugins are on a cycle, which of them belong together, and
// how long the shortest cycle of each group is.
void ExpectCyclesOf(const BootModel& model) {
    const BootGraph graph(model, GraphScope::Waiting);
    const Distances distances = AllDistances(graph.Edges());
    const std::vector<Cycle> cycles = FindCycles(graph);
    std::set<std::size_t> grouped;
    std::size_t next = 0;
    for (std::size_t first = 0; first < model.plugins.size(); ++first) {
        if (distances[first][first] >= far || grouped.count(first) != 0) {
            continue;
        }
        std::size_t plugins = 0;
        std::size_t shortest = far;
        std::size_t root = far;
        for (std::size_t member = 0; member < model.plugins.size(); ++member) {
            if (distances[first][member] < far && distances[member][first] < far) {
                grouped.insert(member);
                ++plugins;
                if (distances[member][member] < shortest) {
                    shortest = distances[member][member];
                    root = member;
                }
            }
        }
        ASSERT_LT(next, cycles.size());
        EXPECT_EQ(cycles[next].plugins, plugins);
        EXPECT_EQ(cycles[next].ring.size(), shortest);
        EXPECT_EQ(cycles[next].ring.front(), root);
        EXPECT_TRUE(cycles[next].isShortest);
        ExpectToBeARing(graph, cycles[next].ring);
        ++next;
    }
    EXPECT_EQ(next, cycles.size());
}

TEST(CyclesTest, NoneWithoutOne) {
    EXPECT_EQ(RingsOf(ModelOf({"a: > x", "b: x > y", "c: x y >"})), Rings{});
}

TEST(CyclesTest, APluginThatRequiresWhatItProvides) {
    EXPECT_EQ(RingsOf(ModelOf({"a: x > x"})), (Rings{{"a", "x"}}));
}

//   a -> [x] -> b -> [y] -> a, and beside it c -> [z] -> d -> [w] -> c
TEST(CyclesTest, OneForEachGroupInTheOrderOfTheirPlugins) {
    EXPECT_EQ(RingsOf(ModelOf({"a: y > x", "c: w > z", "d: z > w", "b: x > y"})),
              (Rings{{"a", "x", "b", "y"}, {"c", "z", "d", "w"}}));
}

//   a -> [x] -> b -> [y] -> c -> [z] -> a, and the shorter b -> [y] -> c -> [v] -> b
TEST(CyclesTest, TheShortestOfAGroup) {
    const BootModel model = ModelOf({"a: z > x", "b: x v > y", "c: y > z v"});
    EXPECT_EQ(RingsOf(model), (Rings{{"b", "y", "c", "v"}}));
    EXPECT_EQ(FindCycles(BootGraph(model, GraphScope::Waiting)).front().plugins, 3U);
}

TEST(CyclesTest, NotThroughAPluginThatIsDoneFromTheStart) {
    BootModel model = ModelOf({"a: y > x", "b: x > y"});
    PluginOf(model, "b").fate = PluginFate::AlreadyRun;
    EXPECT_EQ(RingsOf(model), Rings{});
    EXPECT_EQ(FindCycles(BootGraph(model, GraphScope::All)).size(), 1U);
}

TEST(CyclesTest, AreThoseOfAnIndependentCheckOnRandomGraphs) {
    for (std::uint32_t seed = 0; seed < 300; ++seed) {
        SCOPED_TRACE("seed " + std::to_string(seed));
        ExpectCyclesOf(RandomModel(seed, 1 + seed % 14, 1 + seed % 11, 1 + seed % 3));
    }
}

TEST(CyclesTest, ARingOfAHundredThousandPluginsIsFoundInLinearTime) {
    BootModel model;
    constexpr std::size_t size = 100'000;
    for (std::size_t i = 0; i < size; ++i) {
        PluginDescription plugin;
        plugin.required = {{"b" + std::to_string(i), {}}};
        plugin.provided = {{"b" + std::to_string((i + 1) % size), {}}};
        model.plugins.push_back(plugin);
    }
    model.LinkBarriers();
    // Each edge is followed once for the ring, and none after that.
    const std::vector<Cycle> cycles =
        FindCycles(BootGraph(model, GraphScope::Waiting), 2 * size + 1);
    ASSERT_EQ(cycles.size(), 1U);
    EXPECT_EQ(cycles.front().ring.size(), 2 * size);
    EXPECT_TRUE(cycles.front().isShortest);
}

TEST(CyclesTest, AnEndedSearchSaysSoAndStillShowsACycle) {
    const BootModel model = ModelOf({"a: z > x", "b: x v > y", "c: y > z v"});
    const BootGraph graph(model, GraphScope::Waiting);
    const std::vector<Cycle> cycles = FindCycles(graph, 1);
    ASSERT_EQ(cycles.size(), 1U);
    EXPECT_FALSE(cycles.front().isShortest);
    EXPECT_EQ(RingNames(graph, cycles.front()),
              (std::vector<std::string>{"a", "x", "b", "y", "c", "z"}));
}

}  // namespace
}  // namespace vantor::analyze
