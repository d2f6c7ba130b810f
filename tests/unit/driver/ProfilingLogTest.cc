#include "driver/ProfilingLog.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <sys/stat.h>
#include <syslog.h>

#include <boost/filesystem/operations.hpp>
#include <ctime>
#include <iomanip>
#include <iterator>
#include <sstream>

#include "plugins/FakePlugin.h"
#include "support/HostCalls.h"
#include "support/PrivateRoot.h"
#include "support/RunConfigReset.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using support::LogEntry;
using ::testing::ElementsAre;
using ::testing::HasSubstr;
using ::testing::IsEmpty;
using ::testing::MatchesRegex;

constexpr const char* report = "/var/log/sysboot.log";

std::string Formatted(const timeval& time) {
    std::ostringstream stream;
    FormatTime(stream, time);
    return stream.str();
}

TEST(FormatTimeTest, WritesUtcWithMicroseconds) {
    EXPECT_EQ(Formatted({1709622489, 42}), "2024-03-05 07:08:09.000042");
}

TEST(FormatTimeTest, IsUtcWhateverTheTimeZone) {
    setenv("TZ", "UTC-5:30", 1);
    tzset();
    EXPECT_EQ(Formatted({1709622489, 42}), "2024-03-05 07:08:09.000042");
    unsetenv("TZ");
    tzset();
}

TEST(FormatTimeTest, TheEpochIsPaddedEverywhere) {
    EXPECT_EQ(Formatted({0, 0}), "1970-01-01 00:00:00.000000");
}

TEST(FormatTimeTest, MicrosecondsFillTheirField) {
    EXPECT_EQ(Formatted({978307199, 999999}), "2000-12-31 23:59:59.999999");
}

TEST(FormatTimeTest, YearsBefore1000AndFewMicrosecondsArePaddedWithZeros) {
    static_assert(sizeof(time_t) == sizeof(std::int64_t), "built with _TIME_BITS=64 on 32 bits");
    timeval time{};
    time.tv_sec = static_cast<time_t>(-30641760000LL);
    time.tv_usec = 1;
    EXPECT_EQ(Formatted(time), "0999-01-01 00:00:00.000001");
}

TEST(FormatTimeTest, YearsThatNeedMoreRoomTakeIt) {
    timeval time{};
    time.tv_sec = static_cast<time_t>(253402300800LL);
    EXPECT_EQ(Formatted(time), "10000-01-01 00:00:00.000000");
    time.tv_sec = static_cast<time_t>(-62324985600LL);
    EXPECT_EQ(Formatted(time), "00-5-01-01 00:00:00.000000");
}

TEST(FormatTimeTest, WidthThatTheStreamWasToldBeforeIsOver) {
    std::ostringstream stream;
    stream << std::setw(40);
    FormatTime(stream, {0, 0}) << 7;
    EXPECT_EQ(stream.str(), "1970-01-01 00:00:00.0000007");
}

TEST(FormatTimeTest, ReturnsTheStreamWithZeroAsItsFillCharacter) {
    std::ostringstream stream;
    EXPECT_EQ(&FormatTime(stream, {0, 0}), &stream);
    EXPECT_EQ(stream.fill(), '0');
    stream.str("");
    FormatTime(stream, {0, 0}) << 7;
    EXPECT_EQ(stream.str(), "1970-01-01 00:00:00.0000007");
}

class ProfilingLogTest : public ::testing::Test {
protected:
    ProfilingLogTest() { config.seed = 0; }

    // A plugin that ran at these times.
    void AddNode(support::FakePlugin& plugin, const timeval& begin, const timeval& end) {
        calls.times = {begin, end};
        plugin.Run();
        nodes.push_back(&plugin);
    }

    std::string Text(std::uint64_t uptimeSeconds = 0) const {
        std::ostringstream stream;
        FormatProfilingLog(stream, {1, 0}, {2, 0}, uptimeSeconds, nodes, config);
        return stream.str();
    }

    void Write() const { WriteProfilingLog({1, 0}, {2, 0}, 12, nodes, config); }

    RunConfig& config = support::ResetRunConfig();
    support::PrivateRoot root;
    support::HostCalls calls;
    support::SyslogCapture log;
    PluginQueue nodes;
};

TEST_F(ProfilingLogTest, AnEmptyNodeSequenceLeavesNoLineBetween) {
    EXPECT_EQ(Text(12), "NVKernel Initialization Time: 12000000\n"
                        "=== Vantor configuration info ===\n"
                        " Start: 1970-01-01 00:00:01.000000\n"
                        " End: 1970-01-01 00:00:02.000000\n"
                        " Verbose: 0\n"
                        " Parallel: 0\n"
                        " Randomize: 0\n"
                        " Interactive Mode: 0\n"
                        " Random Seed: 0\n");
}

