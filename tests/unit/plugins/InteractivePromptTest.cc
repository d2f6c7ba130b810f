#include "plugins/InteractivePrompt.h"

#include <fcntl.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <linux/vt.h>
#include <syslog.h>
#include <unistd.h>

#include <cstring>
#include <iostream>

#include "plugins/FakePlugin.h"
#include "plugins/OperatorTerminal.h"
#include "support/HostCalls.h"
#include "support/PrivateRoot.h"
#include "support/RunConfigReset.h"
#include "support/StreamCapture.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using support::LogEntry;
using ::testing::AllOf;
using ::testing::ElementsAre;
using ::testing::Field;
using ::testing::IsEmpty;
using ::testing::Pair;

const std::string question = "current plugin: \033[36mdisk\n"
                             "\033[35m(c)ontinue\033[0m\t\033[32m(e)xecute\033[0m\t"
                             "\033[33m(t)roubleshoot\033[0m\t\033[31m(s)kip\033[0m"
                             "\033[?25l";
const std::string continueChosen = "\033[?25h"
                                   "\r\033[35m(c)ontinue\033[0m\t\033[37m(e)xecute\033[0m\t"
                                   "\033[37m(t)roubleshoot\033[0m\t\033[37m(s)kip\033[0m\n";
const std::string executeChosen = "\033[?25h"
                                  "\r\033[37m(c)ontinue\033[0m\t\033[32m(e)xecute\033[0m\t"
                                  "\033[37m(t)roubleshoot\033[0m\t\033[37m(s)kip\033[0m\n";
const std::string troubleshootChosen = "\033[?25h"
                                       "\r\033[37m(c)ontinue\033[0m\t\033[37m(e)xecute\033[0m\t"
                                       "\033[33m(t)roubleshoot\033[0m\t\033[37m(s)kip\033[0m\n";
const std::string skipChosen = "\033[?25h"
                               "\r\033[37m(c)ontinue\033[0m\t\033[37m(e)xecute\033[0m\t"
                               "\033[37m(t)roubleshoot\033[0m\t\033[31m(s)kip\033[0m\n";

constexpr tcflag_t keyModes = ICANON | ECHO;

// A host with a console, at whose standard input an operator sits.
class InteractivePromptTest : public ::testing::Test {
protected:
    InteractivePromptTest() {
        config.interactive = true;
        root.Write("/dev/console", "");
    }

    // Answers one prompt with these keys; returns whether the plugin is to run.
    bool Answer(const std::string& keys) {
        terminal.WillPress(keys);
        return PassInteractiveGate("disk");
    }

    RunConfig& config = support::ResetRunConfig();
    support::PrivateRoot root;
    support::HostCalls hostCalls;
    support::OperatorTerminal terminal;
    support::SyslogCapture log;
    support::StreamCapture output{std::cout};
    support::StreamCapture errors{std::cerr};
    support::FakePlugin plugin{"disk"};
};

TEST_F(InteractivePromptTest, ExecuteRunsThePlugin) {
    EXPECT_TRUE(Answer("e"));
    EXPECT_EQ(output.Text(), question + executeChosen);
    EXPECT_TRUE(config.interactive);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(InteractivePromptTest, ContinueEndsInteractiveModeForGood) {
    EXPECT_TRUE(Answer("c"));
    EXPECT_EQ(output.Text(), question + continueChosen);
    EXPECT_FALSE(config.interactive);
    EXPECT_THAT(terminal.calls.requests, ElementsAre(Pair(VT_ACTIVATE, 1), Pair(VT_ACTIVATE, 11)));
}

TEST_F(InteractivePromptTest, SkipIsLogged) {
    EXPECT_FALSE(Answer("s"));
    EXPECT_EQ(output.Text(), question + skipChosen);
    EXPECT_TRUE(config.interactive);
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "skipping plugin disk (interactive mode request)"}));
}

TEST_F(InteractivePromptTest, TroubleshootRunsThePluginEvenWhenThereIsNoShell) {
    hostCalls.fork.FailCall(1, EAGAIN);
    EXPECT_TRUE(Answer("t"));
    EXPECT_EQ(output.Text(), question + troubleshootChosen);
    EXPECT_TRUE(config.interactive);
    EXPECT_EQ(hostCalls.fork.Calls(), 1);
}

TEST_F(InteractivePromptTest, TheConsoleIsSwitchedToTerminal1ForThePrompt) {
    EXPECT_TRUE(Answer("e"));
    EXPECT_THAT(terminal.calls.requests, ElementsAre(Pair(VT_ACTIVATE, 1)));
}

TEST_F(InteractivePromptTest, UpperCaseKeysAreAsGood) {
    EXPECT_TRUE(Answer("E"));
    EXPECT_FALSE(Answer("S"));
    EXPECT_TRUE(Answer("C"));
    EXPECT_EQ(output.Text(),
              question + executeChosen + question + skipChosen + question + continueChosen);
}

