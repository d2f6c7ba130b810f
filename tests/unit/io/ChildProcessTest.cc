#include "io/ChildProcess.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <sys/wait.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <csignal>
#include <cstdlib>
#include <functional>
#include <memory>
#include <sstream>
#include <string>
#include <thread>
#include <utility>
#include <vector>

#include "io/IoFaults.h"
#include "support/ForkedChild.h"
#include "support/TempFolder.h"

namespace vantor {

namespace {

using support::Faults;
using support::ReadFile;
using support::WriteFile;

// A child's setup together with what it points to.
class Command {
public:
    Command(std::vector<std::string> argumentWords, std::vector<std::string> environmentWords)
        : words(std::move(argumentWords)),
          variables(std::move(environmentWords)),
          arguments(Pointers(words)),
          environment(Pointers(variables)) {
        setup.path = words.front().c_str();
        setup.arguments = arguments.data();
        setup.environment = environment.data();
    }
    Command(const Command&) = delete;
    Command& operator=(const Command&) = delete;

    ChildOutcome Run() const { return RunChild(setup); }

private:
    static std::vector<char*> Pointers(std::vector<std::string>& texts) {
        std::vector<char*> pointers;
        for (std::string& text : texts) {
            pointers.push_back(text.data());
        }
        pointers.push_back(nullptr);
        return pointers;
    }

    std::vector<std::string> words;
    std::vector<std::string> variables;
    std::vector<char*> arguments;
    std::vector<char*> environment;

public:
    ChildSetup setup;
};

class ChildProcessTest : public support::IoTest {
protected:
    // Runs a shell script of one line, which has the standard descriptors only; "$1" in it is the
    // path of the output file.
    ChildOutcome RunScript(
        const std::string& script,
        const std::function<void(ChildSetup&)>& change = [](ChildSetup&) {}) const {
        Command command({"/bin/sh", "-c", script, "script", output}, {"PATH=/usr/bin:/bin"});
        command.setup.closeFrom = STDERR_FILENO + 1;
        change(command.setup);
        return command.Run();
    }

    // What the shell does: a session of its own on the terminal that is its standard input.
    ChildOutcome TakeTerminal() const {
        return RunScript("cat /proc/$$/stat > \"$1\"; :", [](ChildSetup& setup) {
            setup.newSession = true;
            setup.takeTerminal = true;
        });
    }

    std::string Output() const { return ReadFile(output); }

