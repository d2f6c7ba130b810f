#include "graph/Node.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <memory>
#include <thread>
#include <vector>

#include "graph/Executor.h"
#include "graph/GlobalLock.h"
#include "graph/GraphFaults.h"
#include "plugins/Exceptions.h"
#include "support/ErrorText.h"
#include "support/GraphText.h"
#include "support/Waiting.h"

namespace vantor {

namespace {

using support::Execute;
using support::ExpectEdgesAgree;
using support::Faults;
using support::GraphText;
using support::RunOrder;
using support::TestNode;
using support::WaitUntil;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class NodeTest : public support::GraphTest {
protected:
    std::unique_ptr<TestNode> MakeNode(const std::string& name) {
        return std::make_unique<TestNode>(name, order);
    }

    RunOrder order;
};

TEST_F(NodeTest, NewNodeIsIdleAndHasNoEdges) {
    const auto node = MakeNode("a name");
    EXPECT_EQ(node->Name(), "a name");
    EXPECT_EQ(node->State(), NodeState::Idle);
    EXPECT_THAT(node->Dependencies(), IsEmpty());
    EXPECT_THAT(node->Dependents(), IsEmpty());
}

TEST_F(NodeTest, StatesHaveTheirNumbers) {
    EXPECT_EQ(static_cast<std::int32_t>(NodeState::Idle), 0);
    EXPECT_EQ(static_cast<std::int32_t>(NodeState::Waiting), 1);
    EXPECT_EQ(static_cast<std::int32_t>(NodeState::Queued), 2);
    EXPECT_EQ(static_cast<std::int32_t>(NodeState::Done), 3);
}

TEST_F(NodeTest, ConditionVariableThatCannotBeInitialisedIsAnException) {
    Faults().condInit.FailCall(1, EAGAIN);
    EXPECT_EQ(support::ErrorText<Exception>([&] { MakeNode("a"); }),
              "Condition variable for Node could not be initialized");
}

TEST_F(NodeTest, AddDependencyStandsInBothLists) {
    const auto node = MakeNode("node");
    const auto first = MakeNode("first");
    const auto second = MakeNode("second");
    node->AddDependency(*first);
    node->AddDependency(*second);
    EXPECT_THAT(node->Dependencies(), ElementsAre(first.get(), second.get()));
    EXPECT_THAT(first->Dependents(), ElementsAre(node.get()));
    EXPECT_THAT(second->Dependents(), ElementsAre(node.get()));
    EXPECT_THAT(node->Dependents(), IsEmpty());
    EXPECT_THAT(first->Dependencies(), IsEmpty());
}

TEST_F(NodeTest, AddDependentStandsInBothLists) {
    const auto node = MakeNode("node");
    const auto first = MakeNode("first");
    const auto second = MakeNode("second");
    node->AddDependent(*first);
    node->AddDependent(*second);
    EXPECT_THAT(node->Dependents(), ElementsAre(first.get(), second.get()));
    EXPECT_THAT(first->Dependencies(), ElementsAre(node.get()));
    EXPECT_THAT(second->Dependencies(), ElementsAre(node.get()));
    EXPECT_THAT(node->Dependencies(), IsEmpty());
    EXPECT_THAT(first->Dependents(), IsEmpty());
}

TEST_F(NodeTest, NameListedTwiceInRequiresGivesTheEdgeTwiceInBothLists) {
    GraphText graph({"a requires x x"});
    InitBarrier& x = graph.Barrier("x");
    EXPECT_THAT(graph["a"].Dependencies(), ElementsAre(&x, &x));
    EXPECT_THAT(x.Dependents(), ElementsAre(&graph["a"], &graph["a"]));
}

TEST_F(NodeTest, NameListedTwiceLeavesSchedulingUnaffected) {
    GraphText graph({"b requires x x", "a provides x x", "c requires x"});
    EXPECT_THAT(graph.Run(1), ElementsAre("a", "b", "c"));
}

// Edges are listed with the lock held, so that no test's walk meets a change.
TEST_F(NodeTest, DestroyedNodeLeavesNoPointerToItselfBehind) {
    const auto provider = MakeNode("provider");
    const auto requirer = MakeNode("requirer");
    const auto other = MakeNode("other");
    provider->AddDependent(*other);
    requirer->AddDependency(*other);
    {
        const auto node = MakeNode("node");
        node->AddDependency(*provider);
        node->AddDependency(*provider);
        node->AddDependent(*requirer);
        requirer->AddDependency(*node);
        node->AddDependency(*node);
    }
    EXPECT_THAT(provider->Dependents(), ElementsAre(other.get()));
    EXPECT_THAT(requirer->Dependencies(), ElementsAre(other.get()));
    ExpectEdgesAgree(*provider);
    ExpectEdgesAgree(*requirer);
    ExpectEdgesAgree(*other);
}

TEST_F(NodeTest, HeightOfAPluginThatProvidesNothingIs1) {
    GraphText graph({"a requires x"});
    EXPECT_EQ(graph["a"].Height(), 1);
}

TEST_F(NodeTest, HeightOfABarrierRequiredByOneSuchPluginIs2) {
    GraphText graph({"a requires x"});
    EXPECT_EQ(graph.Barrier("x").Height(), 2);
}

TEST_F(NodeTest, HeightOfThatBarriersProviderIs3) {
    GraphText graph({"a requires x", "b provides x"});
    EXPECT_EQ(graph["b"].Height(), 3);
}

//        .-> y -> c -> z -> d
//   a --+
//        `-> x -> b
TEST_F(NodeTest, HeightFollowsTheLongestChain) {
    GraphText graph({"a provides x y", "b requires x", "c requires y provides z", "d requires z"});
    EXPECT_EQ(graph["a"].Height(), 5);
    EXPECT_EQ(graph.Barrier("y").Height(), 4);
    EXPECT_EQ(graph["c"].Height(), 3);
    EXPECT_EQ(graph.Barrier("x").Height(), 2);
    EXPECT_EQ(graph["b"].Height(), 1);
}

TEST_F(NodeTest, HeightIsComputedOnceAndKept) {
    const auto node = MakeNode("node");
    const auto dependent = MakeNode("dependent");
    EXPECT_EQ(node->Height(), 1);
    node->AddDependent(*dependent);
    EXPECT_EQ(node->Height(), 1);
}

TEST_F(NodeTest, HeightOfAChainOfThousandsIsItsLength) {
    std::vector<std::unique_ptr<TestNode>> chain;
    for (int i = 0; i < 3000; ++i) {
        chain.push_back(MakeNode("node"));
        if (i > 0) {
            chain[chain.size() - 2]->AddDependent(*chain.back());
        }
    }
    EXPECT_EQ(chain.front()->Height(), 3000);
    EXPECT_EQ(chain.back()->Height(), 1);
}

TEST_F(NodeTest, MarkDoneDeclaresItFinishedWithoutRunning) {
    const auto node = MakeNode("node");
    node->MarkDone();
    EXPECT_EQ(node->State(), NodeState::Done);
    node->WaitDone();
    EXPECT_THAT(order.Names(), IsEmpty());
}

TEST_F(NodeTest, OperationsMayBeCalledWithTheLockHeld) {
    const auto node = MakeNode("node");
    const auto other = MakeNode("other");
    const GlobalLockGuard guard;
    node->AddDependency(*other);
    other->AddDependent(*node);
    other->MarkDone();
    other->WaitDone();
    EXPECT_EQ(other->State(), NodeState::Done);
    EXPECT_EQ(other->Height(), 2);
    EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
}

TEST_F(NodeTest, RunAllReturnsWhenEveryNodeIsDone) {
    GraphText graph({"a provides x", "b requires x", "c"});
    const std::vector<Node*> nodes = {&graph["a"], &graph["b"], &graph["c"]};
    Executor executor(2, false);
    Node::RunAll(nodes, executor);
    for (const Node* node : nodes) {
        EXPECT_EQ(node->State(), NodeState::Done) << node->Name();
    }
}

TEST_F(NodeTest, RunAllRequestsEveryNodeBeforeAWorkerChooses) {
    GraphText graph({"low", "high provides x", "last requires x"});
    Executor executor(1, false);
    Node::RunAll(std::vector<Node*>{&graph["low"], &graph["high"], &graph["last"]}, executor);
    EXPECT_THAT(graph.Order(), ElementsAre("high", "low", "last"));
}

TEST_F(NodeTest, RunAllWaitsForEachOfManyThatTakeDifferentTimes) {
    GraphText graph({"a", "b", "c", "d", "e", "f"});
    std::vector<Node*> nodes;
    for (const char* const name : {"a", "b", "c", "d", "e", "f"}) {
        graph[name].onRun = [name] { usleep(name[0] % 2 == 0 ? 1000 : 3000); };
        nodes.push_back(&graph[name]);
    }
    Executor executor(3, false);
    Node::RunAll(nodes, executor);
    for (const Node* node : nodes) {
        EXPECT_EQ(node->State(), NodeState::Done) << node->Name();
    }
}

// What one executor was asked for is run by the other, which was asked for what it waits for.
TEST_F(NodeTest, RunAllWaitsForItsOwnNodesThoughItsExecutorRunsOnesThatAnotherWasAskedFor) {
    GraphText graph({"shared provides x", "foreign requires x", "slow", "last"});
    Executor other(0, false);
    Executor executor(2, false);
    std::atomic<bool> mayEnd{false};
    graph["shared"].onRun = [&] { EXPECT_TRUE(WaitUntil([&] { return mayEnd.load(); })); };
    graph["slow"].onRun = [] { usleep(20000); };
    graph["shared"].Schedule(executor);
    graph["foreign"].Schedule(other);
    mayEnd = true;
    Node::RunAll(std::vector<Node*>{&graph["slow"], &graph["last"]}, executor);
    EXPECT_EQ(graph["slow"].State(), NodeState::Done);
    graph["foreign"].WaitDone();
}

TEST_F(NodeTest, NobodyIsWokenForANodeThatNobodyWaitsFor) {
    GraphText graph({"a"});
    Executor executor(0, false);
    graph["a"].Schedule(executor);
    Faults().condBroadcast.Reset();
    Execute(graph["a"], executor);
    EXPECT_EQ(Faults().condBroadcast.Calls(), 0);
}

// Counts how often the thread that constructs it goes to sleep; tells that thread from others.
class OwnWaits {
public:
    OwnWaits() : self(pthread_self()) {
        Faults().condWait.Before([this] { sleeps += OwnThread() ? 1 : 0; });
    }

