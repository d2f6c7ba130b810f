#include "io/CloseDescriptors.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <unistd.h>

#include <cerrno>
#include <limits>
#include <string>
#include <vector>

#include "io/IoFaults.h"
#include "support/ForkedChild.h"

namespace vantor {

namespace {

using support::Faults;

TEST(KeptDescriptorsTest, HoldsWhatWasAdded) {
    KeptDescriptors kept;
    EXPECT_FALSE(kept.Contains(0));
    kept.Add(0);
    kept.Add(7);
    EXPECT_TRUE(kept.Contains(0));
    EXPECT_TRUE(kept.Contains(7));
    EXPECT_FALSE(kept.Contains(1));
}

TEST(KeptDescriptorsTest, NegativeNumberIsLeftOut) {
    KeptDescriptors kept;
    kept.Add(-1);
    EXPECT_EQ(kept.count, 0U);
    EXPECT_FALSE(kept.Contains(-1));
}

TEST(KeptDescriptorsTest, NinthIsLeftOut) {
    KeptDescriptors kept;
    for (int descriptor = 0; descriptor < 9; ++descriptor) {
        kept.Add(descriptor);
    }
    EXPECT_TRUE(kept.Contains(7));
    EXPECT_FALSE(kept.Contains(8));
}

class OpenFileLimitTest : public support::IoTest {};

TEST_F(OpenFileLimitTest, IsTheSoftLimitOfTheProcess) {
    rlimit limit{};
    ASSERT_EQ(getrlimit(RLIMIT_NOFILE, &limit), 0);
    const rlimit lower{123, limit.rlim_max};
    ASSERT_EQ(setrlimit(RLIMIT_NOFILE, &lower), 0);
    EXPECT_EQ(OpenFileLimit(), 123);
    EXPECT_EQ(setrlimit(RLIMIT_NOFILE, &limit), 0);
}

TEST_F(OpenFileLimitTest, IsTheLargestNumberWithoutALimit) {
    Faults().sysconf.FailCall(1, 0);
    EXPECT_EQ(OpenFileLimit(), std::numeric_limits<int>::max());
}

// The ways in which descriptors are closed, by what the kernel lacks.
enum class Kernel { HasCloseRange, HasNoCloseRange, HasNoProcEither, HasAListThatBreaks };

class CloseDescriptorsTest : public support::IoTest, public ::testing::WithParamInterface<Kernel> {
protected:
    static void TakeAway(Kernel kernel) {
        if (kernel != Kernel::HasCloseRange) {
            Faults().closeRange.FailFrom(1, ENOSYS);
        }
        if (kernel == Kernel::HasNoProcEither) {
            Faults().open.FailFrom(1, ENOENT);
        }
        if (kernel == Kernel::HasAListThatBreaks) {
            Faults().listFolder.FailFrom(1, EIO);
        }
    }

    // In a child that has the standard descriptors and these numbers open: closes from `first` up
    // to `limit` and tells which numbers are open then, but for the report's own, which is kept.
    static std::string OpenAfter(const std::vector<int>& opened, int first, int limit,
                                 const std::vector<int>& keep) {
        return support::RunForked([&](int report) {
                   KeptDescriptors kept;
                   kept.Add(MoveReport(report));
                   for (const int descriptor : opened) {
                       dup2(STDERR_FILENO, descriptor);
                   }
                   for (const int descriptor : keep) {
                       kept.Add(descriptor);
                   }
                   TakeAway(GetParam());
                   CloseDescriptors(first, limit, kept);
                   support::WriteReport(reportNumber, OpenNumbers());
                   return 0;
               })
            .text;
    }

private:
    static constexpr int reportNumber = 1000;

    // Out of the way of the numbers that the tests speak of, all of which become free.
    static int MoveReport(int report) {
        dup2(report, reportNumber);
        for (int descriptor = STDERR_FILENO + 1; descriptor < reportNumber; ++descriptor) {
            close(descriptor);
        }
        return reportNumber;
    }