    const support::TempFolder folder;
    const std::string output = folder.File("output");
};

void ExpectOutcome(const ChildOutcome& outcome, ChildStep step, int error) {
    EXPECT_EQ(outcome.step, step);
    EXPECT_EQ(outcome.error, error);
}

void ExpectNoChildIsLeft() {
    EXPECT_EQ(waitpid(-1, nullptr, WNOHANG), -1);
    EXPECT_EQ(errno, ECHILD);
}

// Field number `field` of /proc/<pid>/stat, counted from 1, of a program whose name has no blank.
long StatField(const std::string& line, int field) {
    std::istringstream words(line);
    std::string word;
    for (int i = 0; i < field; ++i) {
        words >> word;
    }
    return std::stol(word);
}
constexpr int processField = 1;
constexpr int sessionField = 6;
constexpr int terminalField = 7;

TEST_F(ChildProcessTest, ProgramRunsToItsEnd) {
    ExpectOutcome(RunScript("echo begun > \"$1\"; echo ended >> \"$1\""), ChildStep::Done, 0);
    EXPECT_EQ(Output(), "begun\nended\n");
    ExpectNoChildIsLeft();
}

TEST_F(ChildProcessTest, ExitStatusIsIgnored) {
    ExpectOutcome(RunScript("exit 7"), ChildStep::Done, 0);
}

TEST_F(ChildProcessTest, DeathBySignalIsIgnored) {
    ExpectOutcome(RunScript("kill -9 $$"), ChildStep::Done, 0);
}

TEST_F(ChildProcessTest, ArgumentsAreTheProgramsWhole) {
    const Command command(
        {"/bin/sh", "-c", "printf '%s|' \"$0\" \"$@\" > \"$0\"", output, "", "a b", "%s"}, {});
    ExpectOutcome(command.Run(), ChildStep::Done, 0);
    EXPECT_EQ(Output(), output + "||a b|%s|");
}

TEST_F(ChildProcessTest, EnvironmentIsTheProgramsWhole) {
    const Command command({"/bin/sh", "-c", "cat /proc/$$/environ > \"$0\"; :", output},
                          {"A=1", "B=two words"});
    ExpectOutcome(command.Run(), ChildStep::Done, 0);
    EXPECT_EQ(Output(), std::string("A=1\0B=two words\0", 16));
}

TEST_F(ChildProcessTest, EmptyEnvironmentIsEmpty) {
    const Command command({"/bin/sh", "-c", "cat /proc/$$/environ > \"$0\"; :", output}, {});
    ExpectOutcome(command.Run(), ChildStep::Done, 0);
    EXPECT_EQ(Output(), "");
}

TEST_F(ChildProcessTest, MissingProgramIsReportedWithItsError) {
    const Command command({folder.File("missing")}, {});
    ExpectOutcome(command.Run(), ChildStep::Exec, ENOENT);
}

TEST_F(ChildProcessTest, ProgramThatMayNotBeExecutedIsReportedWithItsError) {
    WriteFile(output, "#!/bin/sh\n", 0644);
    const Command command({output}, {});
    ExpectOutcome(command.Run(), ChildStep::Exec, EACCES);
}

TEST_F(ChildProcessTest, FileThatIsNoProgramIsReportedWithItsError) {
    WriteFile(output, "no program\n", 0755);
    const Command command({output}, {});
    ExpectOutcome(command.Run(), ChildStep::Exec, ENOEXEC);
}

TEST_F(ChildProcessTest, ChildThatCannotExecuteExitsWithStatus1) {
    const Command command({folder.File("missing")}, {});
    int status = -1;
    Faults().waitpid.Before([&] {
        siginfo_t information{};
        // Looks at the ended child and leaves it to be waited for.
        ASSERT_EQ(waitid(P_ALL, 0, &information, WEXITED | WNOWAIT), 0);
        ASSERT_EQ(information.si_code, CLD_EXITED);
        status = information.si_status;
    });
    ExpectOutcome(command.Run(), ChildStep::Exec, ENOENT);
    EXPECT_EQ(status, 1);
}

TEST_F(ChildProcessTest, NoChildIsReportedWithItsError) {
    Faults().fork.FailCall(1, EAGAIN);
    ExpectOutcome(RunScript("echo ran > \"$1\""), ChildStep::Fork, EAGAIN);
    EXPECT_EQ(folder.Entries().size(), 0U);
    EXPECT_EQ(Faults().waitpid.Calls(), 0);
}

TEST_F(ChildProcessTest, NewSessionIsTheChildsOwn) {
    ExpectOutcome(RunScript("cat /proc/$$/stat > \"$1\"; :",
                            [](ChildSetup& setup) { setup.newSession = true; }),
                  ChildStep::Done, 0);
    EXPECT_EQ(StatField(Output(), sessionField), StatField(Output(), processField));
}

TEST_F(ChildProcessTest, ChildStaysInTheSessionUnlessAskedToLeave) {
    ExpectOutcome(RunScript("cat /proc/$$/stat > \"$1\"; :"), ChildStep::Done, 0);
    EXPECT_EQ(StatField(Output(), sessionField), static_cast<long>(getsid(0)));
}

TEST_F(ChildProcessTest, FailedSessionIsReportedAndTheProgramNotRun) {
    Faults().setsid.FailFrom(1, EPERM);
    ExpectOutcome(
        RunScript("echo ran > \"$1\"", [](ChildSetup& setup) { setup.newSession = true; }),
        ChildStep::Session, EPERM);
    EXPECT_EQ(folder.Entries().size(), 0U);
}

TEST_F(ChildProcessTest, DescriptorsFromCloseFromOnAreClosedButTheKeptOnes) {
    const support::ChildReport child = support::RunForked([&](int) {
        for (const int descriptor : {50, 51, 52, 700}) {
            dup2(STDERR_FILENO, descriptor);
        }
        const ChildOutcome outcome = RunScript("exec > \"$1\"; ls /proc/$$/fd; :",
                                               [](ChildSetup& setup) { setup.kept.Add(51); });
        return outcome.step == ChildStep::Done ? 0 : 1;
    });
    EXPECT_EQ(child.status, 0);
    EXPECT_EQ(Output(), "0\n1\n2\n51\n");
}

TEST_F(ChildProcessTest, FailureIsReportedThoughEveryDescriptorIsClosed) {
    Command command({folder.File("missing")}, {});
    command.setup.closeFrom = 0;
    ExpectOutcome(command.Run(), ChildStep::Exec, ENOENT);
}

TEST_F(ChildProcessTest, NothingIsLeftOpenInTheCaller) {
    const int before = dup(STDERR_FILENO);
    ASSERT_EQ(close(before), 0);
    RunScript("exit 0");
    Faults().fork.FailCall(1, EAGAIN);
    RunScript("exit 0");
    const int after = dup(STDERR_FILENO);
    EXPECT_EQ(after, before);
    EXPECT_EQ(close(after), 0);
}

TEST_F(ChildProcessTest, WithoutAPipeTheProgramStillRuns) {
    Faults().pipe2.FailCall(1, EMFILE);
    ExpectOutcome(RunScript("echo ran > \"$1\""), ChildStep::Done, 0);
    EXPECT_EQ(Output(), "ran\n");
}

TEST_F(ChildProcessTest, WithoutAPipeAFailureGoesUnreported) {
    Faults().pipe2.FailCall(1, EMFILE);
    const Command command({folder.File("missing")}, {});
    ExpectOutcome(command.Run(), ChildStep::Done, 0);
}

TEST_F(ChildProcessTest, InterruptedWaitIsTakenUpAgain) {
    Faults().waitpid.FailCall(1, EINTR);
    ExpectOutcome(RunScript("exit 0"), ChildStep::Done, 0);
    EXPECT_EQ(Faults().waitpid.Calls(), 2);
    ExpectNoChildIsLeft();
}

TEST_F(ChildProcessTest, InterruptedReadOfTheReportIsTakenUpAgain) {
    Faults().read.FailCall(1, EINTR);
    const Command command({folder.File("missing")}, {});
    ExpectOutcome(command.Run(), ChildStep::Exec, ENOENT);
}

TEST_F(ChildProcessTest, ReportThatCannotBeReadCountsAsDone) {
    Faults().read.FailCall(1, EIO);
    const Command command({folder.File("missing")}, {});
    ExpectOutcome(command.Run(), ChildStep::Done, 0);
}

TEST_F(ChildProcessTest, ReturnsThoughTheSystemReapsChildrenItself) {
    const auto oldHandler = std::signal(SIGCHLD, SIG_IGN);
    ExpectOutcome(RunScript("echo ran > \"$1\""), ChildStep::Done, 0);
    (void)std::signal(SIGCHLD, oldHandler);
    EXPECT_EQ(Output(), "ran\n");
}

// The child is a copy of a process whose other threads are in the middle of something: it must not
// wait for a lock that one of them held.
TEST_F(ChildProcessTest, ProgramsRunWhileOtherThreadsAllocateAllTheTime) {
    std::atomic<bool> allocating{true};
    std::vector<std::thread> threads;
    for (int i = 0; i < 3; ++i) {
        threads.emplace_back([&] {
            while (allocating) {
                EXPECT_EQ(std::make_unique<std::string>(5000, 'x')->size(), 5000U);
            }
        });
    }
    for (int round = 0; round < 20; ++round) {
        ExpectOutcome(RunScript("exit 0"), ChildStep::Done, 0);
        ExpectOutcome(Command({folder.File("missing")}, {}).Run(), ChildStep::Exec, ENOENT);
    }
    allocating = false;
    for (std::thread& thread : threads) {
        thread.join();
    }
}

// In a child of the test, whose standard input becomes a new terminal's.
TEST_F(ChildProcessTest, StandardInputBecomesTheControllingTerminal) {
    const support::ChildReport child = support::RunForked([&](int report) {
        const int master = posix_openpt(O_RDWR | O_NOCTTY | O_CLOEXEC);
        if (master < 0 || grantpt(master) != 0 || unlockpt(master) != 0) {
            return 1;
        }
        const int slave = open(ptsname(master), O_RDWR | O_NOCTTY);
        dup2(slave, STDIN_FILENO);
        struct stat terminal {};
        fstat(slave, &terminal);
        support::WriteReport(report, std::to_string(terminal.st_rdev));
        return TakeTerminal().step == ChildStep::Done ? 0 : 2;
    });
    ASSERT_EQ(child.status, 0);
    EXPECT_EQ(std::to_string(StatField(Output(), terminalField)), child.text);
}

TEST_F(ChildProcessTest, RefusedTerminalIsIgnored) {
    const support::ChildReport child = support::RunForked([&](int) {
        dup2(open("/dev/null", O_RDONLY), STDIN_FILENO);
        return TakeTerminal().step == ChildStep::Done ? 0 : 1;
    });
    ASSERT_EQ(child.status, 0);
    EXPECT_EQ(StatField(Output(), terminalField), 0);
}

}  // namespace

}  // namespace vantor
