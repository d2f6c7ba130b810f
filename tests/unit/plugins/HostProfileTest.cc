#include "plugins/HostProfile.h"

#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <thread>
#include <vector>

#include "graph/GlobalLock.h"
#include "support/FreshProcess.h"
#include "support/PrivateRoot.h"

namespace vantor {
namespace {

constexpr const char* profile = "/etc/nuvex/hostprofile.xml";
constexpr const char* compressedProfile = "/etc/nuvex/hostprofile.xml.gz";

// The answer is kept for the life of the process, so every question has a process of its own.
class HostProfileTest : public ::testing::Test {
protected:
    HostProfileTest() { root.MakeFolder("/etc/nuvex"); }

    static void ExpectPresent(bool expected) {
        support::InFreshProcess([expected] { EXPECT_EQ(HostProfilePresent(), expected); });
    }

    support::PrivateRoot root;
};

TEST_F(HostProfileTest, NoFileIsNoProfile) { ExpectPresent(false); }

TEST_F(HostProfileTest, NoFolderIsNoProfile) {
    ASSERT_EQ(rmdir(root.Path("/etc/nuvex").c_str()), 0);
    ExpectPresent(false);
}

TEST_F(HostProfileTest, TheFileIsAProfile) {
    root.Write(profile, "");
    ExpectPresent(true);
}

TEST_F(HostProfileTest, TheCompressedFileAloneIsAProfile) {
    root.Write(compressedProfile, "");
    ExpectPresent(true);
}

TEST_F(HostProfileTest, AFolderIsAProfile) {
    root.MakeFolder(profile);
    ExpectPresent(true);
}

TEST_F(HostProfileTest, ANamedPipeIsAProfile) {
    ASSERT_EQ(mkfifo(root.Path(compressedProfile).c_str(), 0600), 0);
    ExpectPresent(true);
}

TEST_F(HostProfileTest, ADanglingLinkIsNoProfile) {
    ASSERT_EQ(symlink("nowhere", root.Path(profile).c_str()), 0);
    ExpectPresent(false);
}

TEST_F(HostProfileTest, AFileWhoseStatusCannotBeHadIsNoProfile) {
    ASSERT_EQ(symlink("hostprofile.xml", root.Path(profile).c_str()), 0);  // a loop
    ExpectPresent(false);
}

TEST_F(HostProfileTest, TheCompressedFileIsAskedForWhenTheOthersStatusCannotBeHad) {
    ASSERT_EQ(symlink("hostprofile.xml", root.Path(profile).c_str()), 0);  // a loop
    root.Write(compressedProfile, "");
    ExpectPresent(true);
}

TEST_F(HostProfileTest, AProfileAppearingAfterTheFirstCheckIsNotNoticed) {
    support::InFreshProcess([this] {
        EXPECT_FALSE(HostProfilePresent());
        root.Write(profile, "");
        EXPECT_FALSE(HostProfilePresent());
    });
}

TEST_F(HostProfileTest, AProfileRemovedAfterTheFirstCheckStaysPresent) {
    root.Write(profile, "");
    support::InFreshProcess([this] {
        EXPECT_TRUE(HostProfilePresent());
        EXPECT_EQ(unlink(root.Path(profile).c_str()), 0);
        EXPECT_TRUE(HostProfilePresent());
    });
}

TEST_F(HostProfileTest, MayBeAskedByManyThreadsAtOnce) {
    root.Write(profile, "");
    support::InFreshProcess([] {
        std::atomic<int> present{0};
        std::vector<std::thread> askers;
        for (int i = 0; i < 8; ++i) {
            askers.emplace_back([&present] { present += HostProfilePresent() ? 1 : 0; });
        }
        for (std::thread& asker : askers) {
            asker.join();
        }
        EXPECT_EQ(present, 8);
    });
}

TEST_F(HostProfileTest, MayBeAskedWithTheLockHeld) {
    support::InFreshProcess([] {
        const GlobalLockGuard guard;
        EXPECT_FALSE(HostProfilePresent());
    });
}

}  // namespace
}  // namespace vantor
