// The program's modes other than a plain run: help, selected plugins, invoke, dump and init.

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <cerrno>
#include <csignal>

#include "driver/MainDriverFixture.h"
#include "driver/RunOnceRecord.h"

namespace vantor {
namespace {

using support::LogEntry;
using support::ThreadFault;
using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::Pair;
using ::testing::StartsWith;

class MainDriverModesTest : public support::MainDriverTest {
protected:
    MainDriverModesTest() { WriteDebugConfig("probe:driver-need:driver-give:run probe\n"); }

    // Nothing was done beyond the command line.
    void ExpectNothingDone() const {
        EXPECT_THAT(calls.directories, IsEmpty());
        EXPECT_EQ(calls.setsid.Calls() + calls.fork.Calls(), 0);
        EXPECT_THAT(calls.commands, IsEmpty());
        EXPECT_FALSE(HasRecord());
        EXPECT_FALSE(HasReport());
        EXPECT_THAT(log.Entries(), IsEmpty());
    }
};

TEST_F(MainDriverModesTest, HelpEndsWith0AndDoesNothingElse) {
    EXPECT_EQ(RunDirectory({"--init", "--help"}), 0);
    ExpectNothingDone();
}

TEST_F(MainDriverModesTest, ABadOptionEndsWith1AndDoesNothingElse) {
    ::testing::internal::CaptureStderr();
    EXPECT_EQ(RunDirectory({"--init", "--nonsense"}), 1);
    EXPECT_THAT(::testing::internal::GetCapturedStderr(), HasSubstr("--nonsense"));
    ExpectNothingDone();
}

TEST_F(MainDriverModesTest, AnIncompleteInvokeEndsWith1AndDoesNothingElse) {
    EXPECT_EQ(RunDirectory({"--init", "--invoke", "--method=start"}), 1);
    ExpectNothingDone();
}

TEST_F(MainDriverModesTest, SelectedPluginsAloneAreLoadedInOrderAndNoDebugEntry) {
    AddFile("other");
    EXPECT_EQ(RunDirectory({"--plugin=b,a"}), 0);
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_WARNING, "ignoring plugin 'b' of unspecified type..."},
                            LogEntry{LOG_WARNING, "ignoring plugin 'a' of unspecified type..."}));
    EXPECT_THAT(calls.commands, IsEmpty());
    EXPECT_TRUE(HasRecord());
    EXPECT_TRUE(HasReport());
}

TEST_F(MainDriverModesTest, ASelectedMarkerFileYieldsItsEntriesAndNoOther) {
    calls.systemStatus = 0;
    WriteDebugConfig("probe: : :run probe\nother: : :run other\n");
    EXPECT_EQ(RunDirectory({"--plugin=probe.debug"}), 0);
    EXPECT_THAT(calls.commands, ElementsAre("run probe"));
}

TEST_F(MainDriverModesTest, SelectedPluginsNeedNoPluginDirectory) {
    EXPECT_EQ(Run({"--plugin=a", "--plugin-directory=" + root.Path("/nowhere")}), 0);
}

TEST_F(MainDriverModesTest, InvokeRunsTheMethodAndWritesNoReport) {
    calls.systemStatus = 0;
    EXPECT_EQ(RunDirectory({"--invoke", "--method=start", "--plugin=probe.debug"}), 0);
    EXPECT_THAT(calls.commands, ElementsAre("run probe"));
    EXPECT_THAT(log.Entries(), IsEmpty());
    EXPECT_TRUE(HasRecord());
    EXPECT_FALSE(HasReport());
}

TEST_F(MainDriverModesTest, InvokeRaisesNoAlertForABarrierThatNobodyProvides) {
    calls.systemStatus = 0;
    EXPECT_EQ(RunDirectory({"--invoke", "--method=start", "--plugin=probe.debug"}), 0);
    EXPECT_THAT(alerts.Texts(), IsEmpty());
}

TEST_F(MainDriverModesTest, AMethodThatFailsUnderInvokeIsExplainedAndTheStatusIs0) {
    EXPECT_EQ(RunDirectory({"--invoke", "--method=apply_host_profile", "--plugin=probe.debug"}), 0);
    EXPECT_EQ(errors.Text(), "unable to invoke method 'apply_host_profile' on plugin 'probe': "
                             "method `DebugPlugin::ApplyHostProfile' is not implemented\n");
}

TEST_F(MainDriverModesTest, AFailureThatEscapesUnderInvokeIsExplainedAndWritesNoReport) {
    ThreadFault().FailCall(1, EAGAIN);
    EXPECT_EQ(RunDirectory({"--invoke", "--method=start", "--plugin=probe.debug"}), 1);
    EXPECT_EQ(errors.Text(),
              "Activating plugins has failed. An unhandled error has occurred.  "
              "This may be caused by a bad vantor plugin being installed on your system.\n"
              "Details:\n"
              "Could not create enough execution threads. (0 created, 1requested)\n");
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{
            LOG_ERR, "unhandled exception whilst enumerating plugins: Could not create enough "
                     "execution threads. (0 created, 1requested)"}));
    EXPECT_FALSE(HasReport());
    EXPECT_FALSE(HasRecord());
}

