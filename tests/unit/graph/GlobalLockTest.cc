#include "graph/GlobalLock.h"

#include <gtest/gtest.h>
#include <pthread.h>
#include <signal.h>

#include <atomic>
#include <csignal>
#include <thread>
#include <vector>

#include "graph/GraphFaults.h"
#include "support/Sanitizers.h"
#include "support/Waiting.h"

namespace vantor {

namespace {

using support::Faults;
using support::WaitUntil;

constexpr int threadCount = 6;
constexpr int rounds = support::underSanitizers ? 3000 : 30000;

template <typename Work>
void OnThreads(int count, Work work) {
    std::vector<std::thread> threads;
    for (int i = 0; i < count; ++i) {
        threads.emplace_back(work);
    }
    for (std::thread& thread : threads) {
        thread.join();
    }
}

TEST(GlobalLockTest, IsHeldBetweenLockAndUnlock) {
    EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
    GlobalLock::Lock();
    EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
    GlobalLock::Unlock();
    EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
}

TEST(GlobalLockTest, IsHeldUntilTheLastOfNestedUnlocks) {
    for (int depth = 0; depth < 3; ++depth) {
        GlobalLock::Lock();
    }
    for (int depth = 0; depth < 3; ++depth) {
        EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
        GlobalLock::Unlock();
    }
    EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
}

TEST(GlobalLockTest, IsNotHeldByAnotherThreadThanTheHolder) {
    const GlobalLockGuard guard;
    std::thread([] { EXPECT_FALSE(GlobalLock::HeldByCurrentThread()); }).join();
}

TEST(GlobalLockTest, IsHeldByOneThreadAtATime) {
    int unguarded = 0;
    OnThreads(threadCount, [&unguarded] {
        for (int round = 0; round < rounds; ++round) {
            GlobalLock::Lock();
            GlobalLock::Lock();
            ++unguarded;
            GlobalLock::Unlock();
            ++unguarded;
            GlobalLock::Unlock();
        }
    });
    EXPECT_EQ(unguarded, 2 * rounds * threadCount);
}

// The asker has never held the lock: no name but another's can be on record.
TEST(GlobalLockTest, ThreadThatNeverHeldItIsNeverTheHolderWhileOthersLockWildly) {
    std::atomic<bool> asking{true};
    std::atomic<long> asked{0};
    std::atomic<int> wrong{0};
    std::thread asker([&] {
        while (asking) {
            wrong += GlobalLock::HeldByCurrentThread() ? 1 : 0;
            ++asked;
        }
    });
    OnThreads(threadCount, [] {
        for (int round = 0; round < rounds; ++round) {
            const GlobalLockGuard outer;
            const GlobalLockGuard inner;
        }
    });
    EXPECT_TRUE(WaitUntil([&] { return asked > 0; }));
    asking = false;
    asker.join();
    EXPECT_EQ(wrong, 0);
}

TEST(GlobalLockTest, ThreadThatHasLetItGoIsNeverTheHolderWhileOthersLockWildly) {
    std::atomic<int> wrong{0};
    OnThreads(threadCount, [&wrong] {
        for (int round = 0; round < rounds; ++round) {
            {
                const GlobalLockGuard guard;
                wrong += GlobalLock::HeldByCurrentThread() ? 0 : 1;
            }
            for (int ask = 0; ask < 5; ++ask) {
                wrong += GlobalLock::HeldByCurrentThread() ? 1 : 0;
            }
        }
    });
    EXPECT_EQ(wrong, 0);
}

// One waiter and what it saw of the lock.
struct Waiter {
    pthread_cond_t condition = PTHREAD_COND_INITIALIZER;
    bool waiting = false;  // guarded by GlobalLock, as is `ready`
    bool ready = false;
    bool heldAfterWait = false;
    bool heldAfterUnlock = true;

    void Run() {
        GlobalLock::Lock();
        waiting = true;
        while (!ready) {
            GlobalLock::Wait(condition);
        }
        heldAfterWait = GlobalLock::HeldByCurrentThread();
        GlobalLock::Unlock();
        heldAfterUnlock = GlobalLock::HeldByCurrentThread();
    }

    bool IsWaiting() {
        const GlobalLockGuard guard;
        return waiting;
    }

