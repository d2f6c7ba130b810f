#include "driver/DebugConfig.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>
#include <unistd.h>

#include <cerrno>
#include <sstream>

#include "support/FaultPoint.h"
#include "support/PrivateRoot.h"
#include "support/SyslogCapture.h"

namespace {

// The reading of files by this test's process.
vantor::support::FaultPoint& ReadFault() {
    static vantor::support::FaultPoint fault;
    return fault;
}

}  // namespace

extern "C" {

ssize_t __real_read(int descriptor, void* buffer, std::size_t size);
ssize_t __wrap_read(int descriptor, void* buffer, std::size_t size) {
    return ReadFault().Fails() ? -1 : __real_read(descriptor, buffer, size);
}

}  // extern "C"

namespace vantor {

void PrintTo(const DebugEntry& entry, std::ostream* stream) {
    *stream << '{' << entry.name << " after " << ::testing::PrintToString(entry.requiredBarriers)
            << " before " << ::testing::PrintToString(entry.providedBarriers) << ": "
            << entry.command << '}';
}

namespace {

using support::LogEntry;
using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::Field;
using ::testing::IsEmpty;
using ::testing::SizeIs;
using List = std::list<std::string>;

auto Entry(const std::string& name, const List& needs, const List& gives,
           const std::string& command) {
    return AllOf(Field("name", &DebugEntry::name, name),
                 Field("requires", &DebugEntry::requiredBarriers, needs),
                 Field("provides", &DebugEntry::providedBarriers, gives),
                 Field("command", &DebugEntry::command, command));
}

class DebugConfigTest : public ::testing::Test {
protected:
    static std::list<DebugEntry> Parse(const std::string& text) {
        std::istringstream stream(text);
        return ParseDebugConfig(stream);
    }

    // The items of a list as the file writes it.
    static List Items(const std::string& written) {
        const std::list<DebugEntry> entries = Parse("x:" + written + ":y:z\n");
        return entries.empty() ? List{"(malformed)"} : entries.front().requiredBarriers;
    }

    void ExpectMalformed(const std::string& line) {
        EXPECT_THAT(Parse(line + "\n"), IsEmpty());
        EXPECT_THAT(
            log.Entries(),
            ElementsAre(LogEntry{LOG_INFO, "ignoring malformed debug entry at line 1: " + line}));
    }