TEST_F(InteractivePromptTest, OtherKeysAreIgnored) {
    EXPECT_TRUE(Answer("x \n\r\t\033[A1\x04\xc3\xa9\x80"
                       "e"));
    EXPECT_EQ(output.Text(), question + executeChosen);
    EXPECT_EQ(terminal.KeysLeft(), "");
}

TEST_F(InteractivePromptTest, KeysAfterTheAnswerAreLeftUnread) {
    EXPECT_TRUE(Answer("es"));
    EXPECT_EQ(terminal.KeysLeft(), "s");
}

TEST_F(InteractivePromptTest, KeysComeAtOnceAndUnseenWhileThePromptReads) {
    EXPECT_TRUE(Answer("xe"));
    ASSERT_EQ(terminal.ModesAtReads().size(), 2U);
    EXPECT_EQ(terminal.ModesAtReads()[0] & keyModes, 0U);
    EXPECT_EQ(terminal.ModesAtReads()[1] & keyModes, 0U);
}

TEST_F(InteractivePromptTest, TheTerminalIsAsItWasAfterTheAnswer) {
    const termios before = terminal.Attributes();
    ASSERT_EQ(before.c_lflag & keyModes, keyModes);
    EXPECT_TRUE(Answer("e"));
    const termios after = terminal.Attributes();
    EXPECT_EQ(after.c_lflag, before.c_lflag);
    EXPECT_EQ(after.c_iflag, before.c_iflag);
    EXPECT_EQ(after.c_oflag, before.c_oflag);
    EXPECT_EQ(after.c_cflag, before.c_cflag);
    EXPECT_EQ(std::memcmp(after.c_cc, before.c_cc, sizeof after.c_cc), 0);
}

TEST_F(InteractivePromptTest, OtherLocalModesAreKeptWhileThePromptReads) {
    const tcflag_t before = terminal.Attributes().c_lflag;
    EXPECT_TRUE(Answer("e"));
    EXPECT_THAT(terminal.ModesAtReads(), ElementsAre(before & ~keyModes));
}

TEST_F(InteractivePromptTest, BothModesAreSetAfterwardsWhateverTheyWere) {
    termios silent = terminal.Attributes();
    silent.c_lflag &= ~keyModes;
    terminal.SetAttributes(silent);
    EXPECT_TRUE(Answer("e"));
    EXPECT_EQ(terminal.Attributes().c_lflag & keyModes, keyModes);
}

TEST_F(InteractivePromptTest, EveryPluginIsAskedAbout) {
    terminal.WillPress("ee");
    EXPECT_TRUE(PassInteractiveGate("disk"));
    EXPECT_TRUE(PassInteractiveGate("disk"));
    EXPECT_EQ(output.Text(), question + executeChosen + question + executeChosen);
}

TEST_F(InteractivePromptTest, RequiredPluginsRunWithoutAPromptAndTheLastSwitchesTheConsole) {
    config.interactiveModeRequires = {"storage", "disk", "storage"};
    EXPECT_TRUE(PassInteractiveGate("storage"));
    EXPECT_THAT(config.interactiveModeRequires, ElementsAre("disk"));
    EXPECT_THAT(terminal.calls.requests, IsEmpty());
    EXPECT_TRUE(PassInteractiveGate("disk"));
    EXPECT_THAT(config.interactiveModeRequires, IsEmpty());
    EXPECT_THAT(terminal.calls.requests, ElementsAre(Pair(VT_ACTIVATE, 1)));
    EXPECT_EQ(output.Text(), "");
}

TEST_F(InteractivePromptTest, ThePromptBeginsWithThePluginAfterTheLastRequiredOne) {
    config.interactiveModeRequires = {"storage"};
    EXPECT_TRUE(PassInteractiveGate("storage"));
    EXPECT_FALSE(Answer("s"));
    EXPECT_EQ(output.Text(), question + skipChosen);
}

TEST_F(InteractivePromptTest, OtherPluginsRunWithoutAPromptWhileRequiredOnesAreAwaited) {
    config.interactiveModeRequires = {"storage"};
    EXPECT_TRUE(PassInteractiveGate("disk"));
    EXPECT_THAT(config.interactiveModeRequires, ElementsAre("storage"));
    EXPECT_EQ(output.Text(), "");
    EXPECT_THAT(terminal.calls.requests, IsEmpty());
}

TEST_F(InteractivePromptTest, RunIsNotStoppedWithoutInteractiveMode) {
    config.interactive = false;
    config.interactiveModeRequires = {"disk"};
    plugin.Run();
    EXPECT_EQ(plugin.starts, 1);
    EXPECT_THAT(config.interactiveModeRequires, ElementsAre("disk"));
    EXPECT_EQ(output.Text(), "");
}

