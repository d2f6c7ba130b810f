#include "basekit/CommandRunner.h"

#include <fcntl.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/time.h>
#include <sys/wait.h>
#include <unistd.h>

#include <boost/filesystem/directory.hpp>
#include <cerrno>
#include <csignal>
#include <cstdint>

#include "basekit/BaseKitFaults.h"
#include "support/ForkedChild.h"
#include "support/TempFolder.h"

namespace BaseKit::impl {

namespace {

using vantor::support::Faults;
using vantor::support::FaultScope;
using vantor::support::TempFolder;
using vantor::support::WriteFile;

constexpr std::size_t megabyte = std::size_t{1024} * 1024;

ProcessResult RunShell(const std::string& commands) {
    return RunProgram({"/bin/sh", "-c", commands});
}

void ExpectExit(const ProcessResult& result, int status) {
    EXPECT_EQ(result.end, ProcessEnd::Exited);
    EXPECT_EQ(result.code, status);
}

// Every test runs twice: once the kernel tells a program's end, and once, as old kernels do, it
// does not.
class CommandRunnerTest : public ::testing::TestWithParam<bool> {
protected:
    CommandRunnerTest() {
        if (!GetParam()) {
            Faults().pidfdOpen.FailFrom(1, ENOSYS);
        }
    }

    // A FIFO: whoever opens it waits until someone opens its other end.
    std::string MakeFifo() const {
        std::string path = folder.File("fifo");
        EXPECT_EQ(mkfifo(path.c_str(), 0600), 0);
        return path;
    }

