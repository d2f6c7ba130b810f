// The hardest question to HeldByCurrentThread(): the asker's own name is still on record from when
// it held the lock, while the next holder is counting itself in. That takes a few instructions,
// which chance hardly ever meets. So the next holder is stopped after each single instruction, by
// the processor's trap flag, until the asker has asked.
#include <gtest/gtest.h>
#include <sched.h>

#include <atomic>
#include <csignal>
#include <thread>

#include "graph/GlobalLock.h"
#include "support/Sanitizers.h"
#include "support/Waiting.h"

// The thread sanitizer's own code must not be stopped half-way.
#if (defined(__x86_64__) || defined(__i386__)) && !defined(VANTOR_THREAD_SANITIZER)

#include <x86intrin.h>

namespace vantor {

namespace {

constexpr unsigned trapFlag = 0x100;

std::atomic<long> asks{0};
std::atomic<int> steps{0};

void LetTheAskerAsk(int) {
    ++steps;
    // The first ask may have begun before the stop; the second has not.
    const long wanted = asks + 2;
    while (asks < wanted) {
        sched_yield();
    }
}

TEST(GlobalLockStepTest, LastHolderIsNotTheHolderAtAnyInstructionOfTheNextOnesLockAndUnlock) {
    std::atomic<bool> asking{true};
    std::atomic<int> wrong{0};
    std::thread asker([&] {
        { const GlobalLockGuard guard; }
        while (asking) {
            wrong += GlobalLock::HeldByCurrentThread() ? 1 : 0;
            ++asks;
        }
    });
    EXPECT_TRUE(support::WaitUntil([] { return asks > 0; }));

    const auto oldHandler = std::signal(SIGTRAP, LetTheAskerAsk);
    __writeeflags(__readeflags() | trapFlag);
    GlobalLock::Lock();
    GlobalLock::Unlock();
    __writeeflags(__readeflags() & ~trapFlag);
    (void)std::signal(SIGTRAP, oldHandler);

    asking = false;
    asker.join();
    EXPECT_GT(steps, 20);
    EXPECT_EQ(wrong, 0);
}

}  // namespace

}  // namespace vantor

#endif
