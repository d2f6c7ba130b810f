// A writer that is killed: the destination holds the old content or the whole new one, and nothing
// but one temporary file may be left beside it.
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/wait.h>
#include <unistd.h>

#include <csignal>
#include <random>
#include <sstream>

#include "io/AfstreamFixture.h"
#include "io/afstream.h"
#include "support/ForkedChild.h"
#include "support/Sanitizers.h"

namespace vantor {

namespace {

using support::FaultPoint;
using support::Faults;
using support::IoFaults;

// Some 60,000 bytes, many times the stream's buffer, that no other version shares a line with.
std::string WholeContent(int version) {
    const std::string line = "version " + std::to_string(version) + "\n";
    std::string content;
    for (int i = 0; i < 5000; ++i) {
        content += line;
    }
    return content + "end of " + line;
}

void Replace(const std::string& destination, int version) {
    afstream stream;
    stream.open(destination.c_str());
    std::istringstream content(WholeContent(version));
    for (std::string line; std::getline(content, line);) {
        stream << line << '\n';
    }
    stream.commit();
}

// The version whose whole content the text is; -1 when it is none's.
int VersionOf(const std::string& content) {
    int version = -1;
    std::istringstream stream(content);
    std::string word;
    stream >> word >> version;
    return content == WholeContent(version) ? version : -1;
}

class AfstreamKilledTest : public support::AfstreamFixture {
protected:
    AfstreamKilledTest() { WriteOld(WholeContent(0)); }

    // Removes what a killed writer left and returns how many files it were.
    std::size_t RemoveTemporaries() const {
        const std::vector<std::string> names = Temporaries();
        for (const std::string& name : names) {
            EXPECT_THAT(name, ::testing::MatchesRegex("report\\.log\\.[A-Za-z0-9]{6}"));
            EXPECT_EQ(unlink(folder.File(name).c_str()), 0);
        }
        return names.size();
    }
};

TEST_F(AfstreamKilledTest, KilledAtAnyMomentLeavesTheOldContentOrTheWholeNewOne) {
    const int kills = support::underSanitizers ? 60 : 300;
    std::mt19937 random(20240229);
    std::size_t leftovers = 0;
    int version = 0;
    for (int kill = 0; kill < kills; ++kill) {
        int ends[2] = {-1, -1};
        ASSERT_EQ(pipe(ends), 0);
        const pid_t writer = fork();
        ASSERT_GE(writer, 0);
        if (writer == 0) {
            for (int next = version + 1;; ++next) {
                Replace(destination, next);
                support::WriteReport(ends[1], ".");
            }
        }
        char begun = 0;
        EXPECT_EQ(read(ends[0], &begun, 1), 1);
        // Any moment: the delay only chooses where in its work the writer is met.
        usleep(static_cast<useconds_t>(random() % 2000));
        EXPECT_EQ(::kill(writer, SIGKILL), 0);
        int status = 0;
        EXPECT_EQ(waitpid(writer, &status, 0), writer);
        EXPECT_TRUE(WIFSIGNALED(status));
        close(ends[0]);
        close(ends[1]);

        const int seen = VersionOf(Content());
        ASSERT_GT(seen, version) << "the destination is torn or fell back";
        version = seen;
        const std::size_t left = RemoveTemporaries();
        EXPECT_LE(left, 1U);
        leftovers += left;
    }
    EXPECT_GT(leftovers, 0U) << "no kill met a writer at work";
}

// One call of a commit, and what is seen by whoever comes after a writer that died there.
struct KillPoint {
    const char* name;
    FaultPoint IoFaults::*call;
    int versionSeen;
    std::size_t temporariesLeft;
};

const KillPoint killPoints[] = {
    {"BeforeTheTemporaryFile", &IoFaults::mkstemp, 0, 0},
    {"BeforeSynchronising", &IoFaults::fsync, 0, 1},
    {"BeforeTheOldModeIsRead", &IoFaults::stat, 0, 1},
    {"BeforeTheRename", &IoFaults::rename, 0, 1},
    {"AfterTheRename", &IoFaults::chmod, 1, 0},
    {"AfterTheCommit", &IoFaults::unlink, 1, 0},
};

class AfstreamKillPointTest : public AfstreamKilledTest,
                              public ::testing::WithParamInterface<KillPoint> {};

TEST_P(AfstreamKillPointTest, DestinationIsWhole) {
    const KillPoint& point = GetParam();
    const support::ChildReport child = support::RunForked([&](int) {
        (Faults().*point.call).Before([] { (void)raise(SIGKILL); });
        Replace(destination, 1);
        return 0;
    });
    EXPECT_TRUE(WIFSIGNALED(child.status));
    EXPECT_EQ(VersionOf(Content()), point.versionSeen);
    EXPECT_EQ(RemoveTemporaries(), point.temporariesLeft);
}

INSTANTIATE_TEST_SUITE_P(Killed, AfstreamKillPointTest, ::testing::ValuesIn(killPoints),
                         [](const auto& test) { return std::string(test.param.name); });

}  // namespace

}  // namespace vantor
