#include "platform/NvkCtl.h"

#include <dlfcn.h>
#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <ctime>
#include <vector>

#include "support/FaultPoint.h"
#include "support/PrivateRoot.h"

namespace vantor::support {
namespace {

constexpr const char* alerts = "/var/run/nuvex/system-alerts";
constexpr std::time_t someTime = 1709622489;  // 2024-03-05, 07:08:09 UTC

// Calls of the library, as a test sees and steers them.
struct LibraryCalls {
    const PrivateRoot* root = nullptr;  // where folders are made; null: nowhere
    std::time_t now = 0;                // 0: the real time
    FaultPoint mkdir;
    FaultPoint write;
    std::vector<std::string> folders;  // that were to be made

    void Reset() {
        root = nullptr;
        now = 0;
        mkdir.Reset();
        write.Reset();
        folders.clear();
    }
};

LibraryCalls& Calls() {
    // Never destroyed: the wrapped calls are made until the very end.
    static auto* const calls = new LibraryCalls;
    return *calls;
}

class NvkCtlTest : public ::testing::Test {
protected:
    NvkCtlTest() {
        OpenFault().Reset();
        Calls().Reset();
        Calls().root = &root;
        Calls().now = someTime;
    }
    ~NvkCtlTest() override { Calls().Reset(); }

    static void Raise(const std::string& text) {
        NvkCtl::System::SystemInfoImpl().SetSystemAlert(text);
    }

