// Whole runs of the program on a directory of plugins, in their order of steps.

#include "driver/MainDriver.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <boost/filesystem/operations.hpp>
#include <cerrno>

#include "driver/MainDriverFixture.h"
#include "driver/RunOnceRecord.h"

namespace vantor {
namespace {

using support::LogEntry;
using support::MainDriverTest;
using support::ThreadFault;
using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::IsEmpty;
using ::testing::UnorderedElementsAre;

// The text of the error of listing a folder that is not there.
std::string ListingError(const std::string& folder) {
    try {
        boost::filesystem::directory_iterator{folder};
    } catch (const boost::filesystem::filesystem_error& error) {
        return error.what();
    }
    return "(no error)";
}

TEST_F(MainDriverTest, ARunThatFindsNoPluginWritesBothRecordsAndEndsWith0) {
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_EQ(root.Read("/bootbank/vantorbk.gz"), CompressRunOnceRecord({}));
    EXPECT_THAT(ReportLines("["), IsEmpty());
    EXPECT_THAT(ReportLines("NVKernel"), ::testing::SizeIs(1));
    EXPECT_THAT(log.Entries(), IsEmpty());
    EXPECT_EQ(output.Text() + errors.Text(), "");
}

TEST_F(MainDriverTest, TheProgramLeavesTheCallersDirectoryAndSession) {
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(calls.directories, ElementsAre("/"));
    EXPECT_EQ(calls.setsid.Calls(), 1);
}

TEST_F(MainDriverTest, AWorkingDirectoryThatCannotBeChangedIsLoggedAndTheRunGoesOn) {
    calls.chdir.FailCall(1, EACCES);
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_INFO, "unable to change filesystem root: Permission denied"}));
    EXPECT_TRUE(HasReport());
}

TEST_F(MainDriverTest, ASessionThatCannotBeMadeIsLoggedAndTheRunGoesOn) {
    calls.setsid.FailCall(1, EPERM);
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_ERR, "unable to create session: Operation "
                                                             "not permitted"}));
    EXPECT_TRUE(HasReport());
}

TEST_F(MainDriverTest, ARelativePluginDirectoryIsMeantFromWhereTheCallerStands) {
    EXPECT_EQ(Run({"--plugin-directory=some/../where"}), 1);
    EXPECT_EQ(config.pluginDirectory, boost::filesystem::current_path() / "some/../where");
}

TEST_F(MainDriverTest, AMissingPluginDirectoryIsExplainedAndEndsWith1) {
    const std::string folder = root.Path("/nowhere");
    EXPECT_EQ(Run({"--plugin-directory=" + folder}), 1);
    EXPECT_EQ(errors.Text(),
              "Failed to boot the system.  An unhandled error has occurred.  "
              "This may be caused by a bad vantor plugin being installed on your system.\n"
              "Details:\n" +
                  ListingError(folder) + "\n");
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "unhandled exception whilst enumerating plugins: " +
                                                  ListingError(folder)}));
    EXPECT_TRUE(HasReport());
    EXPECT_FALSE(HasRecord());
}

TEST_F(MainDriverTest, AFailedRunIsReportedWithTheMomentAfterTheFailure) {
    calls.times = {{100, 1}, {200, 2}};
    EXPECT_EQ(Run({"--plugin-directory=" + root.Path("/nowhere")}), 1);
    EXPECT_THAT(ReportLines(" Start"), ElementsAre(" Start: 1970-01-01 00:01:40.000001"));
    EXPECT_THAT(ReportLines(" End"), ElementsAre(" End: 1970-01-01 00:03:20.000002"));
}

TEST_F(MainDriverTest, TheReportHasTheUptimeAtTheStart) {
    calls.uptime = 77;
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(ReportLines("NVKernel"), ElementsAre("NVKernel Initialization Time: 77000000"));
}

TEST_F(MainDriverTest, TheRecordHoldsTheNamesOfTheCommandLine) {
    EXPECT_EQ(RunDirectory({"--run-once=y,x", "--run-once=z"}), 0);
    EXPECT_EQ(root.Read("/bootbank/vantorbk.gz"), CompressRunOnceRecord({"x", "y", "z"}));
}

