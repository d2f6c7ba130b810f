#include "io/afstream.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <stdexcept>
#include <thread>

#include "io/AfstreamFixture.h"
#include "support/ErrorText.h"
#include "support/ForkedChild.h"

namespace vantor {

namespace {

using support::ErrorText;
using support::ModeOf;
using support::ReadFile;
using support::TempFolder;
using support::WriteFile;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

class AfstreamTest : public support::AfstreamFixture {};

TEST_F(AfstreamTest, NewDestinationHasMode600AfterCommit) {
    afstream stream;
    stream.open(destination.c_str());
    stream << "new";
    stream.commit();

    EXPECT_EQ(Content(), "new");
    EXPECT_EQ(ModeOf(destination), 0600U);
    EXPECT_THAT(Temporaries(), IsEmpty());
}

TEST_F(AfstreamTest, ReplacedFileOfMode644HasTheNewContentAndMode644) {
    WriteOld("old", 0644);
    afstream stream;
    stream.open(destination.c_str());
    stream << "new";
    stream.commit();

    EXPECT_EQ(Content(), "new");
    EXPECT_EQ(ModeOf(destination), 0644U);
    EXPECT_THAT(Temporaries(), IsEmpty());
}

TEST_F(AfstreamTest, EveryPermissionBitOfTheReplacedFileIsKept) {
    for (const mode_t mode : {0000U, 0400U, 0640U, 0777U, 01755U, 02711U, 04755U, 07777U}) {
        WriteOld("old", mode);
        afstream stream;
        stream.open(destination.c_str());
        stream.commit();
        EXPECT_EQ(ModeOf(destination), mode);
    }
}

TEST_F(AfstreamTest, DestroyedBeforeCommitLeavesNoTemporaryFileAndTheOldDestination) {
    WriteOld("old", 0640);
    {
        afstream stream;
        stream.open(destination.c_str());
        stream << "new" << std::flush;
        EXPECT_EQ(ReadFile(TemporaryPath()), "new");
    }
    EXPECT_EQ(Content(), "old");
    EXPECT_EQ(ModeOf(destination), 0640U);
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamTest, CommitWithoutOpenThrowsUnknownDestination) {
    afstream stream;
    EXPECT_EQ(ErrorText<std::runtime_error>([&] { stream.commit(); }),
              "commit invoked on an unknown destination");
}

TEST_F(AfstreamTest, CommitAfterAFailedOpenThrowsUnknownDestination) {
    afstream stream;
    EXPECT_THROW(stream.open(folder.File("none/report.log").c_str()), std::runtime_error);
    EXPECT_EQ(ErrorText<std::runtime_error>([&] { stream.commit(); }),
              "commit invoked on an unknown destination");
}

TEST_F(AfstreamTest, DestinationIsUntouchedUntilCommit) {
    WriteOld("old");
    afstream stream;
    stream.open(destination.c_str());
    stream << std::string(100000, 'x') << std::flush;
    EXPECT_EQ(Content(), "old");
    stream.commit();
    EXPECT_EQ(Content(), std::string(100000, 'x'));
}

TEST_F(AfstreamTest, TemporaryFileLiesBesideTheDestinationWithMode600) {
    afstream stream;
    stream.open(destination.c_str());
    EXPECT_THAT(Temporaries(), ElementsAre(MatchesRegex("report\\.log\\.[A-Za-z0-9]{6}")));
    EXPECT_EQ(ModeOf(TemporaryPath()), 0600U);
}

TEST_F(AfstreamTest, ContentIsOnTheDiskBeforeTheRename) {
    std::string calls;
    afstream stream;
    stream.open(destination.c_str());
    stream << "new";
    support::Faults().fsync.Before([&] { calls += "fsync of " + ReadFile(TemporaryPath()) + ";"; });
    support::Faults().rename.Before([&] { calls += "rename;"; });
    stream.commit();
    EXPECT_EQ(calls, "fsync of new;rename;");
}

TEST_F(AfstreamTest, OutputIsAddedToAModeThatLacksIt) {
    afstream stream;
    stream.open(destination.c_str(), std::ios_base::binary);
    stream << "new\n";
    stream.commit();
    EXPECT_EQ(Content(), "new\n");
}

TEST_F(AfstreamTest, EmptyFileIsCommittedToo) {
    WriteOld("old");
    afstream stream;
    stream.open(destination.c_str());
    stream.commit();
    EXPECT_EQ(Content(), "");
}

TEST_F(AfstreamTest, StreamClosedByItsUserCanBeCommitted) {
    afstream stream;
    stream.open(destination.c_str());
    stream << "new";
    stream.close();
    stream.commit();
    EXPECT_EQ(Content(), "new");
}

TEST_F(AfstreamTest, WritesAfterCommitReachNobody) {
    afstream stream;
    stream.open(destination.c_str());
    stream << "new";
    stream.commit();
    stream << "late" << std::flush;
    EXPECT_TRUE(stream.fail());
    EXPECT_EQ(Content(), "new");
}

TEST_F(AfstreamTest, SecondOpenDiscardsTheFirstTemporaryFile) {
    afstream stream;
    stream.open(folder.File("first.log").c_str());
    stream << "first";
    stream.open(destination.c_str());
    stream << "second";
    stream.commit();
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
    EXPECT_EQ(Content(), "second");
}

TEST_F(AfstreamTest, CommittedStreamCanBeOpenedAgain) {
    afstream stream;
    for (const char* const content : {"one", "two"}) {
        stream.open(destination.c_str());
        stream << content;
        stream.commit();
        EXPECT_EQ(Content(), content);
    }
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamTest, LinkAtTheDestinationIsReplacedAndItsTargetIsNot) {
    WriteFile(folder.File("target"), "old", 0640);
    ASSERT_EQ(symlink("target", destination.c_str()), 0);
    {
        afstream stream;
        stream.open(destination.c_str());
        stream << "new";
        stream.commit();
    }
    EXPECT_EQ(ReadFile(folder.File("target")), "old");
    EXPECT_EQ(Content(), "new");
    EXPECT_EQ(ModeOf(destination), 0640U);
}

TEST_F(AfstreamTest, RelativePathIsTakenFromTheWorkingFolder) {
    const support::ChildReport child = support::RunForked([&](int) {
        if (chdir(folder.Path().c_str()) != 0) {
            return 1;
        }
        afstream stream;
        stream.open("report.log");
        stream << "new";
        stream.commit();
        return 0;
    });
    EXPECT_EQ(child.text, "");
    EXPECT_EQ(child.status, 0);
    EXPECT_EQ(Content(), "new");
    EXPECT_THAT(Temporaries(), IsEmpty());
}

TEST_F(AfstreamTest, TwoWritersPrepareTheSameDestinationAndTheLastRenameWins) {
    afstream first;
    afstream second;
    first.open(destination.c_str());
    second.open(destination.c_str());
    EXPECT_EQ(Temporaries().size(), 2U);
    first << "first";
    second << "second";
    second.commit();
    EXPECT_EQ(Content(), "second");
    first.commit();
    EXPECT_EQ(Content(), "first");
    EXPECT_THAT(folder.Entries(), ElementsAre("report.log"));
}

TEST_F(AfstreamTest, ReaderSeesTheOldContentOrTheWholeNewOne) {
    WriteOld(std::string(50000, 'a'));
    std::atomic<bool> writing{true};
    std::atomic<int> reads{0};
    std::atomic<int> torn{0};
    std::thread reader([&] {
        while (writing || reads == 0) {
            const std::string seen = Content();
            if (seen.size() != 50000 || seen != std::string(50000, seen.front())) {
                ++torn;
            }
            ++reads;
        }
    });
    for (int version = 1; version <= 200; ++version) {
        afstream stream;
        stream.open(destination.c_str());
        stream << std::string(50000, static_cast<char>('a' + version % 26));
        stream.commit();
    }
    writing = false;
    reader.join();
    EXPECT_EQ(torn, 0);
    EXPECT_EQ(Content(), std::string(50000, static_cast<char>('a' + 200 % 26)));
}

}  // namespace

}  // namespace vantor