    support::SyslogCapture log;
};

TEST_F(DebugConfigTest, EntriesKnowTheirLines) {
    const std::list<DebugEntry> entries = Parse("\na:b:c:d\nmalformed\n \ne:f:g:h");
    EXPECT_THAT(entries, ElementsAre(Field("line", &DebugEntry::line, 2),
                                     Field("line", &DebugEntry::line, 5)));
}

TEST_F(DebugConfigTest, MalformedLinesAreGivenToWhoAsksForThemInPlaceOfTheLog) {
    std::vector<std::pair<int, std::string>> reported;
    std::istringstream stream("a:b:c:d\n x:y \n");
    const std::list<DebugEntry> entries =
        ParseDebugConfig(stream, [&reported](int line, const std::string& text) {
            reported.emplace_back(line, text);
        });
    EXPECT_THAT(entries, SizeIs(1));
    EXPECT_THAT(reported, ElementsAre(std::pair<int, std::string>(
                              2, "ignoring malformed debug entry at line 2: x:y")));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(DebugConfigTest, ALineIsAnEntryOfFourFields) {
    EXPECT_THAT(Parse("x:a,b:c:d\n"), ElementsAre(Entry("x", {"a", "b"}, {"c"}, "d")));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(DebugConfigTest, EntriesKeepTheOrderOfTheFile) {
    EXPECT_THAT(Parse("b:1:2:x\na:3:4:y\nb:5:6:z"),
                ElementsAre(Entry("b", {"1"}, {"2"}, "x"), Entry("a", {"3"}, {"4"}, "y"),
                            Entry("b", {"5"}, {"6"}, "z")));
}

TEST_F(DebugConfigTest, BlankLinesGiveNoEntriesAndNoMessages) {
    EXPECT_THAT(Parse("\n   \n\t\n\r\n \v\f \n\n"), IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(DebugConfigTest, AnEmptyFileGivesNoEntries) {
    EXPECT_THAT(Parse(""), IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(DebugConfigTest, AMalformedLineIsReportedWithItsNumberAndTheNextOneRead) {
    EXPECT_THAT(Parse("\nok:1:2:3\nx:a:b\nok:4:5:6\n"), SizeIs(2));
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "ignoring malformed debug entry at line 3: x:a:b"}));
}

TEST_F(DebugConfigTest, TheTrimmedLineIsReported) {
    EXPECT_THAT(Parse(" \t x:a:b \r\n"), IsEmpty());
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "ignoring malformed debug entry at line 1: x:a:b"}));
}

TEST_F(DebugConfigTest, FiveFieldsAreMalformed) { ExpectMalformed("x:a:b:c:d"); }

TEST_F(DebugConfigTest, OnlySeparatorsAreMalformed) { ExpectMalformed(":::"); }

TEST_F(DebugConfigTest, ThereAreNoComments) { ExpectMalformed("# note"); }

TEST_F(DebugConfigTest, AMalformedLineIsReportedWithItsPercentSigns) { ExpectMalformed("%s%n"); }

TEST_F(DebugConfigTest, EmptyFieldsAreDropped) {
    EXPECT_THAT(Parse("::x::a:b:::c::\n"), ElementsAre(Entry("x", {"a"}, {"b"}, "c")));
}

TEST_F(DebugConfigTest, ASeparatorIsNeverPartOfAField) { ExpectMalformed("x:\"a:b\":c:d"); }

TEST_F(DebugConfigTest, BlanksInsideTheLineStayPartOfNameAndCommand) {
    EXPECT_THAT(Parse("  x : a : b : echo  hello  \n"),
                ElementsAre(Entry("x ", {"a"}, {"b"}, " echo  hello")));
}

TEST_F(DebugConfigTest, TheListsAreTrimmedAsAWholeAndNotItemByItem) {
    EXPECT_THAT(Parse("x: a , b :\tc\t:d\n"), ElementsAre(Entry("x", {"a ", " b"}, {"c"}, "d")));
}

TEST_F(DebugConfigTest, ABlankFieldIsAnEmptyList) {
    EXPECT_THAT(Parse("x: : :d\n"), ElementsAre(Entry("x", {}, {}, "d")));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(DebugConfigTest, EmptyItemsAreKept) {
    EXPECT_EQ(Items("a,,b"), (List{"a", "", "b"}));
    EXPECT_EQ(Items(",a"), (List{"", "a"}));
    EXPECT_EQ(Items("a,"), (List{"a", ""}));
}

TEST_F(DebugConfigTest, ASeparatorInsideQuotesIsOrdinaryText) {
    EXPECT_EQ(Items("\"a,b\",c"), (List{"a,b", "c"}));
    EXPECT_EQ(Items("'a,b',c"), (List{"a,b", "c"}));
    EXPECT_EQ(Items("a\" \"b"), (List{"a b"}));
    EXPECT_EQ(Items("\"\""), (List{""}));
}

TEST_F(DebugConfigTest, EscapesStandForThemselvesAndALineEnd) {
    EXPECT_EQ(Items("a\\,b"), (List{"a,b"}));
    EXPECT_EQ(Items("a\\\\b"), (List{"a\\b"}));
    EXPECT_EQ(Items("a\\nb"), (List{"a\nb"}));
    EXPECT_EQ(Items("\\\"a\\'"), (List{"\"a'"}));
    EXPECT_EQ(Items("\"a\\\"b\""), (List{"a\"b"}));
}

TEST_F(DebugConfigTest, AnInvalidEscapeIsAMalformedEntry) { ExpectMalformed("x:a\\tb:c:d"); }

TEST_F(DebugConfigTest, AnEscapeAtTheEndIsAMalformedEntry) { ExpectMalformed("x:a:b\\:d"); }

TEST_F(DebugConfigTest, AnUnterminatedQuoteIsAMalformedEntry) { ExpectMalformed("x:\"a,b:c:d"); }

TEST_F(DebugConfigTest, AnUnterminatedQuoteInTheThirdFieldIsAMalformedEntry) {
    ExpectMalformed("x:a:'b:d");
}

TEST_F(DebugConfigTest, TheLineAfterAnInvalidEscapeIsRead) {
    EXPECT_THAT(Parse("x:\\z:c:d\ny:a:b:c\n"), ElementsAre(Entry("y", {"a"}, {"b"}, "c")));
}

TEST_F(DebugConfigTest, EscapesAndQuotesMeanNothingInNameAndCommand) {
    EXPECT_THAT(Parse("x\\t\":a:b:echo \"it's \\t\n"),
                ElementsAre(Entry("x\\t\"", {"a"}, {"b"}, "echo \"it's \\t")));
}

TEST_F(DebugConfigTest, TheFileIsReadFromItsFixedPlace) {
    const support::PrivateRoot root;
    root.Write("/etc/nuvex/vantor/debug.conf", "x:a:b:c\n");
    EXPECT_THAT(ReadDebugConfig(), ElementsAre(Entry("x", {"a"}, {"b"}, "c")));
}

TEST_F(DebugConfigTest, AFileOfManyPiecesIsReadWhole) {
    const support::PrivateRoot root;
    std::string lines;
    for (int line = 0; line < 1000; ++line) {
        lines += "x" + std::to_string(line) + ":a:b:c\n";
    }
    root.Write("/etc/nuvex/vantor/debug.conf", lines + "last:a:b:c");
    const std::list<DebugEntry> entries = ReadDebugConfig();
    ASSERT_THAT(entries, SizeIs(1001));
    EXPECT_EQ(entries.back().name, "last");
    EXPECT_EQ(entries.back().line, 1001);
}

// A signal handler that does not restart system calls.
TEST_F(DebugConfigTest, AnInterruptedReadGoesOn) {
    const support::PrivateRoot root;
    root.Write("/etc/nuvex/vantor/debug.conf", "x:a:b:c\n");
    ReadFault().FailCall(1, EINTR);
    EXPECT_THAT(ReadDebugConfig(), SizeIs(1));
    ReadFault().Reset();
}

// The command of the line at which reading stops would be cut off.
TEST_F(DebugConfigTest, AFileThatCannotBeReadToItsEndIsEmptyAndSilent) {
    const support::PrivateRoot root;
    root.Write("/etc/nuvex/vantor/debug.conf", "x:a:b:c\ny:a:b:" + std::string(5000, 'c'));
    ReadFault().FailCall(2, EIO);
    EXPECT_THAT(ReadDebugConfig(), IsEmpty());
    EXPECT_EQ(ReadFault().Calls(), 2);
    ReadFault().Reset();
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(DebugConfigTest, AMissingFileIsEmptyAndSilent) {
    const support::PrivateRoot root;
    EXPECT_THAT(ReadDebugConfig(), IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(DebugConfigTest, AnUnreadableFileIsEmptyAndSilent) {
    const support::PrivateRoot root;
    root.MakeFolder("/etc/nuvex/vantor/debug.conf");
    EXPECT_THAT(ReadDebugConfig(), IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

}  // namespace
}  // namespace vantor