    void Wake() {
        const GlobalLockGuard guard;
        ready = true;
        GlobalLock::Broadcast(condition);
    }
};

TEST(GlobalLockTest, WaitLetsOthersHoldItMeanwhile) {
    Waiter waiter;
    std::thread thread([&] { waiter.Run(); });
    // Seeing the flag means holding the lock after the waiter has begun to wait.
    EXPECT_TRUE(WaitUntil([&] { return waiter.IsWaiting(); }));
    EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
    {
        const GlobalLockGuard guard;
        EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
    }
    waiter.Wake();
    thread.join();
}

TEST(GlobalLockTest, WaitTakesItAgainAndHoldsItOnce) {
    Waiter waiter;
    std::thread thread([&] { waiter.Run(); });
    EXPECT_TRUE(WaitUntil([&] { return waiter.IsWaiting(); }));
    waiter.Wake();
    thread.join();
    EXPECT_TRUE(waiter.heldAfterWait);
    EXPECT_FALSE(waiter.heldAfterUnlock);
}

TEST(GlobalLockTest, BroadcastWakesEveryWaiter) {
    pthread_cond_t condition = PTHREAD_COND_INITIALIZER;
    int waiting = 0;
    bool ready = false;
    std::thread waker([&] {
        EXPECT_TRUE(WaitUntil([&] {
            const GlobalLockGuard guard;
            return waiting == threadCount;
        }));
        const GlobalLockGuard guard;
        ready = true;
        GlobalLock::Broadcast(condition);
    });
    OnThreads(threadCount, [&] {
        const GlobalLockGuard guard;
        ++waiting;
        while (!ready) {
            GlobalLock::Wait(condition);
        }
        --waiting;
    });
    waker.join();
    EXPECT_EQ(waiting, 0);
}

// What becomes of SIGCHLD in a thread that waits, in a wait that ends at once.
class SigchldTest : public support::GraphTest {
protected:
    SigchldTest() {
        Faults().condWait.FailCall(1, 0);
        pthread_sigmask(SIG_BLOCK, nullptr, &before);
    }
    ~SigchldTest() override { pthread_sigmask(SIG_SETMASK, &before, nullptr); }

    static void WaitOnce() {
        pthread_cond_t condition = PTHREAD_COND_INITIALIZER;
        const GlobalLockGuard guard;
        GlobalLock::Wait(condition);
    }

    static bool IsBlocked() {
        sigset_t mask;
        pthread_sigmask(SIG_BLOCK, nullptr, &mask);
        return sigismember(&mask, SIGCHLD) == 1;
    }

    sigset_t before{};
};

TEST_F(SigchldTest, IsBlockedOnlyWhileTheThreadWaits) {
    bool blockedMeanwhile = false;
    Faults().condWait.Before([&] { blockedMeanwhile = IsBlocked(); });
    WaitOnce();
    EXPECT_TRUE(blockedMeanwhile);
    EXPECT_FALSE(IsBlocked());
}

TEST_F(SigchldTest, StaysBlockedWhereItWasBefore) {
    sigset_t set;
    sigemptyset(&set);
    sigaddset(&set, SIGCHLD);
    pthread_sigmask(SIG_BLOCK, &set, nullptr);
    WaitOnce();
    EXPECT_TRUE(IsBlocked());
}

volatile std::sig_atomic_t handled = 0;

TEST_F(SigchldTest, IsDeliveredAfterTheWait) {
    handled = 0;
    const auto oldHandler = std::signal(SIGCHLD, [](int) { handled = handled + 1; });
    std::sig_atomic_t handledMeanwhile = -1;
    Faults().condWait.Before([&] {
        pthread_kill(pthread_self(), SIGCHLD);
        handledMeanwhile = handled;
    });
    WaitOnce();
    (void)std::signal(SIGCHLD, oldHandler);
    EXPECT_EQ(handledMeanwhile, 0);
    EXPECT_EQ(handled, 1);
}

TEST(GlobalLockGuardTest, HoldsTheLockWhileItLives) {
    {
        const GlobalLockGuard guard;
        EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
    }
    EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
}

TEST(GlobalLockGuardTest, CanReleaseAndRetakeInBetween) {
    {
        GlobalLockGuard guard;
        guard.Release();
        EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
        guard.Retake();
        EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
    }
    EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
}

TEST(GlobalLockGuardTest, ReleasedOneLeavesTheLockOfAnOuterOneAlone) {
    const GlobalLockGuard outer;
    {
        GlobalLockGuard inner;
        inner.Release();
        EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
    }
    EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
}

TEST(GlobalLockGuardTest, ReleasedLockCanBeTakenByAnotherThread) {
    GlobalLockGuard guard;
    guard.Release();
    bool held = false;
    std::thread([&held] {
        const GlobalLockGuard other;
        held = GlobalLock::HeldByCurrentThread();
    }).join();
    EXPECT_TRUE(held);
    guard.Retake();
}

}  // namespace

}  // namespace vantor
