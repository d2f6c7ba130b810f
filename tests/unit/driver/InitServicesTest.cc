#include "driver/InitServices.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <iostream>

#include "support/HostCalls.h"
#include "support/PrivateRoot.h"
#include "support/StreamCapture.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using support::LogEntry;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;

constexpr const char* syslogDaemon = "/usr/lib/nuvex/nvsyslog/bin/nvsyslogd";
constexpr const char* eventDaemonScript = "/etc/init.d/nvevtd";
constexpr const char* pidFile = "/var/run/nuvex/nvsyslogd.pid";
constexpr const char* upgradeScript = "/usr/lib/nuvex/nvsyslog/bin/upgrade-syslog.conf.sh";

class InitServicesTest : public ::testing::Test {
protected:
    void ExpectSilence() const {
        EXPECT_EQ(output.Text() + errors.Text(), "");
        EXPECT_THAT(log.Entries(), IsEmpty());
    }

    support::PrivateRoot root;
    support::HostCalls calls;
    support::SyslogCapture log;
    support::StreamCapture output{std::cout};
    support::StreamCapture errors{std::cerr};
};

// A service that is launched: its operation and the fixed path of its program.
struct Service {
    void (*launch)();
    const char* path;
    const char* argument;
};

void PrintTo(const Service& value, std::ostream* stream) { *stream << value.path; }

class LaunchTest : public InitServicesTest, public ::testing::WithParamInterface<Service> {
protected:
    // Launches a script of these commands in the service's place. It finds the place of its output
    // in "$out": it has no environment to find it in.
    void Launch(const std::string& commands) const {
        root.WriteScript(GetParam().path, "out=" + root.Path("/out") + "\n" + commands);
        GetParam().launch();
    }
};

TEST_P(LaunchTest, GivesItsSingleArgument) {
    Launch("echo \"$# $1\" > $out\n");
    EXPECT_EQ(root.Read("/out"), std::string("1 ") + GetParam().argument + "\n");
    ExpectSilence();
}

TEST_P(LaunchTest, GivesAnEmptyEnvironment) {
    setenv("VANTOR_SERVICE_TEST", "leaked", 1);
    Launch("/bin/cat /proc/$$/environ > $out\n");
    unsetenv("VANTOR_SERVICE_TEST");
    EXPECT_EQ(root.Read("/out"), "");
}

TEST_P(LaunchTest, GivesTheStandardDescriptorsAlone) {
    const int inherited = fcntl(STDERR_FILENO, F_DUPFD, 200);
    ASSERT_GE(inherited, 200);
    // A shell may keep a descriptor of its own from 10 on.
    Launch("for fd in 0 1 2 3 4 5 6 7 8 9 " + std::to_string(inherited) +
           "; do [ -e /proc/$$/fd/$fd ] && echo $fd; done > $out.new\n"
           "/bin/mv $out.new $out\n");
    close(inherited);
    // The loop's own redirection takes the place of standard output and keeps it at 10.
    EXPECT_EQ(root.Read("/out"), "0\n1\n2\n");
}

TEST_P(LaunchTest, WaitsForTheEndAndTakesAnyStatus) {
    Launch("/bin/sleep 0\necho done > $out\nexit 7\n");
    EXPECT_EQ(root.Read("/out"), "done\n");
    ExpectSilence();
}

TEST_P(LaunchTest, DoesNothingAndReportsNothingWhenThereIsNoChild) {
    calls.fork.FailCall(1, EAGAIN);
    Launch("echo done > $out\n");
    EXPECT_FALSE(root.Has("/out"));
    ExpectSilence();
}

INSTANTIATE_TEST_SUITE_P(Services, LaunchTest,
                         ::testing::Values(Service{&LaunchSyslogDaemon, syslogDaemon, "-i"},
                                           Service{&StartEventDaemon, eventDaemonScript, "start"}));

TEST_F(InitServicesTest, ALogDaemonThatCannotBeExecutedIsReportedOnStandardError) {
    LaunchSyslogDaemon();
    EXPECT_EQ(errors.Text(), "execve(/usr/lib/nuvex/nvsyslog/bin/nvsyslogd, ...) failure: "
                             "No such file or directory\n");
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(InitServicesTest, ALogDaemonThatIsNoProgramIsReportedOnStandardError) {
    root.Write(syslogDaemon, "no program", 0644);
    LaunchSyslogDaemon();
    EXPECT_EQ(errors.Text(),
              "execve(/usr/lib/nuvex/nvsyslog/bin/nvsyslogd, ...) failure: Permission denied\n");
}

TEST_F(InitServicesTest, AnEventDaemonThatCannotBeExecutedIsReportedToSyslog) {
    StartEventDaemon();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{
                    LOG_ERR, "execve(/etc/init.d/nvevtd) failure: No such file or directory"}));
    EXPECT_EQ(errors.Text(), "");
}