TEST_F(InteractivePromptTest, RunGoesOnAfterExecuteWithTheTrace) {
    config.trace = true;
    hostCalls.times = {{10, 0}, {10, 3}};
    terminal.WillPress("e");
    plugin.Run();
    EXPECT_EQ(output.Text(), question + executeChosen +
                                 "starting execution of plugin: disk\n"
                                 "completed execution of plugin: disk (took 3 us)\n");
    EXPECT_EQ(plugin.starts, 1);
}

TEST_F(InteractivePromptTest, TheStartTimeIsThatOfBeforeThePrompt) {
    hostCalls.times = {{10, 0}, {20, 0}};
    terminal.WillPress("e");
    terminal.calls.beforeRead = [this, press = terminal.calls.beforeRead] {
        EXPECT_EQ(hostCalls.times.size(), 1U);
        press();
    };
    plugin.Run();
    EXPECT_EQ(plugin.StartTime().tv_sec, 10);
    EXPECT_EQ(plugin.EndTime().tv_sec, 20);
}

TEST_F(InteractivePromptTest, ASkippedPluginKeepsItsTimesAndPrintsNoCompletedLine) {
    config.trace = true;
    hostCalls.times = {{10, 0}};
    terminal.WillPress("s");
    plugin.Run();
    EXPECT_EQ(plugin.starts, 0);
    EXPECT_EQ(plugin.StartTime().tv_sec, 0);
    EXPECT_EQ(plugin.EndTime().tv_sec, 0);
    EXPECT_EQ(output.Text(), question + skipChosen);
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_INFO, "skipping plugin disk (interactive mode request)"}));
}

TEST_F(InteractivePromptTest, ASkippedPluginKeepsTheTimesOfAnEarlierRun) {
    hostCalls.times = {{10, 1}, {20, 2}, {30, 3}};
    terminal.WillPress("es");
    plugin.Run();
    plugin.Run();
    EXPECT_EQ(plugin.StartTime().tv_sec, 10);
    EXPECT_EQ(plugin.EndTime().tv_sec, 20);
}

TEST_F(InteractivePromptTest, SkipHoldsForANamedMethodToo) {
    config.method = "start";
    terminal.WillPress("s");
    plugin.Run();
    EXPECT_EQ(plugin.starts, 0);
}

TEST_F(InteractivePromptTest, AfterContinueNoPluginIsAskedAbout) {
    terminal.WillPress("c");
    plugin.Run();
    plugin.Run();
    EXPECT_EQ(plugin.starts, 2);
    EXPECT_EQ(output.Text(), question + continueChosen);
}

// Standard output as the operator sees it: what was flushed.
class FlushedOutput : public std::stringbuf {
public:
    std::string flushed;

protected:
    int sync() override {
        flushed = str();
        return 0;
    }
};

TEST_F(InteractivePromptTest, TheChoicesAreSeenBeforeTheFirstKeyIsRead) {
    FlushedOutput seen;
    std::streambuf* const previous = std::cout.rdbuf(&seen);
    std::string atFirstRead;
    terminal.calls.beforeRead = [&, press = terminal.calls.beforeRead] {
        atFirstRead = seen.flushed;
        press();
    };
    EXPECT_TRUE(Answer("e"));
    std::cout.rdbuf(previous);
    EXPECT_EQ(atFirstRead.substr(0, question.size() - std::strlen("\033[?25l")),
              question.substr(0, question.size() - std::strlen("\033[?25l")));
    EXPECT_EQ(seen.flushed, question + executeChosen);
}

// A standard input that is no terminal.
class PromptOnFileTest : public InteractivePromptTest {
protected:
    PromptOnFileTest()
        : file(open(folder.File("keys").c_str(), O_RDWR | O_CREAT | O_CLOEXEC | O_APPEND, 0600)),
          standardInput(STDIN_FILENO, file) {
        terminal.calls.beforeRead = nullptr;
    }
    ~PromptOnFileTest() override { close(file); }

    void Append(const std::string& keys) const {
        support::WriteFile(folder.File("keys"), support::ReadFile(folder.File("keys")) + keys);
    }

    support::TempFolder folder;
    int file;
    support::DescriptorReplacement standardInput;
};

TEST_F(PromptOnFileTest, IsReportedStepByStepAndUsedAsItIs) {
    Append("e");
    EXPECT_TRUE(PassInteractiveGate("disk"));
    EXPECT_EQ(output.Text(), question + executeChosen);
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "unable to get terminal io state"},
                            LogEntry{LOG_ERR, "unable to set terminal io state"},
                            LogEntry{LOG_ERR, "unable to restore terminal io state"}));
}

TEST_F(PromptOnFileTest, EndOfInputIsIgnoredAndReadingGoesOn) {
    int pauses = 0;
    terminal.calls.onPause = [&] {
        ++pauses;
        Append(pauses == 1 ? "x" : "s");
    };
    EXPECT_FALSE(PassInteractiveGate("disk"));
    EXPECT_EQ(pauses, 2);
    EXPECT_EQ(output.Text(), question + skipChosen);
}

}  // namespace
}  // namespace vantor
