// The states of nodes, step by step: an executor without workers queues what is ready and the test
// does the worker's part itself.
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <thread>

#include "graph/GlobalLock.h"
#include "graph/GraphFaults.h"
#include "support/AlertRecorder.h"
#include "support/GraphText.h"
#include "support/Waiting.h"

namespace vantor {

namespace {

using support::Execute;
using support::Faults;
using support::GraphText;
using support::WaitUntil;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class ScheduleTest : public support::GraphTest {
protected:
    const support::AlertRecorder alerts;
    Executor executor{0, false};
};

TEST_F(ScheduleTest, PluginWithoutRequiresIsQueuedByItsFirstSchedule) {
    GraphText graph({"a provides x"});
    graph["a"].Schedule(executor);
    EXPECT_EQ(graph["a"].State(), NodeState::Queued);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Idle);
}

TEST_F(ScheduleTest, PluginRequiringABarrierWhoseProvidersAreAllDoneIsQueuedAtOnce) {
    GraphText graph({"a provides x", "b provides x", "c requires x", "d requires x"});
    graph["a"].MarkDone();
    graph["b"].MarkDone();
    graph["c"].Schedule(executor);
    Execute(graph.Barrier("x"), executor);
    EXPECT_EQ(graph["c"].State(), NodeState::Queued);

    graph["d"].Schedule(executor);
    EXPECT_EQ(graph["d"].State(), NodeState::Queued);
}

TEST_F(ScheduleTest, BarrierWhoseProvidersAreAllDoneIsQueuedByItsFirstRequirer) {
    GraphText graph({"a provides x", "b requires x"});
    graph["a"].MarkDone();
    graph["b"].Schedule(executor);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Queued);
    EXPECT_EQ(graph["b"].State(), NodeState::Waiting);
}

TEST_F(ScheduleTest, DependenciesAreRequestedBeforeThePluginThatWaitsForThem) {
    GraphText graph({"a provides x", "b requires x provides y", "c requires y"});
    graph["c"].Schedule(executor);
    EXPECT_EQ(graph["a"].State(), NodeState::Queued);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Waiting);
    EXPECT_EQ(graph["b"].State(), NodeState::Waiting);
    EXPECT_EQ(graph.Barrier("y").State(), NodeState::Waiting);
    EXPECT_EQ(graph["c"].State(), NodeState::Waiting);
}

TEST_F(ScheduleTest, NodeIsQueuedByTheLastOfItsDependenciesToFinish) {
    GraphText graph({"a provides x", "b provides x", "c requires x"});
    graph["c"].Schedule(executor);
    Execute(graph["b"], executor);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Waiting);
    Execute(graph["a"], executor);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Queued);
    EXPECT_EQ(graph["c"].State(), NodeState::Waiting);
    Execute(graph.Barrier("x"), executor);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Done);
    EXPECT_EQ(graph["c"].State(), NodeState::Queued);
}

TEST_F(ScheduleTest, NodeIsQueuedOnceHoweverOftenItIsRequested) {
    GraphText graph({"a"});
    for (int request = 0; request < 3; ++request) {
        graph["a"].Schedule(executor);
    }
    const GlobalLockGuard guard;
    EXPECT_EQ(&executor.TakeNext(), &graph["a"]);
    EXPECT_FALSE(executor.HasReady());
}

TEST_F(ScheduleTest, WaitingNodeStaysWaitingHoweverOftenItIsRequested) {
    GraphText graph({"a provides x", "b requires x"});
    for (int request = 0; request < 3; ++request) {
        graph["b"].Schedule(executor);
        EXPECT_EQ(graph["b"].State(), NodeState::Waiting);
    }
    Execute(graph["a"], executor);
    Execute(graph.Barrier("x"), executor);
    EXPECT_EQ(graph["b"].State(), NodeState::Queued);
}

TEST_F(ScheduleTest, DoneNodeIsNotQueuedAgain) {
    GraphText graph({"a"});
    graph["a"].MarkDone();
    graph["a"].Schedule(executor);
    EXPECT_EQ(graph["a"].State(), NodeState::Done);
    const GlobalLockGuard guard;
    EXPECT_FALSE(executor.HasReady());
}

