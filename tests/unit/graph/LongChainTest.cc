#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <deque>
#include <string>

#include "graph/Executor.h"
#include "graph/GraphFaults.h"
#include "graph/Node.h"
#include "support/GraphText.h"
#include "support/Sanitizers.h"

namespace vantor {

namespace {

using support::GraphText;

class QuietNode : public Node {
public:
    QuietNode() : Node("") {}
    void Run() override { ++runs; }
    std::string DotAttributes() const override { return ""; }

    int runs = 0;  // read once the node is done
};

// Far more nodes than a stack has frames for; a sanitizer's frames are larger, and its run slower.
#if defined(VANTOR_ADDRESS_SANITIZER) || defined(VANTOR_THREAD_SANITIZER)
constexpr int length = 100000;
#else
constexpr int length = 1000000;
#endif

// A chain in which each node waits for the one before it.
class LongChainTest : public support::GraphTest {
protected:
    LongChainTest() {
        for (int index = 0; index < length; ++index) {
            nodes.emplace_back();
            if (index > 0) {
                nodes[nodes.size() - 1].AddDependency(nodes[nodes.size() - 2]);
            }
        }
    }

    void ExpectEachRanOnce() {
        int others = 0;
        for (QuietNode& node : nodes) {
            node.WaitDone();
            others += node.runs == 1 ? 0 : 1;
        }
        EXPECT_EQ(others, 0);
    }

    std::deque<QuietNode> nodes;
};

TEST_F(LongChainTest, RunsWhenItsLastNodeIsRequestedFirst) {
    Executor executor(1, false);
    nodes.back().Schedule(executor);
    ExpectEachRanOnce();
}

TEST_F(LongChainTest, RunsWhenItsFirstNodeIsRequestedFirst) {
    Executor executor(1, false);
    for (QuietNode& node : nodes) {
        node.Schedule(executor);
    }
    ExpectEachRanOnce();
}

TEST_F(LongChainTest, RunsOnEightWorkers) {
    Executor executor(8, false);
    nodes.back().Schedule(executor);
    ExpectEachRanOnce();
}

TEST_F(LongChainTest, TheHeightOfTheFirstIsTheLength) {
    EXPECT_EQ(nodes.front().Height(), length);
    EXPECT_EQ(nodes[1].Height(), length - 1);
}

class HeightOfCycleTest : public support::GraphTest {};

//   a -> x -> b -> y -> a        c -> x
TEST_F(HeightOfCycleTest, LeavesOutTheEdgesThatCloseTheCycle) {
    GraphText graph({"a requires y provides x", "b requires x provides y", "c provides x"});
    EXPECT_EQ(graph["c"].Height(), 5);
}

}  // namespace

}  // namespace vantor
