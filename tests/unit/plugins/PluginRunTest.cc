#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <iostream>

#include "graph/GlobalLock.h"
#include "plugins/Exceptions.h"
#include "plugins/FakePlugin.h"
#include "support/FreshProcess.h"
#include "support/HostCalls.h"
#include "support/PrivateRoot.h"
#include "support/RunConfigReset.h"
#include "support/StreamCapture.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using support::LogEntry;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

// The interactive gate has its own tests. A test that asks for the host profile does so in a
// process of its own: the answer is kept.
class PluginRunTest : public ::testing::Test {
protected:
    RunConfig& config = support::ResetRunConfig();
    support::PrivateRoot root;
    support::HostCalls calls;
    support::SyslogCapture log;
    support::StreamCapture output{std::cout};
    support::StreamCapture errors{std::cerr};
    support::FakePlugin plugin{"disk"};
};

TEST_F(PluginRunTest, StartIsLoggedAndCalledOnce) {
    plugin.Run();
    EXPECT_EQ(plugin.starts, 1);
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_INFO, "executing start plugin: disk"}));
    EXPECT_EQ(output.Text() + errors.Text(), "");
}

TEST_F(PluginRunTest, StartIsLoggedBeforeItIsCalled) {
    plugin.onStart = [this] { EXPECT_EQ(log.Entries().size(), 1U); };
    plugin.Run();
    EXPECT_EQ(plugin.starts, 1);
}

TEST_F(PluginRunTest, TimesAreTakenBeforeAndAfterTheMethod) {
    calls.times = {{10, 1}, {20, 2}};
    plugin.onStart = [this] { EXPECT_EQ(calls.times.size(), 1U); };
    plugin.Run();
    EXPECT_EQ(plugin.StartTime().tv_sec, 10);
    EXPECT_EQ(plugin.StartTime().tv_usec, 1);
    EXPECT_EQ(plugin.EndTime().tv_sec, 20);
    EXPECT_EQ(plugin.EndTime().tv_usec, 2);
}

TEST_F(PluginRunTest, TraceReportsTheBeginningAndTheEnd) {
    config.trace = true;
    calls.times = {{10, 0}, {11, 500}};
    plugin.onStart = [this] { EXPECT_EQ(output.Text(), "starting execution of plugin: disk\n"); };
    plugin.Run();
    EXPECT_EQ(output.Text(), "starting execution of plugin: disk\n"
                             "completed execution of plugin: disk (took 1000500 us)\n");
}

TEST_F(PluginRunTest, TraceShowsAWrappedDurationAsUnsigned64Bit) {
    config.trace = true;
    calls.times = {{0, 0}, {2147, 483648}};
    plugin.Run();
    EXPECT_EQ(output.Text(),
              "starting execution of plugin: disk\n"
              "completed execution of plugin: disk (took 18446744071562067968 us)\n");
}

TEST_F(PluginRunTest, MethodNamedOnTheCommandLineReplacesTheUsualOne) {
    config.method = "apply_host_profile";
    plugin.Run();
    EXPECT_EQ(plugin.starts, 0);
    EXPECT_EQ(plugin.applications, 1);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginRunTest, AnUnknownMethodRunsAndLogsNothingAndThePluginCountsAsRun) {
    config.method = "no_such_method";
    calls.times = {{10, 0}, {20, 0}};
    plugin.Run();
    EXPECT_EQ(plugin.starts + plugin.applications, 0);
    EXPECT_THAT(log.Entries(), IsEmpty());
    EXPECT_EQ(output.Text() + errors.Text(), "");
    EXPECT_EQ(plugin.EndTime().tv_sec, 20);
}

TEST_F(PluginRunTest, AnExceptionOfANamedMethodIsExplainedOnStandardErrorAlone) {
    config.method = "start";
    plugin.onStart = [] { throw std::runtime_error("no disk"); };
    plugin.Run();
    EXPECT_EQ(errors.Text(), "unable to invoke method 'start' on plugin 'disk': no disk\n");
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(PluginRunTest, AStandardExceptionIsLoggedAndThePluginCountsAsRun) {
    config.trace = true;
    calls.times = {{10, 0}, {10, 7}};
    plugin.onStart = [] { throw std::runtime_error("no disk"); };
    plugin.Run();
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_INFO, "executing start plugin: disk"},
                    LogEntry{LOG_ERR, "unhandled exception whilst processing disk: no disk"}));
    EXPECT_EQ(output.Text(), "starting execution of plugin: disk\n"
                             "completed execution of plugin: disk (took 7 us)\n");
}