    bool OwnThread() const { return pthread_equal(self, pthread_self()) != 0; }

    std::atomic<int> sleeps{0};

private:
    pthread_t self;
};

TEST_F(NodeTest, RunAllLooksOutForTheEndWithoutTheLockBeforeItSleeps) {
    GraphText graph({"a provides x", "b requires x"});
    const OwnWaits own;
    std::atomic<int> turns{0};
    graph["a"].onRun = [&] { EXPECT_TRUE(WaitUntil([&] { return turns > 0; })); };
    Faults().yield.Before([&] {
        if (own.OwnThread()) {
            ++turns;
            EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
            EXPECT_TRUE(WaitUntil([&] { return graph["b"].State() == NodeState::Done; }));
        }
    });
    Executor executor(1, false);
    Node::RunAll(std::vector<Node*>{&graph["a"], &graph["b"]}, executor);
    EXPECT_EQ(own.sleeps, 0);
}

TEST_F(NodeTest, RunAllSleepsWhereTheEndDoesNotComeSoon) {
    GraphText graph({"a"});
    const OwnWaits own;
    graph["a"].onRun = [&] { EXPECT_TRUE(WaitUntil([&] { return own.sleeps > 0; })); };
    Executor executor(1, false);
    Node::RunAll(std::vector<Node*>{&graph["a"]}, executor);
    EXPECT_GT(own.sleeps, 0);
}

TEST_F(NodeTest, RunAllDoesNotWaitForNothing) {
    Executor executor(0, false);
    Node::RunAll(std::vector<Node*>(), executor);
    EXPECT_EQ(Faults().condWait.Calls(), 0);
}

}  // namespace

}  // namespace vantor
