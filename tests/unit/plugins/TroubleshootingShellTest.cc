#include "plugins/TroubleshootingShell.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <iostream>

#include "plugins/OperatorTerminal.h"
#include "plugins/TerminalCalls.h"
#include "support/HostCalls.h"
#include "support/PrivateRoot.h"
#include "support/StreamCapture.h"
#include "support/SyslogCapture.h"
#include "support/TempFolder.h"

namespace vantor {
namespace {

using support::LogEntry;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

const std::string eraseLine = "\033[2K";

class TroubleshootingShellTest : public ::testing::Test {
protected:
    TroubleshootingShellTest() { support::OpenFault().Reset(); }

    // Runs the shell with an operator who types the commands, its output going to a file; returns
    // that output.
    std::string OutputOf(const std::string& commands) {
        const support::TempFolder folder;
        const std::string path = folder.File("output");
        const int file = open(path.c_str(), O_WRONLY | O_CREAT | O_APPEND | O_CLOEXEC, 0600);
        {
            const support::DescriptorReplacement out(STDOUT_FILENO, file);
            const support::DescriptorReplacement err(STDERR_FILENO, file);
            terminal.Press(commands + "\nexit 3\n");
            RunTroubleshootingShell();
        }
        close(file);
        return support::ReadFile(path);
    }

    support::HostCalls calls;
    support::OperatorTerminal terminal;
    support::SyslogCapture log;
    support::StreamCapture output{std::cout};
    support::StreamCapture errors{std::cerr};
};

TEST_F(TroubleshootingShellTest, RunsTheOperatorsCommandsAndErasesTheLineAtTheEnd) {
    EXPECT_EQ(OutputOf("echo $0 $#"), "/bin/sh 0\n");
    EXPECT_EQ(output.Text(), eraseLine);
    EXPECT_EQ(errors.Text(), "");
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(TroubleshootingShellTest, TheShellLeadsASessionOfItsOwn) {
    // The sixth field of the status is the session.
    EXPECT_EQ(OutputOf("set -- $(cat /proc/$$/stat); [ $6 = $$ ] && echo leader"), "leader\n");
}

TEST_F(TroubleshootingShellTest, StandardInputIsTheShellsControllingTerminal) {
    // A process without one cannot open this.
    EXPECT_EQ(OutputOf("true </dev/tty && echo controlled"), "controlled\n");
}

TEST_F(TroubleshootingShellTest, OnlyTheStandardDescriptorsAreLeftToTheShell) {
    const int inherited = fcntl(STDERR_FILENO, F_DUPFD, 200);
    ASSERT_GE(inherited, 200);
    // A shell may keep a descriptor of its own from 10 on.
    EXPECT_EQ(OutputOf("for fd in 3 4 5 6 7 8 9 " + std::to_string(inherited) +
                       "; do [ -e /proc/$$/fd/$fd ] && echo $fd; done; echo end"),
              "end\n");
    close(inherited);
}

TEST_F(TroubleshootingShellTest, TheShellHasTheProgramsEnvironment) {
    setenv("VANTOR_SHELL_TEST", "kept", 1);
    EXPECT_EQ(OutputOf("echo $VANTOR_SHELL_TEST"), "kept\n");
    unsetenv("VANTOR_SHELL_TEST");
}

TEST_F(TroubleshootingShellTest, AFailedForkIsLoggedAndExplained) {
    calls.fork.FailCall(1, EAGAIN);
    RunTroubleshootingShell();
    EXPECT_EQ(errors.Text(), std::string("unable to launch a troubleshooting shell:") +
                                 std::strerror(EAGAIN) + "\n");
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_ERR, std::string("failed to fork: ") +
                                                                 std::strerror(EAGAIN)}));
    EXPECT_EQ(output.Text(), "");
}

TEST_F(TroubleshootingShellTest, ASessionThatCannotBeMadeIsLogged) {
    calls.setsid.FailCall(1, EPERM);
    EXPECT_EQ(OutputOf("echo never run"), "");
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, std::string("unable to create new session: ") +
                                                  std::strerror(EPERM)}));
    EXPECT_EQ(output.Text(), eraseLine);
    EXPECT_EQ(errors.Text(), "");
}

TEST_F(TroubleshootingShellTest, AShellThatCannotBeExecutedIsLogged) {
    support::ExecFault().FailCall(1, ENOEXEC);
    EXPECT_EQ(OutputOf("echo never run"), "");
    support::ExecFault().Reset();
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_ERR, std::string("unable to exec shell: ") +
                                                                 std::strerror(ENOEXEC)}));
    EXPECT_EQ(output.Text(), eraseLine);
}

}  // namespace
}  // namespace vantor