TEST_F(PluginRunTest, AnythingElseThrownIsLoggedAndThePluginCountsAsRun) {
    calls.times = {{10, 0}, {20, 0}};
    plugin.onStart = [] { throw 42; };
    plugin.Run();
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_INFO, "executing start plugin: disk"},
                    LogEntry{LOG_ERR, "ignoring unknown exception whilst processing disk ..."}));
    EXPECT_EQ(plugin.EndTime().tv_sec, 20);
}

TEST_F(PluginRunTest, TextsWithPercentSignsAreLoggedAsTheyAre) {
    support::FakePlugin odd("100%s");
    odd.onStart = [] { throw std::runtime_error("%n%s"); };
    odd.Run();
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_INFO, "executing start plugin: 100%s"},
                    LogEntry{LOG_ERR, "unhandled exception whilst processing 100%s: %n%s"}));
}

TEST_F(PluginRunTest, APluginWithAHostProfileMethodAppliesTheProfile) {
    root.Write("/etc/nuvex/hostprofile.xml", "");
    plugin.supportsHostProfile = true;
    support::InFreshProcess([this] {
        plugin.Run();
        EXPECT_EQ(plugin.starts, 0);
        EXPECT_EQ(plugin.applications, 1);
        EXPECT_THAT(log.Entries(),
                    ElementsAre(LogEntry{LOG_INFO, "executing host profile plugin: disk"}));
    });
}

TEST_F(PluginRunTest, APluginWithAHostProfileMethodStartsOnAHostWithoutAProfile) {
    plugin.supportsHostProfile = true;
    support::InFreshProcess([this] {
        plugin.Run();
        EXPECT_EQ(plugin.starts, 1);
        EXPECT_EQ(plugin.applications, 0);
        EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_INFO, "executing start plugin: disk"}));
    });
}

TEST_F(PluginRunTest, APluginWithoutHostProfileSupportStartsEvenWhenThereIsAProfile) {
    root.Write("/etc/nuvex/hostprofile.xml", "");
    support::InFreshProcess([this] {
        plugin.Run();
        EXPECT_EQ(plugin.starts, 1);
        EXPECT_EQ(plugin.applications, 0);
    });
}

TEST_F(PluginRunTest, APluginWithoutHostProfileSupportDoesNotLookForTheProfile) {
    support::InFreshProcess([this] {
        plugin.Run();
        root.Write("/etc/nuvex/hostprofile.xml", "");
        support::FakePlugin later("later");
        later.supportsHostProfile = true;
        later.Run();
        EXPECT_EQ(later.applications, 1);
    });
}

TEST_F(PluginRunTest, TheHostProfileAppearingAfterTheFirstCheckIsNotNoticed) {
    plugin.supportsHostProfile = true;
    support::InFreshProcess([this] {
        plugin.Run();
        root.Write("/etc/nuvex/hostprofile.xml", "");
        plugin.Run();
        EXPECT_EQ(plugin.starts, 2);
        EXPECT_EQ(plugin.applications, 0);
    });
}

TEST_F(PluginRunTest, NotImplementedApplyHostProfileIsLoggedAndDoesNotStopTheRun) {
    root.Write("/etc/nuvex/hostprofile.xml", "");
    plugin.supportsHostProfile = true;
    plugin.onApply = [] { throw NotImplementedException("NativePlugin::ApplyHostProfile"); };
    support::InFreshProcess([this] {
        plugin.Run();
        EXPECT_THAT(
            log.Entries(),
            ElementsAre(LogEntry{LOG_INFO, "executing host profile plugin: disk"},
                        LogEntry{LOG_ERR, "unhandled exception whilst processing disk: method "
                                          "`NativePlugin::ApplyHostProfile' is not implemented"}));
    });
}

// A kind whose support for host profiles cannot be found out.
class UndecidedPlugin : public support::FakePlugin {
public:
    using FakePlugin::FakePlugin;
    bool SupportsHostProfile() const override { throw std::runtime_error("cannot tell"); }
};

TEST_F(PluginRunTest, AnExceptionOfTheHostProfileCheckIsContained) {
    UndecidedPlugin undecided("disk");
    undecided.Run();
    EXPECT_EQ(undecided.starts + undecided.applications, 0);
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_ERR, "unhandled exception whilst processing disk: cannot tell"}));
}

TEST_F(PluginRunTest, TheLockIsFreeWhileTheMethodRuns) {
    plugin.onStart = [] { EXPECT_FALSE(GlobalLock::HeldByCurrentThread()); };
    plugin.Run();
    EXPECT_EQ(plugin.starts, 1);
}

}  // namespace
}  // namespace vantor