TEST_F(ScheduleTest, NodeStaysQueuedWhileItRunsAndIsDoneAfterwards) {
    GraphText graph({"a"});
    NodeState whileRunning = NodeState::Idle;
    graph["a"].onRun = [&] { whileRunning = graph["a"].State(); };
    graph["a"].Schedule(executor);
    Execute(graph["a"], executor);
    EXPECT_EQ(whileRunning, NodeState::Queued);
    EXPECT_EQ(graph["a"].State(), NodeState::Done);
}

TEST_F(ScheduleTest, NodeRunsWithoutTheLock) {
    GraphText graph({"a"});
    bool held = true;
    graph["a"].onRun = [&] { held = GlobalLock::HeldByCurrentThread(); };
    Execute(graph["a"], executor);
    EXPECT_FALSE(held);
}

TEST_F(ScheduleTest, DependentThatNobodyRequestedIsLeftAlone) {
    GraphText graph({"a provides x", "b requires x"});
    graph["a"].Schedule(executor);
    Execute(graph["a"], executor);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Idle);
    EXPECT_EQ(graph["b"].State(), NodeState::Idle);
}

TEST_F(ScheduleTest, BarrierThatIsOnlyProvidedIsNeverRun) {
    GraphText graph({"a provides x"});
    EXPECT_THAT(graph.Run(1), ElementsAre("a"));
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Idle);
}

TEST_F(ScheduleTest, MarkDoneLooksAtNoDependentAndWakesNobody) {
    GraphText graph({"a provides x", "b requires x"});
    graph["b"].Schedule(executor);
    Faults().condBroadcast.Reset();
    graph["a"].MarkDone();
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Waiting);
    EXPECT_EQ(Faults().condBroadcast.Calls(), 0);
}

// The barrier was queued before, so that the plugin that is skipped still counts as a provider.
TEST_F(ScheduleTest, ProviderThatIsOnlyMarkedDoneCountsAsAProvider) {
    GraphText graph({"a provides x", "b requires x"});
    graph["a"].MarkDone();
    EXPECT_THAT(graph.Run(1), ElementsAre("b"));
    EXPECT_THAT(alerts.Texts(), IsEmpty());
}

TEST_F(ScheduleTest, WaitDoneBlocksUntilTheNodeHasRun) {
    GraphText graph({"a"});
    std::atomic<bool> returned{false};
    std::thread waiter([&] {
        graph["a"].WaitDone();
        returned = true;
    });
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() > 0; }));
    EXPECT_FALSE(returned);
    Execute(graph["a"], executor);
    waiter.join();
    EXPECT_TRUE(returned);
}

TEST_F(ScheduleTest, EveryWaiterIsWoken) {
    GraphText graph({"a"});
    std::vector<std::thread> waiters;
    for (int i = 0; i < 5; ++i) {
        waiters.emplace_back([&] { graph["a"].WaitDone(); });
    }
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() == 5; }));
    Execute(graph["a"], executor);
    for (std::thread& waiter : waiters) {
        waiter.join();
    }
    EXPECT_EQ(graph["a"].State(), NodeState::Done);
}

// A wake-up that nobody caused: the waiter looks at the state again and goes on waiting.
TEST_F(ScheduleTest, WaitDoneSurvivesAWakeUpWithoutReason) {
    GraphText graph({"a"});
    Faults().condWait.FailCall(1, 0);
    std::thread waiter([&] { graph["a"].WaitDone(); });
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() == 2; }));
    Execute(graph["a"], executor);
    waiter.join();
    EXPECT_EQ(graph["a"].State(), NodeState::Done);
}

//   a -> x -> b -> y -> a          c
TEST_F(ScheduleTest, NodesOnACycleWaitForEverAndTheOthersRun) {
    GraphText graph({"a requires y provides x", "b requires x provides y", "c"});
    graph.Schedule(executor);
    Execute(graph["c"], executor);
    EXPECT_EQ(graph["a"].State(), NodeState::Waiting);
    EXPECT_EQ(graph["b"].State(), NodeState::Waiting);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Waiting);
    EXPECT_EQ(graph.Barrier("y").State(), NodeState::Waiting);
    EXPECT_EQ(graph["c"].State(), NodeState::Done);
}

TEST_F(ScheduleTest, PluginThatRequiresWhatItProvidesWaitsForEver) {
    GraphText graph({"a requires x provides x"});
    graph["a"].Schedule(executor);
    EXPECT_EQ(graph["a"].State(), NodeState::Waiting);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Waiting);
}

}  // namespace

}  // namespace vantor