TEST_F(InitServicesTest, ReloadWithoutAnOldConfigurationRunsNoScriptAndStillSignals) {
    root.Write(pidFile, "1234\n");
    ReloadSyslog();
    EXPECT_THAT(calls.commands, IsEmpty());
    EXPECT_THAT(calls.signals, ElementsAre(Pair(1234, SIGUSR1)));
    ExpectSilence();
}

TEST_F(InitServicesTest, ReloadWithAnOldConfigurationRunsTheUpgradeScriptFirst) {
    root.Write("/etc/syslog.conf", "");
    root.Write(pidFile, "1234\n");
    calls.systemStatus = 0;
    ReloadSyslog();
    EXPECT_THAT(calls.commands, ElementsAre(upgradeScript));
    EXPECT_THAT(calls.signals, ElementsAre(Pair(1234, SIGUSR1)));
    ExpectSilence();
}

TEST_F(InitServicesTest, TheExitStatusOfTheUpgradeScriptIsIgnored) {
    root.Write("/etc/syslog.conf", "");
    root.Write(pidFile, "1234\n");
    for (const int status : {0x100, 0x7f00, 9}) {
        calls.systemStatus = status;
        ReloadSyslog();
    }
    EXPECT_EQ(calls.signals.size(), 3U);
    ExpectSilence();
}

TEST_F(InitServicesTest, AnUpgradeScriptThatCannotBeRunIsLoggedAndTheReloadGoesOn) {
    root.Write("/etc/syslog.conf", "");
    root.Write(pidFile, "1234\n");
    calls.systemStatus = -1;
    ReloadSyslog();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, std::string("failed to call ") + upgradeScript}));
    EXPECT_THAT(calls.signals, ElementsAre(Pair(1234, SIGUSR1)));
}

TEST_F(InitServicesTest, AMissingPidFileIsExactlyOneWarningAndNoSignal) {
    ReloadSyslog();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING, "unable to open nvksyslogd pid file"}));
    EXPECT_THAT(calls.signals, IsEmpty());
}

TEST_F(InitServicesTest, AFailedSignalIsLogged) {
    root.Write(pidFile, "1234\n");
    calls.kill.FailCall(1, ESRCH);
    ReloadSyslog();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING, "failed to reload nvsyslogd: No such process"}));
}

struct PidCase {
    const char* content;
    pid_t pid;
};

void PrintTo(const PidCase& value, std::ostream* stream) {
    *stream << ::testing::PrintToString(value.content);
}

class GoodPidFileTest : public InitServicesTest, public ::testing::WithParamInterface<PidCase> {};

TEST_P(GoodPidFileTest, NamesTheProcessToSignal) {
    root.Write(pidFile, GetParam().content);
    ReloadSyslog();
    EXPECT_THAT(calls.signals, ElementsAre(Pair(GetParam().pid, SIGUSR1)));
    ExpectSilence();
}

INSTANTIATE_TEST_SUITE_P(Contents, GoodPidFileTest,
                         ::testing::Values(PidCase{"1234\n", 1234}, PidCase{"1234", 1234},
                                           PidCase{" \t\n 77 \n", 77}, PidCase{"0099\n", 99},
                                           PidCase{"12 34\n", 12}, PidCase{"56x\n", 56},
                                           PidCase{"2147483647\n", 2147483647}));

class BadPidFileTest : public InitServicesTest,
                       public ::testing::WithParamInterface<std::string> {};

TEST_P(BadPidFileTest, IsLoggedAndNobodyIsSignalled) {
    root.Write(pidFile, GetParam());
    ReloadSyslog();
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_ERR, "unable to read nvsyslogd pid"}));
    EXPECT_THAT(calls.signals, IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(Contents, BadPidFileTest,
                         ::testing::Values("", "\n", "abc\n", "x12\n", "0\n", "-1\n", "-1234\n",
                                           "2147483648\n", "4294967297\n",
                                           "99999999999999999999999\n", "-\n"));

TEST_F(InitServicesTest, APidFileThatIsAFolderIsLoggedAndNobodyIsSignalled) {
    root.MakeFolder(pidFile);
    ReloadSyslog();
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_ERR, "unable to read nvsyslogd pid"}));
    EXPECT_THAT(calls.signals, IsEmpty());
}

}  // namespace
}  // namespace vantor