    PrivateRoot root;
};

TEST_F(NvkCtlTest, AnAlertIsALineOfTheUtcTimeAndTheText) {
    Raise("the disk is on fire");
    EXPECT_EQ(root.Read(alerts), "2024-03-05T07:08:09Z the disk is on fire\n");
}

TEST_F(NvkCtlTest, TheTimeIsUtcWhateverTheTimeZone) {
    setenv("TZ", "UTC-5:30", 1);
    tzset();
    Raise("x");
    unsetenv("TZ");
    tzset();
    EXPECT_EQ(root.Read(alerts), "2024-03-05T07:08:09Z x\n");
}

TEST_F(NvkCtlTest, AlertsAreAppended) {
    Raise("first");
    Calls().now = someTime + 1;
    Raise("second");
    EXPECT_EQ(root.Read(alerts), "2024-03-05T07:08:09Z first\n2024-03-05T07:08:10Z second\n");
}

TEST_F(NvkCtlTest, FoldersAreMadeFromTheTop) {
    Raise("x");
    EXPECT_THAT(Calls().folders, ::testing::ElementsAre("/var", "/var/run", "/var/run/nuvex"));
}

TEST_F(NvkCtlTest, FoldersThatAreThereAreUsed) {
    root.Write(alerts, "2024-01-01T00:00:00Z of an earlier boot\n");
    Raise("x");
    EXPECT_EQ(root.Read(alerts),
              "2024-01-01T00:00:00Z of an earlier boot\n2024-03-05T07:08:09Z x\n");
}

TEST_F(NvkCtlTest, AnAlertIsWrittenInOneCall) {
    Raise(std::string(100000, 'x'));
    EXPECT_EQ(Calls().write.Calls(), 1);
    EXPECT_EQ(root.Read(alerts), "2024-03-05T07:08:09Z " + std::string(100000, 'x') + "\n");
}

TEST_F(NvkCtlTest, LineEndsInATextDoNotMakeASecondAlert) {
    Raise("one\ntwo\r\nthree\n");
    EXPECT_EQ(root.Read(alerts), "2024-03-05T07:08:09Z one two  three \n");
}

TEST_F(NvkCtlTest, ATextIsNotTakenForAFormat) {
    Raise("%s%n 100%%");
    EXPECT_EQ(root.Read(alerts), "2024-03-05T07:08:09Z %s%n 100%%\n");
}

TEST_F(NvkCtlTest, AnEmptyTextIsAnAlert) {
    Raise("");
    EXPECT_EQ(root.Read(alerts), "2024-03-05T07:08:09Z \n");
}

TEST_F(NvkCtlTest, ThePermissionsOfTheFileLetEveryoneRead) {
    const mode_t mask = umask(0);
    Raise("x");
    umask(mask);
    EXPECT_EQ(ModeOf(root.Path(alerts)), 0644U);
}

// Each way to lose an alert: the caller does not notice, and keeps its errno.
TEST_F(NvkCtlTest, AFolderThatCannotBeMadeLosesTheAlertQuietly) {
    Calls().mkdir.FailFrom(1, EROFS);
    errno = EDOM;
    EXPECT_NO_THROW(Raise("x"));
    EXPECT_EQ(errno, EDOM);
    EXPECT_FALSE(root.Has(alerts));
}

TEST_F(NvkCtlTest, AFileThatCannotBeOpenedLosesTheAlertQuietly) {
    OpenFault().FailCall(1, EACCES);
    errno = EDOM;
    EXPECT_NO_THROW(Raise("x"));
    EXPECT_EQ(errno, EDOM);
    EXPECT_EQ(Calls().write.Calls(), 0);
    OpenFault().Reset();
}

TEST_F(NvkCtlTest, AFullDiskLosesTheAlertQuietly) {
    Calls().write.FailCall(1, ENOSPC);
    errno = EDOM;
    EXPECT_NO_THROW(Raise("x"));
    EXPECT_EQ(errno, EDOM);
    EXPECT_EQ(Calls().write.Calls(), 1);
    EXPECT_EQ(root.Read(alerts), "");
}

TEST_F(NvkCtlTest, ANamedPipeInThePlaceOfTheFileDoesNotStopTheCaller) {
    root.MakeFolder("/var/run/nuvex");
    ASSERT_EQ(mkfifo(root.Path(alerts).c_str(), 0600), 0);
    EXPECT_NO_THROW(Raise("x"));
    EXPECT_EQ(Calls().write.Calls(), 0);
}

TEST_F(NvkCtlTest, NoDescriptorIsLeftOpen) {
    const int before = open("/dev/null", O_RDONLY | O_CLOEXEC);
    close(before);
    Raise("x");
    const int after = open("/dev/null", O_RDONLY | O_CLOEXEC);
    close(after);
    EXPECT_EQ(after, before);
}

TEST_F(NvkCtlTest, OneObjectRaisesAnyNumberOfAlerts) {
    NvkCtl::System::SystemInfoImpl info;
    info.SetSystemAlert("1");
    info.SetSystemAlert("2");
    EXPECT_EQ(root.Read(alerts), "2024-03-05T07:08:09Z 1\n2024-03-05T07:08:09Z 2\n");
}

// The libraries as they are built for the program.
TEST(HostLibrariesTest, TheKernelControlLibraryHasTheThreeOperations) {
    void* const library = dlopen(HOSTLIBS_FOLDER "/libnvkctl.so", RTLD_LAZY | RTLD_LOCAL);
    ASSERT_NE(library, nullptr) << dlerror();
    for (const char* symbol :
         {"_ZN6NvkCtl6System14SystemInfoImplC1Ev", "_ZN6NvkCtl6System14SystemInfoImplD1Ev"}) {
        EXPECT_NE(dlsym(library, symbol), nullptr) << symbol;
    }
    EXPECT_NE(dlsym(library,
                    "_ZN6NvkCtl6System14SystemInfoImpl14SetSystemAlertERKNSt7__cxx1112basic_"
                    "stringIcSt11char_traitsIcESaIcEEE"),
              nullptr);
    dlclose(library);
}

TEST(HostLibrariesTest, TheKernelUserSpaceLibraryIsThere) {
    void* const library = dlopen(HOSTLIBS_FOLDER "/libnvkuser.so", RTLD_LAZY | RTLD_LOCAL);
    ASSERT_NE(library, nullptr) << dlerror();
    dlclose(library);
}

}  // namespace
}  // namespace vantor::support

using vantor::support::Calls;

extern "C" {

int __real_mkdir(const char* path, mode_t mode);
std::time_t __real_time(std::time_t* result);
ssize_t __real_write(int descriptor, const void* buffer, size_t size);

int __wrap_mkdir(const char* path, mode_t mode) {
    if (Calls().root == nullptr) {
        return __real_mkdir(path, mode);
    }
    Calls().folders.emplace_back(path);
    return Calls().mkdir.Fails() ? -1 : __real_mkdir(Calls().root->Path(path).c_str(), mode);
}

std::time_t __wrap_time(std::time_t* result) {
    return Calls().now != 0 ? Calls().now : __real_time(result);
}

ssize_t __wrap_write(int descriptor, const void* buffer, size_t size) {
    if (Calls().root == nullptr || descriptor <= STDERR_FILENO) {
        return __real_write(descriptor, buffer, size);
    }
    return Calls().write.Fails() ? -1 : __real_write(descriptor, buffer, size);
}

}  // extern "C"
