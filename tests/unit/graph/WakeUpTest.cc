#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <signal.h>

#include <atomic>
#include <chrono>
#include <initializer_list>
#include <list>
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

TEST_F(WakeUpTest, SingleWorkerGivesWayBeforeItSleepsForTheFirstTime) {
    std::atomic<int> yields{-1};
    Faults().condWait.Before([&] { yields = Faults().yield.Calls(); });
    const Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([&] { return yields >= 0; }));
    EXPECT_GT(yields, 0);
}

// How often the only worker gives way between the end of its only node and its next sleep.
int YieldsAfterANodeOf(std::chrono::microseconds time) {
    GraphText graph({"a"});
    std::atomic<int> yields{0};
    graph["a"].onRun = [&] {
        if (time.count() > 0) {
            std::this_thread::sleep_for(time);
        }
        yields = Faults().yield.Calls();
    };
    const int sleeps = Faults().condWait.Calls();
    Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([&] { return Faults().condWait.Calls() == sleeps + 1; }));
    graph.Schedule(executor);
    EXPECT_TRUE(WaitUntil([&] { return Faults().condWait.Calls() == sleeps + 2; }));
    return Faults().yield.Calls() - yields;
}

TEST_F(WakeUpTest, SingleWorkerSleepsAtOnceAfterLongWork) {
    EXPECT_EQ(YieldsAfterANodeOf(std::chrono::milliseconds(1)), 0);
}

// How long the node takes is for the machine to say: it is tried until it was short enough.
TEST_F(WakeUpTest, SingleWorkerGivesWayAgainAfterShortWork) {
    EXPECT_TRUE(WaitUntil([] { return YieldsAfterANodeOf({}) > 0; }));
}

TEST_F(WakeUpTest, PluginDoesNotFindSigchldBlockedByTheSleepBefore) {
    GraphText graph({"a"});
    int isBlocked = -1;
    graph["a"].onRun = [&] {
        sigset_t mask;
        pthread_sigmask(SIG_BLOCK, nullptr, &mask);
        isBlocked = sigismember(&mask, SIGCHLD);
    };
    Executor executor(1, false);
    EXPECT_TRUE(WaitUntil([] { return Faults().condWait.Calls() >= 1; }));
    graph.Schedule(executor);
    graph.WaitDone();
    EXPECT_EQ(isBlocked, 0);
}

// Two workers. One runs "a" and then "b", which is queued `pause` after the other one has gone to
// sleep; that one is woken for it in vain.
class PaceTest : public WakeUpTest {
protected:
    PaceTest() { EXPECT_TRUE(SleepsReach(workers)); }

    // How often a worker gave way between being woken in vain and sleeping again.
    int YieldsOfTheOther(std::chrono::microseconds pause) {
        GraphText& graph =
            graphs.emplace_back(std::initializer_list<const char*>{"a provides x", "b requires x"});
        const int sleeps = Faults().condWait.Calls();
        std::atomic<int> yields{0};
        graph["a"].onRun = [&] {
            EXPECT_TRUE(SleepsReach(sleeps + 1));
            if (pause.count() > 0) {
                std::this_thread::sleep_for(pause);
            }
            yields = Faults().yield.Calls();
        };
        graph["b"].onRun = [&] {
            EXPECT_TRUE(SleepsReach(sleeps + 2));
            yields = Faults().yield.Calls() - yields;
        };
        graph.Schedule(executor);
        EXPECT_TRUE(SleepsReach(sleeps + 3));
        return yields;
    }

    // Watches without a pause, which would be one in the coming of the nodes.
    static bool SleepsReach(int count) {
        const auto end = std::chrono::steady_clock::now() + std::chrono::minutes(1);
        while (Faults().condWait.Calls() < count) {
            if (std::chrono::steady_clock::now() > end) {
                return false;
            }
        }
        return true;
    }

    static constexpr int workers = 2;
    static constexpr std::chrono::milliseconds longTime{1};
    std::list<GraphText> graphs;
    Executor executor{workers, false};
};

TEST_F(PaceTest, WorkerWokenInVainSleepsAgainAtOnceWhereNodesTakeLong) {
    EXPECT_EQ(YieldsOfTheOther(longTime), 0);
}

// How soon the node comes here is for the machine to say: it is tried until it was soon enough.
TEST_F(PaceTest, WorkerWokenInVainGivesWayFirstWhereNodesComeSoonAgain) {
    YieldsOfTheOther(longTime);
    EXPECT_TRUE(WaitUntil([this] { return YieldsOfTheOther({}) > 0; }));
}

// Two workers that find no node and give way before they sleep, until `resumed`.
class LookOutTest : public WakeUpTest {
protected:
    LookOutTest() {
        Faults().yield.Before([this] {
            heldLock = heldLock || GlobalLock::HeldByCurrentThread();
            ++turns;
            EXPECT_TRUE(WaitUntil([this] { return resumed.load(); }));
        });
    }

    bool AllGiveWay() {
        return WaitUntil([this] { return turns == workers; });
    }

    static constexpr int workers = 2;
    std::atomic<bool> heldLock{false};
    std::atomic<int> turns{0};
    std::atomic<bool> resumed{false};
};

TEST_F(LookOutTest, WorkerThatGivesWayDoesNotHoldTheLock) {
    const Executor executor(workers, false);
    EXPECT_TRUE(AllGiveWay());
    EXPECT_FALSE(heldLock);
    resumed = true;
}

// The plugins are requested while nobody sleeps: no broadcast would wake a worker for them later.
TEST_F(LookOutTest, WorkersThatGiveWayTakeWhatIsQueuedMeanwhileWithoutSleeping) {
    GraphText graph({"a", "b"});
    std::atomic<int> started{0};
    std::atomic<int> sleeps{0};
    for (const char* const name : {"a", "b"}) {
        graph[name].onRun = [&] {
            sleeps += Faults().condWait.Calls();
            ++started;
            EXPECT_TRUE(WaitUntil([&] { return started == workers; }));
        };
    }
    Executor executor(workers, false);
    EXPECT_TRUE(AllGiveWay());
    graph.Schedule(executor);
    resumed = true;
    EXPECT_TRUE(WaitUntil([&] { return started == workers; }));
    graph.WaitDone();
    EXPECT_EQ(sleeps, 0);
}

TEST_F(LookOutTest, WorkersThatGiveWayWhileThePoolStopsLeaveWithoutSleeping) {
    Faults().threadJoin.Before([&] { resumed = true; });
    {
        const Executor executor(workers, false);
        EXPECT_TRUE(AllGiveWay());
    }
    EXPECT_EQ(Faults().condWait.Calls(), 0);
}

}  // namespace

}  // namespace vantor
