// open() that fails: what it throws and what is left.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <stdexcept>

#include "io/AfstreamFixture.h"
#include "io/Privileges.h"

namespace vantor {

namespace {

using support::Faults;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class AfstreamOpenFailureTest : public support::AfstreamFailureFixture {};

TEST_F(AfstreamOpenFailureTest, FolderThatCannotBeWrittenMakesOpenThrowWithTheSystemsErrorText) {
    ASSERT_EQ(chmod(folder.Path().c_str(), 0555), 0);
    const support::WithoutFilePrivileges unprivileged;
    errno = 0;
    EXPECT_EQ(OpenError(destination),
              "unable to create temporary file to write '" + destination + "': Permission denied");
    EXPECT_EQ(errno, EACCES);
    EXPECT_EQ(chmod(folder.Path().c_str(), 0755), 0);
    EXPECT_THAT(Temporaries(), IsEmpty());
}

TEST_F(AfstreamOpenFailureTest, FolderThatDoesNotExistMakesOpenThrow) {
    const std::string path = folder.File("none/report.log");
    EXPECT_EQ(OpenError(path),
              "unable to create temporary file to write '" + path + "': No such file or directory");
}

TEST_F(AfstreamOpenFailureTest, FailedMkstempMakesOpenThrowAndKeepsErrno) {
    Faults().mkstemp.FailCall(1, ENOSPC);
    EXPECT_EQ(OpenError(destination), "unable to create temporary file to write '" + destination +
                                          "': No space left on device");
    EXPECT_EQ(errno, ENOSPC);
    EXPECT_FALSE(stream.is_open());
}

TEST_F(AfstreamOpenFailureTest, NoMemoryForTheNameMakesOpenThrow) {
    Faults().allocation.FailCall(1, ENOMEM);
    EXPECT_EQ(OpenError(destination), "insufficient memory to allocate buffer");
    EXPECT_THAT(Temporaries(), IsEmpty());
}

TEST_F(AfstreamOpenFailureTest, NameThatIsNotFormattedWholeMakesOpenThrow) {
    Faults().snprintf.FailCall(1, 0);
    EXPECT_EQ(OpenError(destination), "unable to allocate mkstemp pattern");
    EXPECT_THAT(Temporaries(), IsEmpty());
}

// Once the file exists a link that leads nowhere takes its place.
TEST_F(AfstreamOpenFailureTest, TemporaryFileThatCannotBeOpenedMakesOpenThrowAndSetsTheFailureBit) {
    Faults().close.Before([&] {
        const std::string temporary = TemporaryPath();
        ASSERT_EQ(unlink(temporary.c_str()), 0);
        ASSERT_EQ(symlink(temporary.c_str(), temporary.c_str()), 0);
    });
    EXPECT_EQ(OpenError(destination),
              "failed to create temp file: Too many levels of symbolic links");
    EXPECT_EQ(errno, ELOOP);
    EXPECT_EQ(stream.rdstate(), std::ios_base::failbit);
    EXPECT_EQ(Temporaries().size(), 1U);
}

TEST_F(AfstreamOpenFailureTest, TemporaryFileOfAFailedOpenIsRemovedByTheDestructor) {
    {
        afstream failing;
        // Truncating and appending at once is no mode that a file can be opened with.
        EXPECT_THROW(failing.open(destination.c_str(), std::ios_base::trunc | std::ios_base::app),
                     std::runtime_error);
        EXPECT_EQ(Temporaries().size(), 1U);
    }
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
    EXPECT_EQ(Content(), "old");
}

// The temporary file exists, but nothing was written to it: it must not become the destination.
TEST_F(AfstreamOpenFailureTest, TemporaryFileOfAFailedOpenIsNeverCommitted) {
    EXPECT_THROW(stream.open(destination.c_str(), std::ios_base::trunc | std::ios_base::app),
                 std::runtime_error);
    EXPECT_THROW(stream.commit(), std::runtime_error);
    EXPECT_EQ(Content(), "old");
}

TEST_F(AfstreamOpenFailureTest, StreamCanBeOpenedAfterAFailedOpen) {
    Faults().mkstemp.FailCall(1, EIO);
    EXPECT_THROW(stream.open(destination.c_str()), std::runtime_error);
    stream.open(destination.c_str());
    stream << "new";
    stream.commit();
    EXPECT_EQ(Content(), "new");
}

}  // namespace

}  // namespace vantor
