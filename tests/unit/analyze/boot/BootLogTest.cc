// What the reader makes of a profiling log, and what it says of a file that is none.

#include "boot/BootLog.h"

#include <gtest/gtest.h>

#include <sstream>
#include <stdexcept>

#include "support/ErrorText.h"
#include "support/TempFolder.h"

namespace vantor::analyze {
namespace {

constexpr const char* head = "NVKernel Initialization Time: 12000000\n";
constexpr const char* tail = "=== Vantor configuration info ===\n"
                             " Start: 2024-03-05 07:08:09.000042\n"
                             " End: 2024-03-05 07:08:10.000042\n"
                             " Verbose: 0\n"
                             " Parallel: 1\n"
                             " Randomize: 0\n"
                             " Interactive Mode: 0\n"
                             " Random Seed: -5\n";

BootLog Parse(const std::string& text) {
    std::istringstream stream(text);
    return ParseBootLog(stream, "boot.log");
}

std::string ErrorOf(const std::string& text) {
    return support::ErrorText<std::runtime_error>([&text] { Parse(text); });
}

std::string Entry(const std::string& times, const std::string& name) {
    return head + ("[" + times + "] sysboot: " + name + "\n") + tail;
}

Microseconds StartOf(const std::string& moment) {
    return Parse(Entry(moment + " - " + moment, "a")).entries.at(0).start;
}

TEST(BootLogTest, EveryLineIsRead) {
    const BootLog log =
        Parse(Entry("2024-03-05 07:08:09.000043 - 2024-03-05 07:08:09.500000", "storage"));
    EXPECT_EQ(log.kernelTime, 12000000);
    EXPECT_EQ(log.start, 1709622489000042);
    EXPECT_EQ(log.end, 1709622490000042);
    EXPECT_FALSE(log.verbose);
    EXPECT_TRUE(log.parallel);
    EXPECT_FALSE(log.randomize);
    EXPECT_FALSE(log.interactive);
    EXPECT_EQ(log.seed, -5);
    ASSERT_EQ(log.entries.size(), 1U);
    EXPECT_EQ(log.entries[0].name, "storage");
    EXPECT_EQ(log.entries[0].start, 1709622489000043);
    EXPECT_EQ(log.entries[0].end, 1709622489500000);
    EXPECT_TRUE(log.entries[0].WasRun());
}

TEST(BootLogTest, ALogWithoutPluginsHasNoEntries) {
    EXPECT_TRUE(Parse(std::string(head) + tail).entries.empty());
}

TEST(BootLogTest, NamesHoldAnythingButALineEnd) {
    const std::string name = "] sysboot: \" - [2024 \xff\t=== \r";
    EXPECT_EQ(Parse(Entry("2024-03-05 07:08:09.000043 - 2024-03-05 07:08:09.500000", name))
                  .entries.at(0)
                  .name,
              name);
}

TEST(BootLogTest, ANameMayBeEmpty) {
    EXPECT_EQ(Parse(Entry("2024-03-05 07:08:09.000043 - 2024-03-05 07:08:09.500000", ""))
                  .entries.at(0)
                  .name,
              "");
}

TEST(BootLogTest, ZeroTimesMeanThatThePluginWasNotRun) {
    const BootLog log =
        Parse(Entry("1970-01-01 00:00:00.000000 - 1970-01-01 00:00:00.000000", "a"));
    EXPECT_FALSE(log.entries.at(0).WasRun());
}

TEST(BootLogTest, TimesReachFromTheYear0ToThatOf99999) {
    EXPECT_EQ(StartOf("1969-12-31 23:59:59.999999"), -1);
    EXPECT_EQ(StartOf("2000-02-29 00:00:00.000000"), 951782400000000);
    EXPECT_EQ(StartOf("2000-03-01 00:00:00.000000"), 951868800000000);
    EXPECT_EQ(StartOf("2038-01-19 03:14:08.000000"), 2147483648000000);
    EXPECT_EQ(StartOf("2400-12-31 00:00:00.000000"), 13601001600000000);
    EXPECT_EQ(StartOf("0999-01-01 00:00:00.000001"), -30641759999999999);
    EXPECT_EQ(StartOf("0000-12-31 00:00:00.000000"),
              StartOf("0001-01-01 00:00:00.000000") - 86400000000);
    EXPECT_EQ(StartOf("0000-01-01 00:00:00.000000"),
              StartOf("0001-01-01 00:00:00.000000") - 366 * 86400000000);
    EXPECT_EQ(StartOf("10000-01-01 00:00:00.000000"), 253402300800000000);
}

TEST(BootLogTest, ADayThatItsMonthLacksIsRefused) {
    EXPECT_EQ(ErrorOf(Entry("2023-02-29 00:00:00.000000 - 2023-03-01 00:00:00.000000", "a")),
              "boot.log:2: there is no day 29");
    EXPECT_EQ(ErrorOf(Entry("2023-13-01 00:00:00.000000 - 2023-03-01 00:00:00.000000", "a")),
              "boot.log:2: there is no month 13");
    EXPECT_EQ(ErrorOf(Entry("2023-12-01 24:00:00.000000 - 2023-03-01 00:00:00.000000", "a")),
              "boot.log:2: there is no hour 24");
}

TEST(BootLogTest, AnotherFileIsRefusedAtItsFirstLine) {
    EXPECT_EQ(ErrorOf("digraph g {\n}\n"),
              "boot.log:1: expected \"NVKernel Initialization Time: \", not \"digraph g {\" at "
              "column 1");
}

TEST(BootLogTest, AnEmptyFileIsRefused) {
    EXPECT_EQ(ErrorOf(""),
              "boot.log:1: the log ends here, where a line that begins with \"NVKernel "
              "Initialization Time: \" should follow");
}

TEST(BootLogTest, AnEntryThatIsCutShortIsRefusedWhereItEnds) {
    EXPECT_EQ(ErrorOf(head + std::string("[2024-03-05 07:08\n") + tail),
              "boot.log:2: expected \":\" at the end of the line");
    EXPECT_EQ(ErrorOf(Entry("2024-03-05 07:08:09.00x043 - 2024-03-05 07:08:09.500000", "a")),
              "boot.log:2: expected microseconds, not \"x043 - 2024-03-05 07:08:09.500000] sysbo"
              "...\" at column 24");
}

TEST(BootLogTest, ALogThatEndsInItsMiddleIsRefused) {
    EXPECT_EQ(ErrorOf(head),
              "boot.log:1: the log ends after this line, without \"=== Vantor configuration info "
              "===\"");
    const std::string whole = std::string(head) + tail;
    EXPECT_EQ(ErrorOf(whole.substr(0, whole.rfind(" Random"))),
              "boot.log:9: the log ends here, where a line that begins with \" Random Seed: \" "
              "should follow");
}

TEST(BootLogTest, WhatFollowsTheLogIsRefused) {
    EXPECT_EQ(ErrorOf(std::string(head) + tail + "more\n"),
              "boot.log:10: the log should end before this line");
}

TEST(BootLogTest, AFlagIsZeroOrOne) {
    std::string text = std::string(head) + tail;
    text.replace(text.find("Verbose: 0"), 10, "Verbose: 2");
    EXPECT_EQ(ErrorOf(text), "boot.log:5: expected 0 or 1");
    text.replace(text.find("Verbose: 2"), 10, "Verbose: 01");
    EXPECT_EQ(ErrorOf(text), "boot.log:5: expected the end of the line, not \"1\" at column 12");
}

TEST(BootLogTest, ANumberTooLargeIsRefused) {
    EXPECT_EQ(ErrorOf("NVKernel Initialization Time: 99999999999999999999\n"),
              "boot.log:1: expected a number of 64 bits, not \"99999999999999999999\" at column "
              "31");
}

TEST(BootLogTest, RunsWhoseSumWouldOverflowAreRefused) {
    const std::string entry =
        "[0000-01-01 00:00:00.000000 - 60000-01-01 00:00:00.000000] sysboot: a\n";
    EXPECT_EQ(ErrorOf(head + entry + entry + tail),
              "boot.log:3: the runs up to here add up to over 70,000 years");
}

TEST(BootLogTest, AFileIsReadByItsPath) {
    const support::TempFolder folder;
    support::WriteFile(folder.File("log"), std::string(head) + tail);
    EXPECT_EQ(ReadBootLog(folder.File("log")).seed, -5);
}

TEST(BootLogTest, AFileThatCannotBeReadIsNamedWithTheReason) {
    const support::TempFolder folder;
    EXPECT_EQ(support::ErrorText<std::runtime_error>([&] { ReadBootLog(folder.File("log")); }),
              folder.File("log") + ": cannot be opened: No such file or directory");
    EXPECT_EQ(support::ErrorText<std::runtime_error>([&] { ReadBootLog(folder.Path()); }),
              folder.Path() + ": cannot be read: Is a directory");
}

}  // namespace
}  // namespace vantor::analyze
