// The hardest question to HeldByCurrentThread(): the asker's own name is still on record from when
// it held the lock, while the next holder is counting itself in. That takes a few instructions,
// which chance hardly ever meets. So the processor's trap flag stops the next holder after each
// single instruction; the asker is the same thread under another name, which needs no scheduler.
#include <gtest/gtest.h>

#include <csignal>

#include "graph/GlobalLock.h"
#include "graph/GraphFaults.h"
#include "support/Sanitizers.h"

// The thread sanitizer's own code must not be stopped half-way.
#if (defined(__x86_64__) || defined(__i386__)) && !defined(VANTOR_THREAD_SANITIZER)

#include <x86intrin.h>

namespace vantor {

namespace {

using support::Faults;

constexpr unsigned trapFlag = 0x100;
constexpr pthread_t askerName = 1;  // of no thread: both are compared only
constexpr pthread_t next = 2;

int steps = 0;
int wrongAnswers = 0;

void Ask(int) {
    Faults().self = askerName;
    ++steps;
    wrongAnswers += GlobalLock::HeldByCurrentThread() ? 1 : 0;
    Faults().self = next;
}

class GlobalLockStepTest : public support::GraphTest {};

TEST_F(GlobalLockStepTest, LastHolderIsNotTheHolderAtAnyInstructionOfTheNextOnesLockAndUnlock) {
    Faults().self = askerName;
    GlobalLock::Lock();
    EXPECT_TRUE(GlobalLock::HeldByCurrentThread());
    GlobalLock::Unlock();

    Faults().self = next;
    const auto oldHandler = std::signal(SIGTRAP, Ask);
    __writeeflags(__readeflags() | trapFlag);
    GlobalLock::Lock();
    GlobalLock::Unlock();
    __writeeflags(__readeflags() & ~trapFlag);
    (void)std::signal(SIGTRAP, oldHandler);

    EXPECT_GT(steps, 20);
    EXPECT_EQ(wrongAnswers, 0);
}

}  // namespace

}  // namespace vantor

#endif
