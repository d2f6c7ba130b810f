// Writing and commit() that fail: what commit() throws, what is left, and what the destination
// holds.
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/resource.h>
#include <sys/stat.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <stdexcept>

#include "io/AfstreamFixture.h"

namespace vantor {

namespace {

using support::Faults;
using support::ModeOf;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;
using ::testing::StartsWith;

// Lets no file of this process grow beyond `bytes`: the nearest to a full disk that needs no
// privilege. Writing beyond is an error, not a signal.
class FileSizeLimit {
public:
    explicit FileSizeLimit(rlim_t bytes) : oldHandler(std::signal(SIGXFSZ, SIG_IGN)) {
        getrlimit(RLIMIT_FSIZE, &oldLimit);
        const rlimit limit{bytes, oldLimit.rlim_max};
        setrlimit(RLIMIT_FSIZE, &limit);
    }
    ~FileSizeLimit() {
        setrlimit(RLIMIT_FSIZE, &oldLimit);
        (void)std::signal(SIGXFSZ, oldHandler);
    }
    FileSizeLimit(const FileSizeLimit&) = delete;
    FileSizeLimit& operator=(const FileSizeLimit&) = delete;

private:
    using Handler = void (*)(int);

    rlimit oldLimit{};
    Handler oldHandler;
};

class AfstreamCommitFailureTest : public support::AfstreamFailureFixture {};

TEST_F(AfstreamCommitFailureTest, FullDiskWhileWritingIsReportedByCommitAndTheOldFileStays) {
    stream.open(destination.c_str());
    const std::string temporary = TemporaryPath();
    {
        const FileSizeLimit full(20000);
        for (int line = 0; line < 5000; ++line) {
            stream << "a line of the report\n";
        }
        EXPECT_FALSE(stream.good());
        EXPECT_EQ(CommitError(), "unable to write '" + temporary + "': File too large");
        EXPECT_EQ(errno, EFBIG);
    }
    EXPECT_EQ(Content(), "old");
    EXPECT_EQ(ModeOf(destination), 0644U);
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

// One piece beyond the stream's buffer goes to the file directly.
TEST_F(AfstreamCommitFailureTest, FullDiskWhileWritingOneLargePieceIsReportedAndTheOldFileStays) {
    stream.open(destination.c_str());
    const std::string temporary = TemporaryPath();
    {
        const FileSizeLimit full(20000);
        stream << std::string(100000, 'x');
        EXPECT_THAT(CommitError(), StartsWith("unable to write '" + temporary + "': "));
    }
    EXPECT_EQ(Content(), "old");
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

// The content fits the stream's buffer, so that nothing is written before the commit.
TEST_F(AfstreamCommitFailureTest, FullDiskAtTheLastFlushIsReportedByCommitAndTheOldFileStays) {
    stream.open(destination.c_str());
    const std::string temporary = TemporaryPath();
    stream << "0123456789";
    ASSERT_TRUE(stream.good());
    {
        const FileSizeLimit full(5);
        EXPECT_EQ(CommitError(), "unable to write '" + temporary + "': File too large");
    }
    EXPECT_EQ(Content(), "old");
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

// Room was made before the commit: what could not be written before is lost all the same.
TEST_F(AfstreamCommitFailureTest, EarlierFailedWriteIsNotForgottenByCommit) {
    stream.open(destination.c_str());
    const std::string temporary = TemporaryPath();
    {
        const FileSizeLimit full(20000);
        stream << std::string(100000, 'x') << std::flush;
        EXPECT_FALSE(stream.good());
    }
    EXPECT_THAT(CommitError(), StartsWith("unable to write '" + temporary + "': "));
    EXPECT_EQ(Content(), "old");
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamCommitFailureTest, StateBitWithoutAnErrorIsReportedAsAnInputOutputError) {
    stream.open(destination.c_str());
    const std::string temporary = TemporaryPath();
    stream.setstate(std::ios_base::badbit);
    EXPECT_EQ(CommitError(), "unable to write '" + temporary + "': Input/output error");
    EXPECT_EQ(Content(), "old");
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamCommitFailureTest, FailedSynchronisationIsReportedBeforeTheRename) {
    stream.open(destination.c_str());
    const std::string temporary = TemporaryPath();
    stream << "new";
    Faults().fsync.FailCall(1, EIO);
    EXPECT_EQ(CommitError(),
              "unable to synchronise '" + temporary + "' to disk: Input/output error");
    EXPECT_EQ(errno, EIO);
    EXPECT_EQ(Faults().rename.Calls(), 0);
    EXPECT_EQ(Content(), "old");
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamCommitFailureTest, FileThatCannotBeOpenedForSynchronisationIsReported) {
    stream.open(destination.c_str());
    const std::string temporary = TemporaryPath();
    stream << "new";
    Faults().open.FailCall(1, EMFILE);
    EXPECT_EQ(CommitError(),
              "unable to synchronise '" + temporary + "' to disk: Too many open files");
    EXPECT_EQ(Content(), "old");
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamCommitFailureTest, FailedRenameIsReportedAndTheDestructorRemovesTheTemporaryFile) {
    {
        afstream failing;
        failing.open(destination.c_str());
        failing << "new";
        const std::string temporary = TemporaryPath();
        Faults().rename.FailCall(1, EXDEV);
        EXPECT_EQ(CommitError(failing), "unable to rename '" + temporary + "' to '" + destination +
                                            "': Invalid cross-device link");
        EXPECT_EQ(errno, EXDEV);
        EXPECT_FALSE(failing.is_open());
        EXPECT_EQ(support::ReadFile(temporary), "new");
        EXPECT_EQ(Content(), "old");
    }
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamCommitFailureTest, FolderAtTheDestinationIsLeftAsItIs) {
    const std::string taken = folder.File("taken");
    ASSERT_EQ(mkdir(taken.c_str(), 0750), 0);
    {
        afstream failing;
        failing.open(taken.c_str());
        EXPECT_THAT(CommitError(failing),
                    MatchesRegex("unable to rename '" + taken + "\\.[A-Za-z0-9]{6}' to '" + taken +
                                 "': Is a directory"));
    }
    EXPECT_EQ(ModeOf(taken), 0750U);
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log", "taken"));
}

TEST_F(AfstreamCommitFailureTest, CommitCanBeTriedAgainAfterAFailedRename) {
    stream.open(destination.c_str());
    stream << "new";
    Faults().rename.FailCall(1, EBUSY);
    EXPECT_THROW(stream.commit(), std::runtime_error);
    stream.commit();
    EXPECT_EQ(Content(), "new");
    EXPECT_EQ(ModeOf(destination), 0644U);
}

TEST_F(AfstreamCommitFailureTest, SecondCommitThrowsAndLeavesTheCommittedContent) {
    stream.open(destination.c_str());
    stream << "new";
    stream.commit();
    EXPECT_THAT(CommitError(),
                MatchesRegex("unable to rename '.*/report[.]log[.]......' to '.*/report[.]log': "
                             "No such file or directory"));
    EXPECT_EQ(Content(), "new");
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamCommitFailureTest,
       DestinationThatCannotBeLookedAtIsReplacedAndThePermissionsReported) {
    stream.open(destination.c_str());
    stream << "new";
    Faults().chmod.Reset();
    Faults().stat.FailCall(1, EACCES);
    EXPECT_EQ(CommitError(),
              "failed to restore file permissions, file permissions may be incorrect: "
              "Permission denied");
    EXPECT_EQ(Faults().chmod.Calls(), 0);
    EXPECT_EQ(Content(), "new");
    EXPECT_EQ(ModeOf(destination), 0600U);
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamCommitFailureTest,
       PermissionsThatCannotBeRestoredAreReportedWithTheNewContentInPlace) {
    stream.open(destination.c_str());
    stream << "new";
    Faults().chmod.FailCall(1, EPERM);
    EXPECT_EQ(CommitError(),
              "failed to restore file permissions, file permissions may be incorrect: "
              "Operation not permitted");
    EXPECT_EQ(Content(), "new");
    EXPECT_EQ(ModeOf(destination), 0600U);
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

// The number of this process's descriptor of the file; -1 when there is none.
int DescriptorOf(const std::string& path) {
    struct stat wanted {};
    if (stat(path.c_str(), &wanted) != 0) {
        return -1;
    }
    for (int descriptor = STDERR_FILENO + 1; descriptor < 1024; ++descriptor) {
        struct stat status {};
        if (fstat(descriptor, &status) == 0 && status.st_ino == wanted.st_ino &&
            status.st_dev == wanted.st_dev) {
            return descriptor;
        }
    }
    return -1;
}

// The descriptor is taken from under the stream once all is synchronised: its close fails.
TEST_F(AfstreamCommitFailureTest, FailedCloseAfterSynchronisingSetsTheFailureBitAndGoesOn) {
    stream.open(destination.c_str());
    stream << "new";
    const int descriptor = DescriptorOf(TemporaryPath());
    ASSERT_GE(descriptor, 0);
    bool synchronised = false;
    Faults().fsync.Before([&] { synchronised = true; });
    Faults().close.Before([&] {
        if (synchronised) {
            (void)syscall(SYS_close, descriptor, 0L, 0L);
        }
    });
    stream.commit();
    EXPECT_EQ(stream.rdstate(), std::ios_base::failbit);
    EXPECT_EQ(Content(), "new");
    EXPECT_EQ(ModeOf(destination), 0644U);
    EXPECT_THAT(Temporaries(), IsEmpty());
}

TEST_F(AfstreamCommitFailureTest, StreamThatThrowsOnFailureStillLosesItsTemporaryFile) {
    {
        afstream failing;
        failing.open(destination.c_str());
        failing.exceptions(std::ios_base::badbit | std::ios_base::failbit);
        const FileSizeLimit full(20000);
        EXPECT_THROW(failing << std::string(100000, 'x'), std::ios_base::failure);
    }
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
    EXPECT_EQ(Content(), "old");
}

TEST_F(AfstreamCommitFailureTest, FailedUnlinkInTheDestructorIsIgnored) {
    {
        afstream abandoned;
        abandoned.open(destination.c_str());
        Faults().unlink.FailCall(1, EBUSY);
    }
    EXPECT_EQ(Faults().unlink.Calls(), 1);
    EXPECT_EQ(Temporaries().size(), 1U);
    EXPECT_EQ(Content(), "old");
}

TEST_F(AfstreamCommitFailureTest, NothingIsLeftOpenAfterAnyFailure) {
    const int before = dup(STDERR_FILENO);
    ASSERT_GE(before, 0);
    ASSERT_EQ(close(before), 0);
    for (support::FaultPoint* const fault :
         {&Faults().mkstemp, &Faults().open, &Faults().fsync, &Faults().rename, &Faults().chmod}) {
        fault->FailCall(1, EIO);
        afstream failing;
        EXPECT_THROW(failing.open(destination.c_str()); failing << "new";
                     failing.commit(), std::runtime_error);
        fault->Reset();
    }
    // The lowest number that is free is still the same.
    const int after = dup(STDERR_FILENO);
    EXPECT_EQ(after, before);
    EXPECT_EQ(close(after), 0);
}

}  // namespace

}  // namespace vantor
