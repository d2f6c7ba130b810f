#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <atomic>
#include <chrono>
#include <thread>

#include "graph/Executor.h"
#include "graph/GlobalLock.h"
#include "graph/GraphFaults.h"
#include "support/AlertRecorder.h"
#include "support/GraphText.h"
#include "support/Waiting.h"

// When workers sleep, and what wakes them.

namespace vantor {

namespace {

using support::Faults;
using support::GraphText;
using support::WaitUntil;
using ::testing::ElementsAre;

class WakeUpTest : public support::GraphTest {
protected:
    const support::AlertRecorder alerts;
};

TEST_F(WakeUpTest, WakeUpWithoutReasonChangesNothing) {
    Faults().condWait.FailCall(1, 0);
    GraphText graph({"a"});
    Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() >= 2; }));
    graph.Schedule(executor);
    graph.WaitDone();
    EXPECT_THAT(graph.Order(), ElementsAre("a"));
}

TEST_F(WakeUpTest, EverySleepingWorkerIsWokenForEachQueuedNode) {
    constexpr int workers = 4;
    GraphText graph({"a", "b", "c"});
    Executor executor(workers, false);
    int sleeps = workers;
    for (const char* const name : {"a", "b", "c"}) {
        EXPECT_TRUE(WaitUntil([&] { return Faults().condWait.Calls() >= sleeps; }));
        graph[name].Schedule(executor);
        sleeps += workers;
    }
    EXPECT_TRUE(WaitUntil([&] { return Faults().condWait.Calls() >= sleeps; }));
}

TEST_F(WakeUpTest, WorkerIsWokenOnceForAllThatIsQueuedBeforeItHasTheLock) {
    GraphText graph({"a", "b", "c"});
    Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() >= 1; }));
    {
        const GlobalLockGuard guard;
        graph.Schedule(executor);
        EXPECT_EQ(Faults().condBroadcast.Calls(), 1);
    }
    graph.WaitDone();
    EXPECT_THAT(graph.Order(), ElementsAre("a", "b", "c"));
}

TEST_F(WakeUpTest, WorkersAreWokenWithoutTheLock) {
    GraphText graph({"a"});
    std::atomic<bool> heldLock{false};
    Faults().condBroadcast.Before([&] { heldLock = GlobalLock::HeldByCurrentThread(); });
    Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() >= 1; }));
    graph["a"].Schedule(executor);
    EXPECT_EQ(Faults().condBroadcast.Calls(), 1);
    EXPECT_FALSE(heldLock);
}

// Two workers, one of which sleeps while the other one runs "a".
class SleeperTest : public WakeUpTest {
protected:
    void RunFirst(GraphText& graph) {
        graph["a"].onRun = [this] {
            EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() > workers; }));
            broadcasts = Faults().condBroadcast.Calls();
        };
        EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() >= workers; }));
        graph.Schedule(executor);
    }

    static constexpr int workers = 2;
    std::atomic<int> broadcasts{0};  // so many until "a" ended
    Executor executor{workers, false};
};

TEST_F(SleeperTest, SleepersAreWokenForThePluginsBehindABarrier) {
    GraphText graph({"a provides x", "b requires x", "c requires x"});
    std::atomic<int> started{0};
    for (const char* const name : {"b", "c"}) {
        graph[name].onRun = [&] {
            ++started;
            EXPECT_TRUE(WaitUntil([&] { return started == 2; }));
        };
    }
    RunFirst(graph);
    graph.WaitDone();
    EXPECT_EQ(started, 2);
}

TEST_F(SleeperTest, SleepersAreWokenOnceForABarrierAndWhatItMakesReady) {
    GraphText graph({"a provides x", "b requires x"});
    std::atomic<int> broadcastsUntilB{0};
    graph["b"].onRun = [&] { broadcastsUntilB = Faults().condBroadcast.Calls(); };
    RunFirst(graph);
    EXPECT_TRUE(WaitUntil([&] { return graph["b"].State() == NodeState::Done; }));
    EXPECT_EQ(broadcastsUntilB, broadcasts + 1);
}

TEST_F(WakeUpTest, WorkerThatSleptLongSleepsAgainAtOnce) {
    Faults().condWait.FailCall(1, 0);
    Faults().condWait.Before([] { std::this_thread::sleep_for(std::chrono::milliseconds(1)); });
    const Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() >= 2; }));
    EXPECT_EQ(Faults().yield.Calls(), 0);
}

// Every wait ends at once: a worker sleeps briefly, again and again.
class BriefSleepTest : public WakeUpTest {
protected:
    BriefSleepTest() {
        Faults().condWait.FailFrom(1, 0);
        Faults().yield.Before([this] { GiveWay(); });
    }

    // What a worker does that gives way. The first time it stays there until `resumed`.
    void GiveWay() {
        if (!givingWay) {
            heldLock = GlobalLock::HeldByCurrentThread();
            sleepsBefore = Faults().condWait.Calls();
            givingWay = true;
            EXPECT_TRUE(WaitUntil([this] { return resumed.load(); }));
        }
    }

    std::atomic<bool> heldLock{false};
    std::atomic<int> sleepsBefore{0};
    std::atomic<bool> givingWay{false};
    std::atomic<bool> resumed{false};
};

TEST_F(BriefSleepTest, WorkerThatGivesWayDoesNotHoldTheLock) {
    const Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([&] { return givingWay.load(); }));
    EXPECT_GT(sleepsBefore, 0);
    EXPECT_FALSE(heldLock);
    resumed = true;
}

// The plugin is requested while nobody sleeps: no broadcast would wake the worker for it later.
TEST_F(BriefSleepTest, WorkerThatGivesWayTakesWhatIsQueuedMeanwhileWithoutSleeping) {
    GraphText graph({"a"});
    std::atomic<int> sleepsUntilRun{-1};
    graph["a"].onRun = [&] { sleepsUntilRun = Faults().condWait.Calls(); };
    Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([&] { return givingWay.load(); }));
    graph.Schedule(executor);
    resumed = true;
    EXPECT_TRUE(WaitUntil([&] { return graph["a"].State() == NodeState::Done; }));
    EXPECT_EQ(sleepsUntilRun, sleepsBefore);
}

TEST_F(BriefSleepTest, WorkerThatGivesWayWhileThePoolStopsLeavesWithoutSleeping) {
    Faults().threadJoin.Before([&] { resumed = true; });
    {
        const Executor executor(1, false);
        EXPECT_TRUE(WaitUntil([&] { return givingWay.load(); }));
    }
    EXPECT_EQ(Faults().condWait.Calls(), sleepsBefore);
}

}  // namespace

}  // namespace vantor