    static std::string OpenNumbers() {
        std::string text;
        for (int descriptor = 0; descriptor < reportNumber; ++descriptor) {
            if (fcntl(descriptor, F_GETFD) >= 0) {
                text += std::to_string(descriptor) + " ";
            }
        }
        return text;
    }
};

TEST_P(CloseDescriptorsTest, ClosesFromTheFirstOn) {
    EXPECT_EQ(OpenAfter({3, 4, 5, 17, 200, 999}, 3, 1024, {}), "0 1 2 ");
}

TEST_P(CloseDescriptorsTest, KeepsWhatIsToBeKept) {
    EXPECT_EQ(OpenAfter({3, 4, 5, 17, 200, 999}, 3, 1024, {4, 17, 999}), "0 1 2 4 17 999 ");
}

TEST_P(CloseDescriptorsTest, KeepsNeighboursAndOneThatIsNamedTwice) {
    EXPECT_EQ(OpenAfter({3, 4, 5, 6, 7, 8}, 3, 1024, {6, 5, 5, 3}), "0 1 2 3 5 6 ");
}

TEST_P(CloseDescriptorsTest, LeavesWhatIsBelowTheFirstAndFromTheLimitOn) {
    EXPECT_EQ(OpenAfter({7, 8, 9, 10, 11, 12}, 9, 11, {}), "0 1 2 7 8 11 12 ");
}

TEST_P(CloseDescriptorsTest, KeptNumbersOutsideTheRangeDoNotDisturb) {
    EXPECT_EQ(OpenAfter({7, 8, 9, 10, 11, 12}, 9, 11, {7, 12, 500}), "0 1 2 7 8 11 12 ");
}

TEST_P(CloseDescriptorsTest, FirstAndLastOfTheRangeCanBeKept) {
    EXPECT_EQ(OpenAfter({8, 9, 10, 11, 12}, 9, 12, {9, 11}), "0 1 2 8 9 11 12 ");
}

TEST_P(CloseDescriptorsTest, StandardDescriptorsGoTooWhenTheFirstIsZero) {
    EXPECT_EQ(OpenAfter({3, 4}, 0, 1024, {1}), "1 ");
}

TEST_P(CloseDescriptorsTest, EmptyRangeClosesNothing) {
    EXPECT_EQ(OpenAfter({3, 4, 5}, 3, 3, {}), "0 1 2 3 4 5 ");
}

// Several times as many as the kernel lists in one answer.
TEST_P(CloseDescriptorsTest, ClosesHundreds) {
    std::vector<int> many;
    for (int descriptor = 3; descriptor < 1000; ++descriptor) {
        many.push_back(descriptor);
    }
    EXPECT_EQ(OpenAfter(many, 3, 1024, {500}), "0 1 2 500 ");
}

std::string KernelName(const ::testing::TestParamInfo<Kernel>& test) {
    switch (test.param) {
    case Kernel::HasCloseRange:
        return "KernelWithCloseRange";
    case Kernel::HasNoCloseRange:
        return "KernelWithoutCloseRange";
    case Kernel::HasNoProcEither:
        return "KernelWithoutCloseRangeAndProc";
    case Kernel::HasAListThatBreaks:
        return "KernelWithoutCloseRangeAndAListThatBreaks";
    }
    return "";
}

INSTANTIATE_TEST_SUITE_P(On, CloseDescriptorsTest,
                         ::testing::Values(Kernel::HasCloseRange, Kernel::HasNoCloseRange,
                                           Kernel::HasNoProcEither, Kernel::HasAListThatBreaks),
                         KernelName);

// The number of calls is what the time goes with.
std::string CallsForAHugeLimit(bool closeRange) {
    return support::RunForked([&](int report) {
               KeptDescriptors kept;
               kept.Add(report);
               // Whatever the test was started with is out of the way first.
               CloseDescriptors(STDERR_FILENO + 1, OpenFileLimit(), kept);
               dup2(STDERR_FILENO, 100);
               dup2(STDERR_FILENO, 101);
               if (!closeRange) {
                   Faults().closeRange.FailFrom(1, ENOSYS);
               }
               Faults().close.Reset();
               CloseDescriptors(STDERR_FILENO + 1, std::numeric_limits<int>::max(), kept);
               const int calls = Faults().close.Calls();
               const bool closed = fcntl(100, F_GETFD) < 0 && fcntl(101, F_GETFD) < 0;
               support::WriteReport(report, (closed ? "closed by " : "open after ") +
                                                std::to_string(calls) + " calls of close");
               return 0;
           })
        .text;
}

class HugeLimitTest : public support::IoTest {};

TEST_F(HugeLimitTest, CloseRangeTakesNoCallADescriptor) {
    EXPECT_EQ(CallsForAHugeLimit(true), "closed by 0 calls of close");
}

// The third one closes the list itself.
TEST_F(HugeLimitTest, ListOfProcTakesOneCallAnOpenDescriptor) {
    EXPECT_EQ(CallsForAHugeLimit(false), "closed by 3 calls of close");
}

}  // namespace

}  // namespace vantor
