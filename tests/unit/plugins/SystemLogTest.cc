#include "plugins/SystemLog.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <cerrno>
#include <cstring>
#include <ostream>

#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using support::LogEntry;
using ::testing::ElementsAre;

struct FormatCase {
    const char* text;
    const char* logged;
};

void PrintTo(const FormatCase& value, std::ostream* stream) {
    *stream << ::testing::PrintToString(value.text);
}

class LogFormatTest : public ::testing::TestWithParam<FormatCase> {};

TEST_P(LogFormatTest, IsLoggedAsWhatItMeansAsAFormat) {
    const support::SyslogCapture log;
    LogFormat(LOG_WARNING, GetParam().text, ENOENT);
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_WARNING, GetParam().logged}));
}

INSTANTIATE_TEST_SUITE_P(
    SystemLog, LogFormatTest,
    ::testing::Values(FormatCase{"", ""}, FormatCase{"plain text", "plain text"},
                      FormatCase{"100%% sure", "100% sure"}, FormatCase{"%%", "%"},
                      FormatCase{"%%%%", "%%"}, FormatCase{"%%m", "%m"}, FormatCase{"%%%d", "%%d"},
                      FormatCase{"%", "%"}, FormatCase{"%%%", "%%"}, FormatCase{"50%", "50%"},
                      FormatCase{"a%sb", "a%sb"}, FormatCase{"%n", "%n"},
                      FormatCase{"% d and %*.*f", "% d and %*.*f"},
                      FormatCase{"%m", "No such file or directory"},
                      FormatCase{"a%mb%m", "aNo such file or directorybNo such file or directory"},
                      FormatCase{"%s%m", "%sNo such file or directory"}));

TEST(SystemLogTest, ThePriorityIsPassedOn) {
    const support::SyslogCapture log;
    LogFormat(LOG_ERR, "text", 0);
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_ERR, "text"}));
}

TEST(SystemLogTest, TheErrorIsTheOneGivenNotTheLastOne) {
    const support::SyslogCapture log;
    errno = EPERM;
    LogFormat(LOG_WARNING, "%m", ENOSPC);
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_WARNING, "No space left on device"}));
}

}  // namespace
}  // namespace vantor
