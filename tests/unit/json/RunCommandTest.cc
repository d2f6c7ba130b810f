#include "json/RunCommand.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <atomic>
#include <new>
#include <stdexcept>
#include <thread>

#include "graph/GlobalLock.h"
#include "json/BaseKitDouble.h"
#include "json/NvcliDispatcher.h"
#include "support/ErrorText.h"
#include "support/SyslogCapture.h"
#include "support/Waiting.h"

namespace vantor {

namespace {

using support::BaseKitDouble;
using support::ErrorText;
using support::GivenCommand;
using support::LogEntry;
using support::ParsedLine;
using support::SyslogCapture;
using support::WaitUntil;
using ::testing::ElementsAre;
using ::testing::IsEmpty;
using ::testing::Pair;

// Every test begins with the dispatcher in place, made before calls are noted.
class RunCommandTest : public ::testing::Test {
protected:
    NvcliDispatcher* const dispatcher = NvcliDispatcher::Instance();
    BaseKitDouble framework;
    const SyslogCapture log;
};

ParsedLine WithParameters(const std::string& /*line*/) {
    ParsedLine parsed;
    parsed.path = {"system", "module", "load"};
    parsed.parameters = {{"module", "netdrv"}, {"a", "2"}, {"module", ""}, {"a", "1"}};
    return parsed;
}

TEST_F(RunCommandTest, EveryCallIsMadeOnceAndInOrder) {
    framework.parse = WithParameters;
    RunCommand("system module load --module=netdrv", "start", "netcfg");
    EXPECT_THAT(framework.Calls(),
                ElementsAre("parser: new nvcli", "parser: parse system module load --module=netdrv",
                            "parser: errors", "input: new", "output: new", "parser: parameters",
                            "parser: path", "input: caller vantor",
                            "input: path system module load", "input: parameter module=netdrv",
                            "input: parameter a=2",
                            "input: parameter module=", "input: parameter a=1",
                            "dispatcher: execute system module load", "output: has errors"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(RunCommandTest, InputIsFilledInOrder) {
    framework.parse = WithParameters;
    RunCommand("any", "start", "netcfg");
    EXPECT_THAT(framework.CallsOf("input"),
                ElementsAre("input: new", "input: caller vantor", "input: path system module load",
                            "input: parameter module=netdrv", "input: parameter a=2",
                            "input: parameter module=", "input: parameter a=1"));
}

TEST_F(RunCommandTest, FrameworkIsGivenTheWholeCommand) {
    framework.parse = WithParameters;
    RunCommand("any", "start", "netcfg");
    const std::vector<GivenCommand> executed = framework.Executed();
    ASSERT_EQ(executed.size(), 1U);
    EXPECT_EQ(executed[0].callerName, "vantor");
    EXPECT_THAT(executed[0].path, ElementsAre("system", "module", "load"));
    EXPECT_THAT(executed[0].parameters, ElementsAre(Pair("module", "netdrv"), Pair("a", "2"),
                                                    Pair("module", ""), Pair("a", "1")));
}

TEST_F(RunCommandTest, CommandWithoutParametersHasNone) {
    RunCommand("network firewall refresh", "start", "netcfg");
    const std::vector<GivenCommand> executed = framework.Executed();
    ASSERT_EQ(executed.size(), 1U);
    EXPECT_THAT(executed[0].path, ElementsAre("network", "firewall", "refresh"));
    EXPECT_THAT(executed[0].parameters, IsEmpty());
}

TEST_F(RunCommandTest, LineWithNothingToExecuteIsPassedOverInSilence) {
    framework.parse = [](const std::string&) {
        ParsedLine parsed;
        parsed.nothingToExecute = true;
        parsed.errors = {"not to be looked at"};
        return parsed;
    };
    RunCommand("--help", "start", "netcfg");
    EXPECT_THAT(framework.Calls(), ElementsAre("parser: new nvcli", "parser: parse --help"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(RunCommandTest, EachParseErrorIsLoggedAndNothingIsExecuted) {
    framework.parse = [](const std::string&) {
        ParsedLine parsed;
        parsed.errors = {"first 100%s", "second"};
        return parsed;
    };
    RunCommand("a b", "start", "netcfg");
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "unable to parse 'start' commands in context "
                                              "'netcfg': first 100%s"},
                            LogEntry{LOG_ERR, "unable to parse 'start' commands in context "
                                              "'netcfg': second"}));
    EXPECT_THAT(framework.Calls(),
                ElementsAre("parser: new nvcli", "parser: parse a b", "parser: errors"));
}

TEST_F(RunCommandTest, ParseErrorsNameTheOperationThatTheyBelongTo) {
    framework.parse = [](const std::string&) {
        ParsedLine parsed;
        parsed.errors = {"no"};
        return parsed;
    };
    RunCommand("a", "apply host profile", "net%scfg");
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "unable to parse 'apply host profile' commands in "
                                              "context 'net%scfg': no"}));
}

TEST_F(RunCommandTest, EachErrorOfTheCommandIsLogged) {
    framework.execute = [](const GivenCommand&) {
        return std::vector<std::string>{"first 100%s", "second"};
    };
    RunCommand("network firewall refresh", "start", "netcfg");
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "execution of 'network firewall refresh' failed in "
                                              "context netcfg[start]': first 100%s"},
                            LogEntry{LOG_ERR, "execution of 'network firewall refresh' failed in "
                                              "context netcfg[start]': second"}));
    EXPECT_THAT(framework.CallsOf("output"),
                ElementsAre("output: new", "output: has errors", "output: error messages"));
}

