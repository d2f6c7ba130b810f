#include "plugins/DebugPlugin.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include "plugins/Exceptions.h"
#include "plugins/TestObjects.h"
#include "support/ErrorText.h"
#include "support/HostCalls.h"
#include "support/RunConfigReset.h"
#include "support/SyslogCapture.h"
#include "support/TempFolder.h"

namespace vantor {
namespace {

using support::LogEntry;
using support::NamesOf;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class DebugPluginTest : public ::testing::Test {
protected:
    DebugPluginTest() { support::ResetRunConfig(); }

    // What Start() logs for a command that system(3) answers with this status.
    std::vector<LogEntry> LogOfStatus(int status) {
        calls.systemStatus = status;
        DebugPlugin("probe", {}, {}, "whatever").Start();
        return log.Entries();
    }

    support::HostCalls calls;
    support::SyslogCapture log;
};

TEST_F(DebugPluginTest, IsOfVersion1AndHasNothingElse) {
    const DebugPlugin plugin("probe", {}, {}, "true");
    EXPECT_EQ(plugin.Name(), "probe");
    EXPECT_EQ(plugin.ApiVersion(), 1);
    EXPECT_EQ(plugin.PluginVersion(), "");
    EXPECT_FALSE(plugin.RunOnce());
    EXPECT_THAT(plugin.RequiredFlags(), IsEmpty());
    EXPECT_THAT(plugin.DisablingFlags(), IsEmpty());
    EXPECT_EQ(plugin.DotAttributes(), "");
}

TEST_F(DebugPluginTest, IsLinkedToItsBarriersInOrder) {
    const DebugPlugin plugin("probe", {"debug-need-b", "debug-need-a"},
                             {"debug-give-b", "debug-give-a"}, "true");
    EXPECT_THAT(NamesOf(plugin.Dependencies()), ElementsAre("debug-need-b", "debug-need-a"));
    EXPECT_THAT(NamesOf(plugin.Dependents()), ElementsAre("debug-give-b", "debug-give-a"));
}

TEST_F(DebugPluginTest, ABarrierMayHaveAnEmptyName) {
    const DebugPlugin plugin("probe", {"debug-x", ""}, {}, "true");
    EXPECT_THAT(NamesOf(plugin.Dependencies()), ElementsAre("debug-x", ""));
}

TEST_F(DebugPluginTest, StartRunsTheCommandThroughTheShellAndWaits) {
    const support::TempFolder folder;
    DebugPlugin("probe", {}, {}, "cd " + folder.Path() + " && echo \"a $((2 + 3))\" > out").Start();
    EXPECT_EQ(support::ReadFile(folder.File("out")), "a 5\n");
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(DebugPluginTest, ExitStatus1IsLoggedAsTheRawStatus) {
    DebugPlugin("probe", {}, {}, "exit 1").Start();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "debug injection 'probe' returned 0x000100"}));
}

TEST_F(DebugPluginTest, ACommandThatDoesNotExistIsLogged) {
    DebugPlugin("probe", {}, {}, "exec 2>&-; /nonexistent/command").Start();
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "debug injection 'probe' returned 0x007f00"}));
}

TEST_F(DebugPluginTest, ACommandKilledByASignalIsLoggedWithTheRawStatus) {
    EXPECT_THAT(LogOfStatus(9),
                ElementsAre(LogEntry{LOG_INFO, "debug injection 'probe' returned 0x000009"}));
}

TEST_F(DebugPluginTest, ACoreDumpIsLoggedWithTheRawStatus) {
    EXPECT_THAT(LogOfStatus(0x8b),
                ElementsAre(LogEntry{LOG_INFO, "debug injection 'probe' returned 0x00008b"}));
}

TEST_F(DebugPluginTest, ACommandThatCouldNotBeRunIsLogged) {
    EXPECT_THAT(LogOfStatus(-1),
                ElementsAre(LogEntry{LOG_INFO, "debug injection 'probe' returned 0xffffffff"}));
}

TEST_F(DebugPluginTest, ExitStatus0IsNotLogged) { EXPECT_THAT(LogOfStatus(0), IsEmpty()); }

TEST_F(DebugPluginTest, NeverSupportsAHostProfile) {
    EXPECT_FALSE(DebugPlugin("probe", {}, {}, "true").SupportsHostProfile());
}

TEST_F(DebugPluginTest, ApplyHostProfileIsNotImplementedAndRunsNothing) {
    DebugPlugin plugin("probe", {}, {}, "true");
    EXPECT_EQ(support::ErrorText<NotImplementedException>([&] { plugin.ApplyHostProfile(); }),
              "method `DebugPlugin::ApplyHostProfile' is not implemented");
    EXPECT_THAT(calls.commands, IsEmpty());
}

TEST_F(DebugPluginTest, RunRunsTheCommand) {
    calls.systemStatus = 0;
    DebugPlugin plugin("probe", {}, {}, "some command");
    plugin.Run();
    EXPECT_THAT(calls.commands, ElementsAre("some command"));
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_INFO, "executing start plugin: probe"}));
}

}  // namespace
}  // namespace vantor
