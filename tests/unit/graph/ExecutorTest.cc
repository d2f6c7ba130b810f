#include "graph/Executor.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <algorithm>
#include <atomic>
#include <chrono>
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

class ExecutorTest : public support::GraphTest {
protected:
    const support::AlertRecorder alerts;
};

std::size_t PickNext(const Executor& executor) {
    const GlobalLockGuard guard;
    return executor.PickNext();
}

TEST_F(ExecutorTest, OneWorkerRunsIndependentPluginsInTheOrderInWhichTheyWereRequested) {
    GraphText graph({"d", "b", "a", "c", "e"});
    EXPECT_THAT(graph.Run(1), ElementsAre("d", "b", "a", "c", "e"));
}

// Requested while the worker is already at work, as the driver does it.
TEST_F(ExecutorTest, OneWorkerKeepsThatOrderWhileRequestsStillComeIn) {
    GraphText graph({"d", "b", "a", "c", "e"});
    Executor executor(1, false);
    for (const char* const name : {"d", "b", "a", "c", "e"}) {
        graph[name].Schedule(executor);
    }
    graph.WaitDone();
    EXPECT_THAT(graph.Order(), ElementsAre("d", "b", "a", "c", "e"));
}

//   first          provider -> x -> requirer
TEST_F(ExecutorTest, ProviderOfARequiredBarrierRunsBeforeAnIndependentPluginQueuedEarlier) {
    GraphText graph({"first", "provider provides x", "requirer requires x"});
    EXPECT_THAT(graph.Run(1), ElementsAre("provider", "first", "requirer"));
}

//   long -> x -> middle -> y -> end        short -> z -> last        alone
TEST_F(ExecutorTest, HighestGoesFirstAtEveryChoice) {
    GraphText graph({"alone", "short provides z", "last requires z", "end requires y",
                     "middle requires x provides y", "long provides x"});
    EXPECT_THAT(graph.Run(1), ElementsAre("long", "short", "middle", "alone", "last", "end"));
}

TEST_F(ExecutorTest, PickNextReturnsTheFirstOfTheHighest) {
    GraphText graph({"low", "a provides x", "lower", "b provides x", "c requires x"});
    Executor executor(0, false);
    graph.Schedule(executor);
    EXPECT_EQ(PickNext(executor), 0U);
    EXPECT_EQ(Faults().rand.Calls(), 0);
}

// a, b and c, the highest, are the choice.
TEST_F(ExecutorTest, RandomPickIsTheDrawModuloTheNumberOfTheHighest) {
    GraphText graph(
        {"low", "a provides x", "lower", "b provides x", "c provides x", "d requires x"});
    Executor executor(0, true);
    graph.Schedule(executor);
    Faults().draws = {0, 1, 2, 3, 4, 5, 2147483647};
    std::vector<std::size_t> picks;
    while (!Faults().draws.empty()) {
        picks.push_back(PickNext(executor));
    }
    EXPECT_THAT(picks, ElementsAre(0, 1, 2, 0, 1, 2, 1));
}

TEST_F(ExecutorTest, RandomPickDrawsOnceAlsoWhenThereIsNoChoice) {
    GraphText graph({"low", "a provides x", "b requires x"});
    Executor executor(0, true);
    graph.Schedule(executor);
    Faults().draws = {5, 6};
    EXPECT_EQ(PickNext(executor), 0U);
    EXPECT_THAT(Faults().draws, ElementsAre(6));
}

TEST_F(ExecutorTest, RandomisedOrderChangesThePlacesOfEqualsOnly) {
    GraphText graph({"a", "b", "c", "high provides x", "higher provides x", "last requires x"});
    // high or higher; the other; x itself; then a, b, c and last in the order of their readiness.
    Faults().draws = {1, 0, 0, 3, 1, 1, 0};
    EXPECT_THAT(graph.Run(1, true), ElementsAre("higher", "high", "last", "b", "c", "a"));
}

TEST_F(ExecutorTest, RandomGeneratorIsNeverSeeded) {
    GraphText graph({"a", "b", "c", "d"});
    graph.Run(1, true);
    EXPECT_GT(Faults().rand.Calls(), 0);
    EXPECT_EQ(Faults().srand.Calls(), 0);
}

class NoWorkersTest : public ExecutorTest, public ::testing::WithParamInterface<int> {};

TEST_P(NoWorkersTest, ThreadCountBelow1CreatesNoWorkersAndWaitDoneBlocks) {
    GraphText graph({"a"});
    Executor executor(GetParam(), false);
    graph.Schedule(executor);
    EXPECT_EQ(Faults().threadCreate.Calls(), 0);

    std::atomic<bool> returned{false};
    std::thread waiter([&] {
        graph.WaitDone();
        returned = true;
    });
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() > 0; }));
    EXPECT_FALSE(returned);
    EXPECT_EQ(graph["a"].State(), NodeState::Queued);
    // Nobody else will: the test does the worker's part, so that the waiter can leave.
    Execute(graph["a"], executor);
    waiter.join();
}

INSTANTIATE_TEST_SUITE_P(For, NoWorkersTest, ::testing::Values(0, -1, -8, INT32_MIN));