TEST_F(MainDriverTest, AnEscapedFailureLeavesTheRecordUnwritten) {
    ThreadFault().FailCall(1, EAGAIN);
    EXPECT_EQ(RunDirectory({"--run-once=x,y"}), 1);
    EXPECT_FALSE(HasRecord());
    EXPECT_TRUE(HasReport());
    EXPECT_EQ(errors.Text(),
              "Failed to boot the system.  An unhandled error has occurred.  "
              "This may be caused by a bad vantor plugin being installed on your system.\n"
              "Details:\n"
              "Could not create enough execution threads. (0 created, 1requested)\n");
}

TEST_F(MainDriverTest, AReportThatCannotBeWrittenDoesNotChangeTheExitStatus) {
    boost::filesystem::remove(root.Path("/var/log"));
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{
                                   LOG_ERR, "unable to open profiling log (/var/log/sysboot.log): "
                                            "No such file or directory"}));
}

TEST_F(MainDriverTest, ARecordThatCannotBeWrittenDoesNotChangeTheExitStatus) {
    boost::filesystem::remove(root.Path("/bootbank"));
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(
        log.Entries(),
        ElementsAre(LogEntry{LOG_ERR, "unable to write run-once record (/bootbank/vantorbk.gz): "
                                      "No such file or directory"}));
}

TEST_F(MainDriverTest, EveryEntryOfTheDirectoryIsLoaded) {
    AddFile("README");
    AddFile("a.txt");
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(log.Entries(),
                UnorderedElementsAre(
                    LogEntry{LOG_WARNING, "ignoring plugin 'README' of unspecified type..."},
                    LogEntry{LOG_WARNING, "ignoring plugin 'a.txt' of unknown type (txt)..."}));
}

TEST_F(MainDriverTest, EveryDebugEntryIsAPluginInFileOrder) {
    calls.systemStatus = 0;
    WriteDebugConfig("b: :driver-b:run b\na: :driver-a:run a\nb: :driver-b:run b again\n");
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(calls.commands, ElementsAre("run b", "run a", "run b again"));
    EXPECT_THAT(ReportLines("["), ElementsAre(EndsWith("] sysboot: b"), EndsWith("] sysboot: a"),
                                              EndsWith("] sysboot: b")));
}

TEST_F(MainDriverTest, AnEntryWithAMarkerFileYieldsTwoPlugins) {
    calls.systemStatus = 0;
    WriteDebugConfig("probe: : :run probe\n");
    AddFile("probe.debug");
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(calls.commands, ElementsAre("run probe", "run probe"));
}

TEST_F(MainDriverTest, PluginsRunInTheOrderOfTheirBarriers) {
    calls.systemStatus = 0;
    WriteDebugConfig("last:driver-second: :run last\n"
                     "middle:driver-first:driver-second:run middle\n"
                     "first: :driver-first:run first\n");
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(calls.commands, ElementsAre("run first", "run middle", "run last"));
    EXPECT_THAT(alerts.Texts(), IsEmpty());
}

TEST_F(MainDriverTest, ABarrierThatNobodyProvidesRaisesAnAlertAndTheRunGoesOn) {
    calls.systemStatus = 0;
    WriteDebugConfig("probe:driver-unprovided: :run probe\n");
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(alerts.Texts(),
                ElementsAre("Vantor dependency error: Initialization barrier "
                            "\"driver-unprovided\" is not provided by any plugin but the "
                            "following plugins require it: \"probe\""));
    EXPECT_THAT(calls.commands, ElementsAre("run probe"));
}

TEST_F(MainDriverTest, AFailedPluginDoesNotChangeTheExitStatus) {
    calls.systemStatus = 0x100;
    WriteDebugConfig("probe: : :run probe\n");
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "executing start plugin: probe"},
                            LogEntry{LOG_INFO, "debug injection 'probe' returned 0x000100"}));
}

TEST_F(MainDriverTest, ASerialRunHas1WorkerAndAParallelRun8) {
    EXPECT_EQ(RunDirectory(), 0);
    EXPECT_EQ(ThreadFault().Calls(), 1);
    support::ResetRunConfig();
    ThreadFault().Reset();
    EXPECT_EQ(RunDirectory({"--parallel"}), 0);
    EXPECT_EQ(ThreadFault().Calls(), 8);
}

}  // namespace
}  // namespace vantor
