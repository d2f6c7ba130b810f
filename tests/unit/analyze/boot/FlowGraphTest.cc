// The longest chain of runs, and what is left of it without one of them.

#include "boot/FlowGraph.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

#include "analyze/boot/BootText.h"
#include "analyze/boot/RandomBoot.h"
#include "support/ErrorText.h"

namespace vantor::analyze {
namespace {

using support::BootText;
using testing::ElementsAre;

std::vector<Microseconds> RunsOf(const BootTimeline& timeline) {
    std::vector<Microseconds> runs;
    for (const TimelineEntry& entry : timeline.entries) {
        runs.push_back(entry.Ran());
    }
    return runs;
}

TEST(FlowGraphTest, TheLongestChainGoesThroughTheBarriers) {
    //  a 10 --> [x] --> c 20 --> [y] --> d 5
    //  b 25 --------------------> [y]
    const BootTimeline timeline = BootText({"a 0 10 provides x", "b 0 25 provides y",
                                            "c 10 30 requires x provides y", "d 30 35 requires y"})
                                      .Timeline();
    const FlowGraph graph(timeline);
    const std::vector<Microseconds> runs = RunsOf(timeline);
    EXPECT_EQ(graph.LongestPath(runs), 35);
    EXPECT_THAT(graph.LongestPathsWithout(runs), ElementsAre(30, 35, 30, 30));
}

TEST(FlowGraphTest, WithoutPluginsThereIsNoChain) {
    const FlowGraph graph{BootTimeline()};
    EXPECT_EQ(graph.LongestPath({}), 0);
    EXPECT_TRUE(graph.LongestPathsWithout({}).empty());
}

TEST(FlowGraphTest, ACircleIsRefusedAndTold) {
    const BootTimeline timeline =
        BootText({"p 0 5 requires b provides a c", "q 6 9 requires a provides b",
                  "after 9 10 requires c", "before 0 1 provides b"})
            .Timeline();
    EXPECT_EQ(support::ErrorText<std::runtime_error>([&] { const FlowGraph graph(timeline); }),
              "the plugins wait for each other in a circle, so the log is not that of a boot with "
              "them: 'p' -> [a] -> 'q' -> [b] -> 'p'");
}

TEST(FlowGraphTest, APluginThatWaitsForItselfIsACircle) {
    const BootTimeline timeline = BootText({"p 0 5 requires a provides a"}).Timeline();
    EXPECT_EQ(support::ErrorText<std::runtime_error>([&] { const FlowGraph graph(timeline); }),
              "the plugins wait for each other in a circle, so the log is not that of a boot with "
              "them: 'p' -> [a] -> 'p'");
}

TEST(FlowGraphTest, EachPathWithoutARunIsThatOfTheGraphWithTheRunTakenAsNone) {
    for (std::uint32_t seed = 0; seed < 60; ++seed) {
        const BootTimeline timeline = support::MakeRandomBoot(seed, 2 + seed);
        const FlowGraph graph(timeline);
        const std::vector<Microseconds> runs = RunsOf(timeline);
        const std::vector<Microseconds> without = graph.LongestPathsWithout(runs);
        for (std::size_t entry = 0; entry < runs.size(); ++entry) {
            std::vector<Microseconds> fewer = runs;
            fewer[entry] = 0;
            EXPECT_EQ(without[entry], graph.LongestPath(fewer)) << "seed " << seed << ", " << entry;
        }
    }
}

}  // namespace
}  // namespace vantor::analyze
