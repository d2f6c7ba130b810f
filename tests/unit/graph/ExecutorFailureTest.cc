#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cerrno>
#include <csignal>
#include <stdexcept>

#include "graph/Executor.h"
#include "graph/GlobalLock.h"
#include "graph/GraphFaults.h"
#include "plugins/Exceptions.h"
#include "support/ErrorText.h"
#include "support/GraphText.h"
#include "support/Waiting.h"

namespace vantor {

namespace {

using support::Faults;

class ExecutorFailureTest : public support::GraphTest {
protected:
    static std::string ErrorOfPool(std::int32_t threadCount) {
        return support::ErrorText<Exception>([&] { const Executor executor(threadCount, false); });
    }
};

TEST_F(ExecutorFailureTest, ConditionVariableThatCannotBeInitialisedLeavesNoThreadBehind) {
    Faults().condInit.FailCall(1, EAGAIN);
    EXPECT_EQ(ErrorOfPool(8), "Condition variable for Executor could not be initialized");
    EXPECT_EQ(Faults().threadCreate.Calls(), 0);
}

TEST_F(ExecutorFailureTest, FirstThreadThatCannotBeCreatedReads0CreatedAnd8Requested) {
    Faults().threadCreate.FailFrom(1, EAGAIN);
    EXPECT_EQ(ErrorOfPool(8), "Could not create enough execution threads. (0 created, 8requested)");
    EXPECT_EQ(Faults().threadCreate.Calls(), 1);
    EXPECT_THAT(Faults().joined, ::testing::IsEmpty());
}

TEST_F(ExecutorFailureTest, FifthThreadThatCannotBeCreatedReads4CreatedAnd8Requested) {
    Faults().threadCreate.FailCall(5, EAGAIN);
    EXPECT_EQ(ErrorOfPool(8), "Could not create enough execution threads. (4 created, 8requested)");
    EXPECT_EQ(Faults().threadCreate.Calls(), 5);
}

TEST_F(ExecutorFailureTest, OnlyThreadThatCannotBeCreatedReads0CreatedAnd1Requested) {
    Faults().threadCreate.FailCall(1, EAGAIN);
    EXPECT_EQ(ErrorOfPool(1), "Could not create enough execution threads. (0 created, 1requested)");
}

TEST_F(ExecutorFailureTest, CreatedWorkersAreJoinedInOrderBeforeTheExceptionLeaves) {
    for (int failing = 2; failing <= 8; ++failing) {
        Faults().Reset();
        Faults().threadCreate.FailCall(failing, EAGAIN);
        EXPECT_THROW(Executor(8, false), Exception);
        EXPECT_EQ(Faults().created.size(), static_cast<std::size_t>(failing - 1));
        EXPECT_EQ(Faults().joined, Faults().created);
    }
}

// Each worker can only leave its wait by taking the lock.
TEST_F(ExecutorFailureTest, WorkersThatAlreadySleepCanLeave) {
    Faults().threadCreate.FailCall(5, EAGAIN);
    Faults().threadCreate.Before([] {
        if (Faults().threadCreate.Calls() == 5) {
            EXPECT_TRUE(support::WaitUntil([] { return Faults().condWait.Calls() == 4; }));
        }
    });
    EXPECT_EQ(ErrorOfPool(8), "Could not create enough execution threads. (4 created, 8requested)");
    EXPECT_EQ(Faults().joined.size(), 4U);
}

TEST_F(ExecutorFailureTest, LockIsFreeOnceTheExceptionHasLeft) {
    Faults().threadCreate.FailCall(3, EAGAIN);
    EXPECT_THROW(Executor(8, false), Exception);
    EXPECT_FALSE(GlobalLock::HeldByCurrentThread());
}

TEST_F(ExecutorFailureTest, NextPoolIsNotTouchedByTheFailureOfAnEarlierOne) {
    Faults().threadCreate.FailCall(3, EAGAIN);
    EXPECT_THROW(Executor(8, false), Exception);
    support::GraphText graph({"a", "b provides x", "c requires x"});
    EXPECT_EQ(graph.Run(8).size(), 3U);
}

// Plugins catch their own failures; what escapes all the same must not pass unnoticed.
TEST(ExecutorDeathTest, ExceptionThatEscapesRunEndsTheProcess) {
    EXPECT_EXIT(
        {
            support::GraphText graph({"a"});
            graph["a"].onRun = [] { throw std::runtime_error("escaped"); };
            graph.Run(1);
        },
        ::testing::KilledBySignal(SIGABRT), "escaped");
}

}  // namespace

}  // namespace vantor