TEST_F(ExecutorTest, CreatesAsManyThreadsAsAskedForAndJoinsThemInOrderOfCreation) {
    {
        const Executor executor(8, false);
        EXPECT_EQ(Faults().created.size(), 8U);
    }
    EXPECT_EQ(Faults().joined, Faults().created);
}

// Each of the eight waits until all eight run.
TEST_F(ExecutorTest, EightWorkersRunEightPluginsAtOnceAndNeverMore) {
    GraphText graph({"a", "b", "c", "d", "e", "f", "g", "h", "i", "j", "k", "l"});
    std::atomic<int> running{0};
    std::atomic<int> most{0};
    for (const char* const name : {"a", "b", "c", "d", "e", "f", "g", "h", "i", "j", "k", "l"}) {
        graph[name].onRun = [&] {
            const int now = ++running;
            for (int seen = most; seen < now && !most.compare_exchange_weak(seen, now);) {
            }
            EXPECT_TRUE(WaitUntil([&] { return most >= 8; }));
            --running;
        };
    }
    graph.Run(8);
    EXPECT_EQ(most, 8);
    EXPECT_EQ(graph.Order().size(), 12U);
}

TEST_F(ExecutorTest, OneWorkerRunsOnePluginAtATime) {
    GraphText graph({"a", "b provides x", "c requires x", "d"});
    std::atomic<int> running{0};
    std::atomic<bool> together{false};
    for (const char* const name : {"a", "b", "c", "d"}) {
        graph[name].onRun = [&] {
            if (++running > 1) {
                together = true;
            }
            --running;
        };
    }
    graph.Run(1);
    EXPECT_FALSE(together);
}

// The main thread takes the lock while the plugin runs.
TEST_F(ExecutorTest, PluginRunsWithoutTheLock) {
    GraphText graph({"a"});
    std::atomic<bool> begun{false};
    std::atomic<bool> locked{false};
    graph["a"].onRun = [&] {
        EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
        begun = true;
        EXPECT_TRUE(WaitUntil([&] { return locked.load(); }));
    };
    Executor executor(1, false);
    graph.Schedule(executor);
    EXPECT_TRUE(WaitUntil([&] { return begun.load(); }));
    {
        const GlobalLockGuard guard;
        locked = true;
    }
    graph.WaitDone();
    EXPECT_TRUE(locked);
}

TEST_F(ExecutorTest, PluginsRunOnWorkersNotOnTheRequestingThread) {
    GraphText graph({"a", "b"});
    std::vector<std::thread::id> ids;
    graph["a"].onRun = graph["b"].onRun = [&] { ids.push_back(std::this_thread::get_id()); };
    graph.Run(1);
    ASSERT_EQ(ids.size(), 2U);
    EXPECT_EQ(ids[0], ids[1]);
    EXPECT_NE(ids[0], std::this_thread::get_id());
}

TEST_F(ExecutorTest, PluginRequestedLaterRunsToo) {
    GraphText graph({"a", "b requires x", "c provides x"});
    Executor executor(2, false);
    graph["a"].Schedule(executor);
    graph["a"].WaitDone();
    graph["b"].Schedule(executor);
    graph["b"].WaitDone();
    EXPECT_THAT(graph.Order(), ElementsAre("a", "c", "b"));
}

// "running" holds the only worker while the executor is being destroyed: reaching the join means
// that the pool has been told to stop.
TEST_F(ExecutorTest, WorkerFinishesTheNodeItRunsWhenThePoolStopsAndTheRestIsNeverRun) {
    GraphText graph({"running provides x", "next requires x", "queued"});
    std::atomic<bool> begun{false};
    std::atomic<bool> joining{false};
    graph["running"].onRun = [&] {
        begun = true;
        EXPECT_TRUE(WaitUntil([&] { return joining.load(); }));
    };
    Faults().threadJoin.Before([&] { joining = true; });
    {
        Executor executor(1, false);
        graph.Schedule(executor);
        EXPECT_TRUE(WaitUntil([&] { return begun.load(); }));
    }
    EXPECT_THAT(graph.Order(), ElementsAre("running"));
    EXPECT_EQ(graph["running"].State(), NodeState::Done);
    EXPECT_EQ(graph.Barrier("x").State(), NodeState::Queued);
    EXPECT_EQ(graph["next"].State(), NodeState::Waiting);
    EXPECT_EQ(graph["queued"].State(), NodeState::Queued);
}

// Workers that have not begun yet, that are about to sleep and that sleep: all must leave.
TEST_F(ExecutorTest, PoolWithNothingToDoStopsAtAnyMoment) {
    for (int round = 0; round < 200; ++round) {
        Executor executor(round % 9, false);
        if (round % 2 == 0) {
            std::this_thread::yield();
        }
    }
    EXPECT_EQ(Faults().joined, Faults().created);
}

TEST_F(ExecutorTest, SecondExecutorRunsWhatTheFirstLeft) {
    GraphText graph({"a", "b requires x", "c provides x"});
    {
        Executor first(1, false);
        graph["a"].Schedule(first);
        graph["a"].WaitDone();
    }
    EXPECT_THAT(graph.Run(1), ElementsAre("a", "c", "b"));
}

}  // namespace

}  // namespace vantor