TEST_F(MainDriverModesTest, ADumpToAPathThatCannotBeOpenedEndsWith1WithoutAMessage) {
    EXPECT_EQ(RunDirectory({"--dump-dependency-tree=/nonexistent/x.dot"}), 1);
    EXPECT_EQ(output.Text() + errors.Text(), "");
    EXPECT_THAT(log.Entries(), IsEmpty());
    EXPECT_THAT(calls.commands, IsEmpty());
    EXPECT_FALSE(HasRecord());
    EXPECT_TRUE(HasReport());
}

TEST_F(MainDriverModesTest, ADumpDrawsPluginsAndBarriersAndRunsNothing) {
    root.Write("/graph", "an older and longer drawing\n" + std::string(100000, 'x'));
    EXPECT_EQ(RunDirectory({"--dump-dependency-tree=" + root.Path("/graph")}), 0);
    const std::string drawing = root.Read("/graph");
    EXPECT_THAT(drawing, StartsWith("digraph g {\n"));
    EXPECT_THAT(drawing, HasSubstr(" [label=\"probe\"];\n"));
    EXPECT_THAT(drawing, HasSubstr(" [label=\"driver-need\" shape=box];\n"));
    EXPECT_THAT(drawing, EndsWith(";\n}\n"));
    EXPECT_THAT(calls.commands, IsEmpty());
    EXPECT_EQ(ThreadFault().Calls(), 0);
    EXPECT_FALSE(HasRecord());
    EXPECT_TRUE(HasReport());
    EXPECT_EQ(output.Text(), "");
}

TEST_F(MainDriverModesTest, ADumpWithoutAPathWritesNowhereAndSaysSuccess) {
    EXPECT_EQ(RunDirectory({"--dump-dependency-tree"}), 0);
    EXPECT_EQ(output.Text() + errors.Text(), "");
    EXPECT_THAT(calls.commands, IsEmpty());
    EXPECT_FALSE(HasRecord());
    EXPECT_TRUE(HasReport());
}

// Init mode, with services and a plugin that note their turn in one file.
class InitModeTest : public support::MainDriverTest {
protected:
    InitModeTest() {
        root.WriteScript("/usr/lib/nuvex/nvsyslog/bin/nvsyslogd", Note("log daemon $*"));
        root.WriteScript("/etc/init.d/nvevtd", Note("event daemon $*"));
        root.Write("/var/run/nuvex/nvsyslogd.pid", "1234\n");
        WriteDebugConfig("probe: : :" + Note("plugin"));
    }

    std::string Note(const std::string& turn) const {
        return "echo " + turn + " >> " + root.Path("/turns") + "\n";
    }
};

TEST_F(InitModeTest, ServicesAreLaunchedFirstAndTheLogIsReloadedLast) {
    EXPECT_EQ(RunDirectory({"--init"}), 0);
    EXPECT_EQ(root.Read("/turns"), "log daemon -i\nevent daemon start\nplugin\n");
    EXPECT_THAT(calls.signals, ElementsAre(Pair(1234, SIGUSR1)));
    EXPECT_TRUE(HasRecord());
    EXPECT_TRUE(HasReport());
}

TEST_F(InitModeTest, ServicesAreLeftAloneWithoutInit) {
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_EQ(root.Read("/turns"), "plugin\n");
    EXPECT_THAT(calls.signals, IsEmpty());
}

TEST_F(InitModeTest, TheLogIsReloadedAfterAFailedRunToo) {
    EXPECT_EQ(Run({"--init", "--plugin-directory=" + root.Path("/nowhere")}), 1);
    EXPECT_THAT(calls.signals, ElementsAre(Pair(1234, SIGUSR1)));
}

TEST_F(InitModeTest, ServicesThatCannotBeLaunchedDoNotStopTheRun) {
    calls.fork.FailFrom(1, EAGAIN);
    EXPECT_EQ(RunDirectory({"--init", "--plugin=none"}), 0);
    EXPECT_TRUE(HasReport());
}

TEST_F(InitModeTest, ADumpInInitModeLaunchesAndReloadsToo) {
    EXPECT_EQ(RunDirectory({"--init", "--dump-dependency-tree"}), 0);
    EXPECT_EQ(root.Read("/turns"), "log daemon -i\nevent daemon start\n");
    EXPECT_THAT(calls.signals, ElementsAre(Pair(1234, SIGUSR1)));
}

}  // namespace
}  // namespace vantor