    const FaultScope scope;
    const TempFolder folder;
};

std::string NameOf(const ::testing::TestParamInfo<bool>& info) {
    return info.param ? "Told" : "Watched";
}

INSTANTIATE_TEST_SUITE_P(Kernel, CommandRunnerTest, ::testing::Bool(), NameOf);

TEST_P(CommandRunnerTest, BothStreamsAreKeptApart) {
    const ProcessResult result = RunShell("echo one; echo two >&2; echo three");
    ExpectExit(result, 0);
    EXPECT_EQ(result.standardOutput.Text(), "one\nthree\n");
    EXPECT_EQ(result.standardError.Text(), "two\n");
}

TEST_P(CommandRunnerTest, TheExitStatusIsKnown) { ExpectExit(RunShell("exit 37"), 37); }

TEST_P(CommandRunnerTest, TheSignalThatKilledIsKnown) {
    const ProcessResult result = RunShell("echo before; kill -KILL $$");
    EXPECT_EQ(result.end, ProcessEnd::Killed);
    EXPECT_EQ(result.code, SIGKILL);
    EXPECT_EQ(result.standardOutput.Text(), "before\n");
}

TEST_P(CommandRunnerTest, AMissingProgramIsNotStarted) {
    const ProcessResult result = RunProgram({folder.File("missing")});
    EXPECT_EQ(result.end, ProcessEnd::NotStarted);
    EXPECT_EQ(result.code, ENOENT);
    EXPECT_EQ(result.obstacle, nullptr);
}

TEST_P(CommandRunnerTest, AFileThatIsNoProgramIsNotStarted) {
    WriteFile(folder.File("data"), "#!/bin/sh\n", 0644);
    const ProcessResult result = RunProgram({folder.File("data")});
    EXPECT_EQ(result.end, ProcessEnd::NotStarted);
    EXPECT_EQ(result.code, EACCES);
}

// A shell would run it as a script of its own.
TEST_P(CommandRunnerTest, AScriptWithoutAnInterpreterIsNotStarted) {
    WriteFile(folder.File("script"), "echo hello\n", 0755);
    const ProcessResult result = RunProgram({folder.File("script")});
    EXPECT_EQ(result.end, ProcessEnd::NotStarted);
    EXPECT_EQ(result.code, ENOEXEC);
}

TEST_P(CommandRunnerTest, NoShellReadsTheArguments) {
    const ProcessResult result = RunProgram({"/bin/echo", "$HOME", "*", "; id", "", "a  b"});
    EXPECT_EQ(result.standardOutput.Text(), "$HOME * ; id  a  b\n");
}

TEST_P(CommandRunnerTest, MoreThanThePipesHoldIsReadFromOneStreamAfterTheOther) {
    const ProcessResult result =
        RunShell("head -c 1048576 /dev/zero >&2; head -c 1048576 /dev/zero; exit 5");
    ExpectExit(result, 5);
    EXPECT_EQ(result.standardOutput.Text(), std::string(megabyte, '\0'));
    EXPECT_EQ(result.standardError.LeftOut(), megabyte - errorHeadLimit - errorTailLimit);
}

TEST_P(CommandRunnerTest, MoreThanThePipesHoldIsReadFromBothStreamsAtOnce) {
    const ProcessResult result =
        RunShell("head -c 1048576 /dev/zero >&2 & head -c 1048576 /dev/zero; wait $!");
    ExpectExit(result, 0);
    EXPECT_EQ(result.standardOutput.Text(), std::string(megabyte, '\0'));
    EXPECT_EQ(result.standardError.LeftOut(), megabyte - errorHeadLimit - errorTailLimit);
}

TEST_P(CommandRunnerTest, AProgramThatClosesItsStreamsIsStillWaitedFor) {
    const ProcessResult result = RunShell("echo last; exec >&- 2>&-; /bin/true; /bin/true; exit 4");
    ExpectExit(result, 4);
    EXPECT_EQ(result.standardOutput.Text(), "last\n");
}

TEST_P(CommandRunnerTest, ABackgroundChildThatKeepsTheStreamsIsNotWaitedFor) {
    const std::string fifo = MakeFifo();
    const ProcessResult result =
        RunProgram({"/bin/sh", "-c", "cat \"$0\" & head -c 60000 /dev/zero", fifo});
    ExpectExit(result, 0);
    EXPECT_EQ(result.standardOutput.Text(), std::string(60000, '\0'));

    // The child has been there all the time: it takes the other end and comes to its end with it.
    const int release = open(fifo.c_str(), O_WRONLY);
    EXPECT_GE(release, 0);
    close(release);
}

// Its output never comes to an end, and it writes faster than it is read.
TEST_P(CommandRunnerTest, ABackgroundChildThatFloodsTheStreamsIsNotWaitedFor) {
    const ProcessResult result = RunShell("yes & yes >&2 & exit 6");
    ExpectExit(result, 6);
}

TEST_P(CommandRunnerTest, StandardInputIsTheNullDevice) {
    const ProcessResult result = RunProgram({"/bin/readlink", "/proc/self/fd/0"});
    EXPECT_EQ(result.standardOutput.Text(), "/dev/null\n");
    ExpectExit(RunProgram({"/bin/cat"}), 0);
}

TEST_P(CommandRunnerTest, NoOtherDescriptorIsInherited) {
    const int inheritable = open("/dev/null", O_RDONLY);
    const ProcessResult result = RunProgram({"/bin/ls", "/proc/self/fd"});
    close(inheritable);
    EXPECT_EQ(result.standardOutput.Text(), "0\n1\n2\n3\n");  // 3 is the folder that it lists
}

// A set of signals in the text of /proc/<process>/status, without the two that the C library keeps
// for itself and lets nobody reset.
std::uint64_t SignalSet(const std::string& status, const std::string& name) {
    const std::size_t at = status.find(name + ":\t");
    EXPECT_NE(at, std::string::npos);
    return std::stoull(status.substr(at + name.size() + 2, 16), nullptr, 16) & ~0x180000000ULL;
}

TEST_P(CommandRunnerTest, EverySignalIsAsNew) {
    sigset_t blocked;
    sigset_t before;
    sigemptyset(&blocked);
    sigaddset(&blocked, SIGTERM);
    pthread_sigmask(SIG_BLOCK, &blocked, &before);
    auto* const oldPipe = std::signal(SIGPIPE, SIG_IGN);
    auto* const oldHangup = std::signal(SIGHUP, SIG_IGN);

    const ProcessResult result = RunProgram({"/bin/cat", "/proc/self/status"});

    std::signal(SIGPIPE, oldPipe);
    std::signal(SIGHUP, oldHangup);
    pthread_sigmask(SIG_SETMASK, &before, nullptr);
    EXPECT_EQ(SignalSet(result.standardOutput.Text(), "SigBlk"), 0U);
    EXPECT_EQ(SignalSet(result.standardOutput.Text(), "SigIgn"), 0U);
}

TEST_P(CommandRunnerTest, SignalsThatArriveMeanwhileDoNoHarm) {
    auto* const old = std::signal(SIGALRM, [](int) {});
    const itimerval everyMillisecond = {{0, 1000}, {0, 1000}};
    setitimer(ITIMER_REAL, &everyMillisecond, nullptr);
    const ProcessResult result =
        RunShell("head -c 1048576 /dev/zero >&2; head -c 1048576 /dev/zero; exit 7");
    const itimerval never = {};
    setitimer(ITIMER_REAL, &never, nullptr);
    std::signal(SIGALRM, old);

    ExpectExit(result, 7);
    EXPECT_EQ(result.standardOutput.Text().size(), megabyte);
}

// A parent may have left SIGCHLD ignored; the kernel then throws every exit status away.
TEST_P(CommandRunnerTest, AnEndThatNobodyCanTellIsSaidToBeUnknown) {
    auto* const old = std::signal(SIGCHLD, SIG_IGN);
    const ProcessResult result = RunShell("echo done");
    std::signal(SIGCHLD, old);

    EXPECT_EQ(result.end, ProcessEnd::Unknown);
    EXPECT_EQ(result.code, ECHILD);
    EXPECT_EQ(result.standardOutput.Text(), "done\n");
}

// A daemon may have closed its standard descriptors; a pipe then gets their numbers.
TEST_P(CommandRunnerTest, WorksWithoutStandardDescriptors) {
    const auto report = vantor::support::RunForked([](int descriptor) {
        for (const int standard : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
            close(standard);
        }
        const ProcessResult result = RunShell("readlink /proc/self/fd/0; echo oops >&2; exit 8");
        vantor::support::WriteReport(descriptor,
                                     result.standardOutput.Text() + result.standardError.Text());
        return result.end == ProcessEnd::Exited ? result.code : 99;
    });
    EXPECT_EQ(report.text, "/dev/null\noops\n");
    EXPECT_EQ(WEXITSTATUS(report.status), 8);
}

TEST_P(CommandRunnerTest, WithoutANullDeviceNothingIsStarted) {
    Faults().open.FailFrom(1, ENOENT);
    const ProcessResult result = RunShell("exit 0");
    EXPECT_EQ(result.end, ProcessEnd::NotStarted);
    EXPECT_EQ(result.code, ENOENT);
    EXPECT_STREQ(result.obstacle, "/dev/null");
}

TEST_P(CommandRunnerTest, WithoutAPipeNothingIsStarted) {
    for (const int call : {1, 2}) {
        Faults().pipe2.FailCall(call, EMFILE);
        const ProcessResult result = RunShell("exit 0");
        EXPECT_EQ(result.end, ProcessEnd::NotStarted);
        EXPECT_EQ(result.code, EMFILE);
        EXPECT_STREQ(result.obstacle, "a pipe for its output");
    }
}

// How many descriptors this process has open.
std::ptrdiff_t OpenDescriptors() {
    return std::distance(boost::filesystem::directory_iterator("/proc/self/fd"), {});
}

TEST_P(CommandRunnerTest, NoDescriptorStaysOpenAfterwards) {
    const std::ptrdiff_t before = OpenDescriptors();
    RunShell("echo one; echo two >&2");
    RunProgram({folder.File("missing")});
    Faults().pipe2.FailCall(2, EMFILE);
    RunShell("exit 0");
    EXPECT_EQ(OpenDescriptors(), before);
}

}  // namespace

}  // namespace BaseKit::impl
