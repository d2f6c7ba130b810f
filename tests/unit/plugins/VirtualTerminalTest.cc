#include "plugins/VirtualTerminal.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/vt.h>
#include <unistd.h>

#include <cerrno>

#include "plugins/TerminalCalls.h"
#include "support/PrivateRoot.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;

class VirtualTerminalTest : public ::testing::Test {
protected:
    VirtualTerminalTest() { support::OpenFault().Reset(); }

    support::PrivateRoot root;
    support::TerminalCalls calls;
    support::SyslogCapture log;
};

TEST_F(VirtualTerminalTest, ActivatesTheTerminalOnTheConsole) {
    root.Write("/dev/console", "");
    SwitchToVirtualTerminal(11);
    EXPECT_THAT(calls.requests, ElementsAre(Pair(VT_ACTIVATE, 11)));
}

TEST_F(VirtualTerminalTest, WaitsForTheTerminalOnlyWhenActivationFails) {
    root.Write("/dev/console", "");
    calls.activate.FailCall(1, ENOTTY);
    SwitchToVirtualTerminal(1);
    EXPECT_THAT(calls.requests, ElementsAre(Pair(VT_ACTIVATE, 1), Pair(VT_WAITACTIVE, 1)));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(VirtualTerminalTest, WithoutAConsoleNothingIsAskedOrSaid) {
    SwitchToVirtualTerminal(1);
    EXPECT_THAT(calls.requests, IsEmpty());
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(VirtualTerminalTest, AConsoleThatCannotBeOpenedForWritingIsNone) {
    root.MakeFolder("/dev/console");
    SwitchToVirtualTerminal(1);
    EXPECT_THAT(calls.requests, IsEmpty());
}

TEST_F(VirtualTerminalTest, TheConsoleIsClosedAgain) {
    root.Write("/dev/console", "");
    const int before = open("/dev/null", O_RDONLY | O_CLOEXEC);
    close(before);
    SwitchToVirtualTerminal(1);
    const int after = open("/dev/null", O_RDONLY | O_CLOEXEC);
    close(after);
    EXPECT_EQ(after, before);
}

}  // namespace
}  // namespace vantor