TEST_F(ProfilingLogTest, EveryNodeHasALineInNodeOrder) {
    support::FakePlugin storage("storage");
    support::FakePlugin disk("disk with a blank");
    support::FakePlugin never("never");
    AddNode(storage, {1709622489, 42}, {1709622490, 999999});
    AddNode(disk, {978307199, 1}, {978307200, 2});
    nodes.push_back(&never);
    EXPECT_EQ(Text(), "NVKernel Initialization Time: 0\n"
                      "[2024-03-05 07:08:09.000042 - 2024-03-05 07:08:10.999999] sysboot: storage\n"
                      "[2000-12-31 23:59:59.000001 - 2001-01-01 00:00:00.000002] sysboot: "
                      "disk with a blank\n"
                      "[1970-01-01 00:00:00.000000 - 1970-01-01 00:00:00.000000] sysboot: never\n"
                      "=== Vantor configuration info ===\n"
                      " Start: 1970-01-01 00:00:01.000000\n"
                      " End: 1970-01-01 00:00:02.000000\n"
                      " Verbose: 0\n"
                      " Parallel: 0\n"
                      " Randomize: 0\n"
                      " Interactive Mode: 0\n"
                      " Random Seed: 0\n");
}

TEST_F(ProfilingLogTest, EachTimeIsItsOwnInWhicheverSecondTheOneBeforeLies) {
    support::FakePlugin first("first");
    support::FakePlugin second("second");
    AddNode(first, {0, 5}, {0, 123456});
    AddNode(second, {86400, 6}, {0, 7});
    const std::string text = Text();
    EXPECT_THAT(text, HasSubstr("\n[1970-01-01 00:00:00.000005 - 1970-01-01 00:00:00.123456] "
                                "sysboot: first\n"
                                "[1970-01-02 00:00:00.000006 - 1970-01-01 00:00:00.000007] "
                                "sysboot: second\n"));
}

TEST_F(ProfilingLogTest, FlagsAreWrittenAsNumbers) {
    config.verbose = true;
    config.parallel = true;
    config.randomize = true;
    config.interactive = true;
    config.trace = true;
    config.threads = 3;
    const std::string text = Text();
    EXPECT_EQ(text.substr(text.find(" Verbose")),
              " Verbose: 1\n Parallel: 1\n Randomize: 1\n Interactive Mode: 1\n Random Seed: 0\n");
}

TEST_F(ProfilingLogTest, ANegativeSeedIsWrittenWithItsSign) {
    config.seed = -5;
    const std::string text = Text();
    EXPECT_EQ(text.substr(text.find(" Random Seed")), " Random Seed: -5\n");
}

TEST_F(ProfilingLogTest, WithoutASeedItIsTheCreationTimeOfTheConfiguration) {
    const std::int32_t created = support::ResetRunConfig().seed;
    EXPECT_LE(created, std::time(nullptr));
    EXPECT_GE(created, std::time(nullptr) - 3600);
    const std::string text = Text();
    EXPECT_EQ(text.substr(text.find(" Random Seed")),
              " Random Seed: " + std::to_string(created) + "\n");
}

TEST_F(ProfilingLogTest, AnUptimeOfManyYearsIsNotCutTo32Bits) {
    const std::string text = Text(4294967296U);
    EXPECT_EQ(text.substr(0, text.find('\n')), "NVKernel Initialization Time: 4294967296000000");
}

TEST_F(ProfilingLogTest, TheFileHoldsTheReport) {
    root.Write(report, "previous report");
    Write();
    EXPECT_EQ(root.Read(report), Text(12));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(ProfilingLogTest, NothingButTheReportIsLeft) {
    root.MakeFolder("/var/log");
    Write();
    EXPECT_EQ(std::distance(boost::filesystem::directory_iterator(root.Path("/var/log")), {}), 1);
}

TEST_F(ProfilingLogTest, AReportThatCannotBeOpenedIsLogged) {
    Write();
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{
                                   LOG_ERR, "unable to open profiling log (/var/log/sysboot.log): "
                                            "No such file or directory"}));
}

TEST_F(ProfilingLogTest, AReportThatCannotBePutInItsPlaceIsLoggedAndThePreviousOneStays) {
    root.Write(std::string(report) + "/file", "in a folder of that name");
    Write();
    ASSERT_EQ(log.Entries().size(), 1U);
    EXPECT_EQ(log.Entries()[0].priority, LOG_WARNING);
    EXPECT_THAT(log.Entries()[0].text,
                MatchesRegex("unable to log profiling information: unable to rename "
                             "'/var/log/sysboot.log\\.......' to '/var/log/sysboot.log': "
                             "Is a directory"));
    EXPECT_EQ(root.Read(std::string(report) + "/file"), "in a folder of that name");
    EXPECT_EQ(std::distance(boost::filesystem::directory_iterator(root.Path("/var/log")), {}), 1);
}

}  // namespace
}  // namespace vantor
