// The model itself, on graphs small enough to be worked out by hand.
#include "graph/OrderModel.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

namespace vantor::support {

namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;

std::size_t Oldest(std::size_t) { return 0; }
std::size_t Youngest(std::size_t count) { return count - 1; }

//   0 -> 1 -> 2      3      4 -> 2
RandomGraph ThreeChains() {
    RandomGraph graph;
    graph.nodes = 5;
    graph.edges = {{0, 1}, {1, 2}, {4, 2}};
    graph.markedDone.resize(5);
    graph.requested = {3, 2, 4, 0, 1};
    return graph;
}

TEST(OrderModelTest, HeightIsTheLengthOfTheLongestChain) {
    const RandomGraph graph = ThreeChains();
    EXPECT_THAT(OrderModel(graph).Heights(), ElementsAre(3, 2, 1, 1, 2));
}

TEST(OrderModelTest, SerialOrderIsHighestFirstOldestFirst) {
    const RandomGraph graph = ThreeChains();
    EXPECT_THAT(OrderModel(graph).SerialOrder(Oldest), ElementsAre(0, 4, 1, 3, 2));
}

TEST(OrderModelTest, ChoiceIsAmongEqualsOnly) {
    const RandomGraph graph = ThreeChains();
    EXPECT_THAT(OrderModel(graph).SerialOrder(Youngest), ElementsAre(0, 1, 4, 2, 3));
}

TEST(OrderModelTest, OnlyWhatIsNeededIsRun) {
    RandomGraph graph = ThreeChains();
    graph.requested = {1};
    EXPECT_THAT(OrderModel(graph).SerialOrder(Oldest), ElementsAre(0, 1));
}

TEST(OrderModelTest, NothingIsRequestedThroughANodeThatIsMarkedDone) {
    RandomGraph graph = ThreeChains();
    graph.markedDone[1] = true;
    graph.requested = {2};
    EXPECT_THAT(OrderModel(graph).SerialOrder(Oldest), ElementsAre(4, 2));
    graph.requested = {1};
    EXPECT_THAT(OrderModel(graph).SerialOrder(Oldest), IsEmpty());
}

TEST(OrderModelTest, WrongOrdersAreSeen) {
    const RandomGraph graph = ThreeChains();
    const OrderModel model(graph);
    EXPECT_TRUE(model.IsSerialOrder({0, 4, 1, 3, 2}));
    EXPECT_TRUE(model.IsSerialOrder({0, 1, 4, 2, 3}));
    EXPECT_FALSE(model.IsSerialOrder({4, 0, 1, 3, 2}));
    EXPECT_FALSE(model.IsSerialOrder({0, 4, 1, 3}));
    EXPECT_FALSE(model.IsSerialOrder({0, 4, 1, 2, 3, 3}));
}

}  // namespace

}  // namespace vantor::support