TEST_F(RunCommandTest, ErrorsOfTheCommandNameTheOperationThatTheyBelongTo) {
    framework.execute = [](const GivenCommand&) { return std::vector<std::string>{"no"}; };
    RunCommand("a %d", "apply host profile", "netcfg");
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{LOG_ERR, "execution of 'a %d' failed in context "
                                              "netcfg[apply host profile]': no"}));
}

TEST_F(RunCommandTest, EverythingIsReleasedAfterwards) {
    framework.execute = [this](const GivenCommand&) {
        EXPECT_EQ(framework.LiveObjects(), 3);  // parser, input and output
        return std::vector<std::string>{"no"};
    };
    RunCommand("a", "start", "netcfg");
    EXPECT_EQ(framework.Executed().size(), 1U);
    EXPECT_EQ(framework.LiveObjects(), 0);
}

TEST_F(RunCommandTest, EveryCommandHasObjectsOfItsOwnAndTheSameDispatcher) {
    RunCommand("a", "start", "netcfg");
    RunCommand("b", "start", "netcfg");
    EXPECT_EQ(framework.CallsOf("parser").size(), 10U);
    EXPECT_THAT(framework.CallsOf("dispatcher"),
                ElementsAre("dispatcher: execute a", "dispatcher: execute b"));
    EXPECT_EQ(NvcliDispatcher::Instance(), dispatcher);
}

// The calls of one command, in which the framework throws in turn.
class RunCommandThrowTest : public RunCommandTest,
                            public ::testing::WithParamInterface<const char*> {
protected:
    RunCommandThrowTest() {
        framework.parse = WithParameters;
        framework.execute = [](const GivenCommand&) { return std::vector<std::string>{"no"}; };
    }
};

TEST_P(RunCommandThrowTest, StandardExceptionLeavesAndEverythingIsReleased) {
    framework.onCall = [](const std::string& call) {
        if (call == GetParam()) {
            throw std::runtime_error("the framework's own");
        }
    };
    EXPECT_EQ(ErrorText<std::runtime_error>([] { RunCommand("any", "start", "netcfg"); }),
              "the framework's own");
    EXPECT_EQ(framework.Calls().back(), GetParam());
    EXPECT_EQ(framework.LiveObjects(), 0);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_P(RunCommandThrowTest, OtherExceptionLeavesAndEverythingIsReleased) {
    framework.onCall = [](const std::string& call) {
        if (call == GetParam()) {
            throw 7;
        }
    };
    EXPECT_THROW(RunCommand("any", "start", "netcfg"), int);
    EXPECT_EQ(framework.Calls().back(), GetParam());
    EXPECT_EQ(framework.LiveObjects(), 0);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

INSTANTIATE_TEST_SUITE_P(AtEveryCall, RunCommandThrowTest,
                         ::testing::Values("parser: new nvcli", "parser: parse any",
                                           "parser: errors", "input: new", "output: new",
                                           "parser: parameters", "parser: path",
                                           "input: caller vantor", "input: path system module load",
                                           "input: parameter a=2",
                                           "dispatcher: execute system module load",
                                           "output: has errors", "output: error messages"));

TEST_F(RunCommandTest, NoLockIsHeldWhileTheFrameworkIsCalled) {
    bool held = false;
    framework.onCall = [&held](const std::string&) {
        held = held || GlobalLock::HeldByCurrentThread();
    };
    RunCommand("a", "start", "netcfg");
    EXPECT_FALSE(held);
}

TEST_F(RunCommandTest, EightThreadsExecuteAtTheSameTime) {
    constexpr int threads = 8;
    std::atomic<int> inside{0};
    std::atomic<int> allMet{0};
    framework.execute = [&inside, &allMet](const GivenCommand& command) {
        ++inside;
        allMet += WaitUntil([&inside] { return inside == threads; }) ? 1 : 0;
        return std::vector<std::string>{"of " + command.path.front()};
    };
    std::vector<std::thread> workers;
    for (int i = 0; i < threads; ++i) {
        workers.emplace_back(
            [i] { RunCommand("c" + std::to_string(i), "start", "plugin" + std::to_string(i)); });
    }
    for (std::thread& worker : workers) {
        worker.join();
    }
    EXPECT_EQ(allMet, threads);
    EXPECT_EQ(framework.LiveObjects(), 0);
    std::vector<LogEntry> expected;
    for (int i = 0; i < threads; ++i) {
        const std::string n = std::to_string(i);
        expected.push_back({LOG_ERR, "execution of 'c" + n + "' failed in context plugin" + n +
                                         "[start]': of c" + n});
    }
    EXPECT_THAT(log.Entries(), ::testing::UnorderedElementsAreArray(expected));
}

}  // namespace

}  // namespace vantor
