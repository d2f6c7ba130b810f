// The helper that the tests of the graph are written with.
#include "support/GraphText.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <stdexcept>

#include "support/ErrorText.h"

namespace vantor::support {

namespace {

using ::testing::ElementsAre;

TEST(GraphTextTest, LinesBecomePluginsAndBarriers) {
    GraphText graph({"a provides x y requires z", "b", "c requires x"});
    EXPECT_THAT(graph["a"].Dependents(), ElementsAre(&graph.Barrier("x"), &graph.Barrier("y")));
    EXPECT_THAT(graph["a"].Dependencies(), ElementsAre(&graph.Barrier("z")));
    EXPECT_THAT(graph.Barrier("x").Dependents(), ElementsAre(&graph["c"]));
    EXPECT_TRUE(graph["b"].Dependencies().empty());
}

TEST(GraphTextTest, PluginMayHaveSeveralLines) {
    GraphText graph({"a provides x", "b", "a requires y"});
    EXPECT_THAT(graph["a"].Dependents(), ElementsAre(&graph.Barrier("x")));
    EXPECT_THAT(graph["a"].Dependencies(), ElementsAre(&graph.Barrier("y")));
}

TEST(GraphTextTest, BarriersOfTwoGraphsAreNotTheSame) {
    const GraphText first({"a provides x"});
    const GraphText second({"a provides x"});
    EXPECT_NE(first.BarrierName("x"), second.BarrierName("x"));
    EXPECT_NE(&first.Barrier("x"), &second.Barrier("x"));
}

TEST(GraphTextTest, LineWithoutAVerbIsRefused) {
    EXPECT_EQ(ErrorText<std::invalid_argument>([] { const GraphText graph({"a needs x"}); }),
              "no verb before needs in: a needs x");
}

TEST(GraphTextTest, UnknownPluginIsRefused) {
    GraphText graph({"a"});
    EXPECT_EQ(ErrorText<std::out_of_range>([&] { graph["b"].Name(); }),
              "no line mentions the plugin b");
}

}  // namespace

}  // namespace vantor::support
