#include "json/NvcliDispatcher.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>
#include <syslog.h>

#include <algorithm>
#include <atomic>
#include <cstdio>
#include <cstdlib>
#include <functional>
#include <set>
#include <stdexcept>
#include <thread>

#include "json/BaseKitDouble.h"
#include "json/RunCommand.h"
#include "support/ErrorText.h"
#include "support/FreshProcess.h"
#include "support/SyslogCapture.h"
#include "support/Waiting.h"

namespace vantor {

namespace {

using support::BaseKitDouble;
using support::ErrorText;
using support::InFreshProcess;
using support::LogEntry;
using support::ParsedLine;
using support::SyslogCapture;
using support::WaitUntil;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

const auto madeWithItsDirectories =
    ElementsAre("dispatcher: new", "dispatcher: directory /usr/lib/nuvex/nvcli",
                "dispatcher: directory /usr/lib/nuvex/nvcli/int",
                "dispatcher: directory /usr/lib/nuvex/nvcli/int/ext",
                "dispatcher: directory /usr/lib/nuvex/nvcli/ext");

bool IsDirectory(const std::string& call) { return call.rfind("dispatcher: directory ", 0) == 0; }

class NvcliDispatcherTest : public ::testing::Test {
protected:
    BaseKitDouble framework;
    const SyslogCapture log;
};

TEST_F(NvcliDispatcherTest, AddsItsDirectoriesInOrder) {
    const NvcliDispatcher dispatcher;
    EXPECT_THAT(framework.Calls(), madeWithItsDirectories);
    EXPECT_THAT(log.Entries(), IsEmpty());
}

TEST_F(NvcliDispatcherTest, EveryDispatcherHasTheSameDirectories) {
    { const NvcliDispatcher first; }
    const std::size_t before = framework.Calls().size();
    const NvcliDispatcher second;
    std::vector<std::string> calls = framework.Calls();
    calls.erase(calls.begin(), calls.begin() + static_cast<std::ptrdiff_t>(before));
    EXPECT_THAT(calls, madeWithItsDirectories);
}

TEST_F(NvcliDispatcherTest, EveryRefusedDirectoryIsLoggedAndPassedOver) {
    framework.onCall = [](const std::string& call) {
        if (IsDirectory(call)) {
            throw std::runtime_error("100%s of" + call.substr(call.rfind(' ')));
        }
    };
    const NvcliDispatcher dispatcher;
    const std::string text = "unable to add external directory to the nvcli dispatcher: 100%s of ";
    EXPECT_THAT(log.Entries(), ElementsAre(LogEntry{LOG_ERR, text + "/usr/lib/nuvex/nvcli"},
                                           LogEntry{LOG_ERR, text + "/usr/lib/nuvex/nvcli/int"},
                                           LogEntry{LOG_ERR, text + "/usr/lib/nuvex/nvcli/int/ext"},
                                           LogEntry{LOG_ERR, text + "/usr/lib/nuvex/nvcli/ext"}));
    EXPECT_THAT(framework.Calls(), madeWithItsDirectories);
}

TEST_F(NvcliDispatcherTest, OneRefusedDirectoryKeepsNoOtherOut) {
    framework.onCall = [](const std::string& call) {
        if (call == "dispatcher: directory /usr/lib/nuvex/nvcli/int") {
            throw std::logic_error("no");
        }
    };
    const NvcliDispatcher dispatcher;
    EXPECT_THAT(log.Entries(),
                ElementsAre(LogEntry{
                    LOG_ERR, "unable to add external directory to the nvcli dispatcher: no"}));
    EXPECT_THAT(framework.Calls(), madeWithItsDirectories);
}

TEST_F(NvcliDispatcherTest, OtherExceptionDestroysTheBaseAndLeavesTheConstructor) {
    framework.onCall = [](const std::string& call) {
        if (call == "dispatcher: directory /usr/lib/nuvex/nvcli/int") {
            throw 7;
        }
    };
    const int before = framework.LiveDispatchers();
    EXPECT_THROW(NvcliDispatcher(), int);
    EXPECT_EQ(framework.LiveDispatchers(), before);
    EXPECT_THAT(framework.Calls(),
                ElementsAre("dispatcher: new", "dispatcher: directory /usr/lib/nuvex/nvcli",
                            "dispatcher: directory /usr/lib/nuvex/nvcli/int",
                            "dispatcher: destroyed"));
    EXPECT_THAT(log.Entries(), IsEmpty());
}

// A process has one dispatcher for all its life, so each of these runs in a process of its own.
class NvcliDispatcherInstanceTest : public NvcliDispatcherTest {};

TEST_F(NvcliDispatcherInstanceTest, IsMadeByTheFirstCallAndKept) {
    InFreshProcess([this] {
        EXPECT_THAT(framework.Calls(), IsEmpty());
        NvcliDispatcher* const dispatcher = NvcliDispatcher::Instance();
        ASSERT_NE(dispatcher, nullptr);
        EXPECT_EQ(NvcliDispatcher::Instance(), dispatcher);
        EXPECT_EQ(framework.LiveDispatchers(), 1);
        EXPECT_THAT(framework.Calls(), madeWithItsDirectories);
    });
}

TEST_F(NvcliDispatcherInstanceTest, IsThereWithoutAnyDirectory) {
    InFreshProcess([this] {
        framework.onCall = [](const std::string& call) {
            if (IsDirectory(call)) {
                throw std::runtime_error("no");
            }
        };
        NvcliDispatcher* const dispatcher = NvcliDispatcher::Instance();
        ASSERT_NE(dispatcher, nullptr);
        EXPECT_EQ(log.Entries().size(), 4U);
        EXPECT_EQ(NvcliDispatcher::Instance(), dispatcher);
        EXPECT_EQ(log.Entries().size(), 4U);
        RunCommand("a", "start", "netcfg");
        EXPECT_EQ(framework.Executed().size(), 1U);
    });
}

TEST_F(NvcliDispatcherInstanceTest, IsMadeAtTheFirstCommandThatIsToBeExecuted) {
    InFreshProcess([this] {
        framework.parse = [](const std::string& line) {
            ParsedLine parsed;
            parsed.nothingToExecute = line == "help";
            parsed.errors =
                line == "bad" ? std::vector<std::string>{"no"} : std::vector<std::string>();
            return parsed;
        };
        RunCommand("help", "start", "netcfg");
        RunCommand("bad", "start", "netcfg");
        EXPECT_EQ(framework.LiveDispatchers(), 0);
        RunCommand("good", "start", "netcfg");
        EXPECT_EQ(framework.LiveDispatchers(), 1);
    });
}

TEST_F(NvcliDispatcherInstanceTest, IsMadeAfterTheInputIsFilled) {
    InFreshProcess([this] {
        RunCommand("a", "start", "netcfg");
        const std::vector<std::string> calls = framework.Calls();
        const auto made = std::find(calls.begin(), calls.end(), "dispatcher: new");
        const auto filled = std::find(calls.begin(), calls.end(), "input: path a");
        EXPECT_NE(made, calls.end());
        EXPECT_LT(filled, made);
    });
}

// Throws at the first call of that name only.
std::function<void(const std::string&)> ThrowOnce(const std::string& name,
                                                  const std::function<void()>& exception) {
    return [name, exception, thrown = false](const std::string& call) mutable {
        if (call == name && !thrown) {
            thrown = true;
            exception();
        }
    };
}

TEST_F(NvcliDispatcherInstanceTest, FailureToMakeItLeavesNoneAndTheNextCallTriesAgain) {
    InFreshProcess([this] {
        framework.onCall =
            ThrowOnce("dispatcher: directory /usr/lib/nuvex/nvcli/ext", [] { throw 7; });
        EXPECT_THROW(NvcliDispatcher::Instance(), int);
        EXPECT_EQ(framework.LiveDispatchers(), 0);
        EXPECT_NE(NvcliDispatcher::Instance(), nullptr);
        EXPECT_EQ(framework.LiveDispatchers(), 1);
    });
}

TEST_F(NvcliDispatcherInstanceTest, ExceptionOfTheBaseLeavesNoneAndTheNextCallTriesAgain) {
    InFreshProcess([this] {
        framework.onCall = ThrowOnce("dispatcher: new", [] { throw std::runtime_error("no"); });
        EXPECT_EQ(ErrorText<std::runtime_error>([] { NvcliDispatcher::Instance(); }), "no");
        EXPECT_THAT(log.Entries(), IsEmpty());
        EXPECT_NE(NvcliDispatcher::Instance(), nullptr);
        EXPECT_EQ(framework.LiveDispatchers(), 1);
    });
}

TEST_F(NvcliDispatcherInstanceTest, FailureToMakeItLeavesTheCommandAndItsObjectsAreReleased) {
    InFreshProcess([this] {
        framework.onCall = ThrowOnce("dispatcher: new", [] { throw 7; });
        EXPECT_THROW(RunCommand("a", "start", "netcfg"), int);
        EXPECT_EQ(framework.LiveObjects(), 0);
        EXPECT_THAT(framework.Executed(), IsEmpty());
        RunCommand("b", "start", "netcfg");
        EXPECT_EQ(framework.Executed().size(), 1U);
    });
}

constexpr int threads = 8;

// What Instance() gave to each of eight threads that called it at once.
std::multiset<NvcliDispatcher*> CalledByEightThreads() {
    std::atomic<int> ready{0};
    std::vector<NvcliDispatcher*> given(threads, nullptr);
    std::vector<std::thread> callers;
    for (NvcliDispatcher*& mine : given) {
        callers.emplace_back([&ready, &mine] {
            ++ready;
            WaitUntil([&ready] { return ready == threads; });
            try {
                mine = NvcliDispatcher::Instance();
            } catch (int) {
                mine = nullptr;
            }
        });
    }
    for (std::thread& caller : callers) {
        caller.join();
    }
    return {given.begin(), given.end()};
}

TEST_F(NvcliDispatcherInstanceTest, EightThreadsFirstCallsMakeExactlyOne) {
    InFreshProcess([this] {
        const std::multiset<NvcliDispatcher*> given = CalledByEightThreads();
        EXPECT_EQ(given.count(nullptr), 0U);
        EXPECT_EQ(given.count(*given.begin()), std::size_t{threads});
        EXPECT_EQ(framework.LiveDispatchers(), 1);
        EXPECT_THAT(framework.Calls(), madeWithItsDirectories);
    });
}

TEST_F(NvcliDispatcherInstanceTest, OneOfEightThreadsThatFailsLeavesItToTheNext) {
    InFreshProcess([this] {
        framework.onCall = ThrowOnce("dispatcher: new", [] { throw 7; });
        const std::multiset<NvcliDispatcher*> given = CalledByEightThreads();
        EXPECT_EQ(given.count(nullptr), 1U);
        EXPECT_EQ(given.count(*given.rbegin()), std::size_t{threads - 1});
        EXPECT_EQ(framework.LiveDispatchers(), 1);
    });
}

TEST_F(NvcliDispatcherInstanceTest, IsDestroyedWhenTheProcessEnds) {
    ::testing::GTEST_FLAG(death_test_style) = "fast";
    EXPECT_EXIT(
        {
            NvcliDispatcher::Instance();
            framework.onDestruction = [] { std::fputs("dispatcher destroyed", stderr); };
            // Runs before the static destructors.
            std::atexit([] { std::fputs("exit began; ", stderr); });
            std::exit(0);
        },
        ::testing::ExitedWithCode(0), "exit began; dispatcher destroyed");
}

}  // namespace

}  // namespace vantor
