#include "io/FileDescriptor.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <unistd.h>

#include <cerrno>
#include <type_traits>

#include "io/IoFaults.h"

namespace vantor {

namespace {

using support::Faults;

class FileDescriptorTest : public support::IoTest {};

int OpenNull() { return open("/dev/null", O_RDONLY | O_CLOEXEC); }

bool IsOpenNumber(int descriptor) { return fcntl(descriptor, F_GETFD) >= 0; }

static_assert(!std::is_copy_constructible_v<FileDescriptor>, "one owner");
static_assert(!std::is_copy_assignable_v<FileDescriptor>, "one owner");

TEST_F(FileDescriptorTest, ClosesAtTheEndOfItsScope) {
    int number = -1;
    {
        const FileDescriptor file(OpenNull());
        number = file.Get();
        EXPECT_TRUE(file.IsOpen());
        EXPECT_TRUE(IsOpenNumber(number));
    }
    EXPECT_FALSE(IsOpenNumber(number));
}

TEST_F(FileDescriptorTest, EndOfScopeKeepsErrno) {
    Faults().close.FailCall(1, EIO);
    {
        const FileDescriptor file(OpenNull());
        Faults().close.FailCall(1, EIO);
        errno = ENOENT;
    }
    EXPECT_EQ(Faults().close.Calls(), 1);
    EXPECT_EQ(errno, ENOENT);
}

TEST_F(FileDescriptorTest, NegativeNumberStandsForNone) {
    {
        FileDescriptor file(-1);
        EXPECT_FALSE(file.IsOpen());
        EXPECT_EQ(file.Close(), 0);
    }
    EXPECT_EQ(Faults().close.Calls(), 0);
}

TEST_F(FileDescriptorTest, NumberZeroIsADescriptor) {
    Faults().close.FailFrom(1, EIO);  // the test keeps its own standard input
    {
        const FileDescriptor file(0);
        EXPECT_TRUE(file.IsOpen());
    }
    EXPECT_EQ(Faults().close.Calls(), 1);
}

TEST_F(FileDescriptorTest, CloseClosesOnce) {
    FileDescriptor file(OpenNull());
    const int number = file.Get();
    EXPECT_EQ(file.Close(), 0);
    EXPECT_FALSE(IsOpenNumber(number));
    EXPECT_FALSE(file.IsOpen());
    EXPECT_EQ(file.Close(), 0);
    EXPECT_EQ(Faults().close.Calls(), 1);
}

// The number may be another file's by the time of the second close.
TEST_F(FileDescriptorTest, FailedCloseIsReportedAndNotTriedAgain) {
    const int number = OpenNull();
    {
        FileDescriptor file(number);
        Faults().close.FailCall(1, EINTR);
        EXPECT_EQ(file.Close(), -1);
        EXPECT_EQ(errno, EINTR);
        EXPECT_FALSE(file.IsOpen());
    }
    EXPECT_EQ(Faults().close.Calls(), 1);
    EXPECT_EQ(close(number), 0);
}

}  // namespace

}  // namespace vantor
