#include "driver/CommandLine.h"

#include <getopt.h>
#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cstdlib>
#include <iostream>
#include <vector>

#include "driver/Usage.h"
#include "support/RunConfigReset.h"
#include "support/StreamCapture.h"
#include "support/SyslogCapture.h"

namespace vantor {
namespace {

using ::testing::ElementsAre;
using ::testing::EndsWith;
using ::testing::IsEmpty;

std::string UsageText() {
    const support::StreamCapture output(std::cout);
    PrintUsage();
    return output.Text();
}

class CommandLineTest : public ::testing::Test {
protected:
    // Parses a command line of these words behind the program's name.
    std::optional<int> Parse(std::vector<std::string> words) {
        words.insert(words.begin(), "vantor");
        std::vector<char*> arguments;
        arguments.reserve(words.size() + 1);
        for (std::string& word : words) {
            arguments.push_back(word.data());
        }
        arguments.push_back(nullptr);
        optind = 0;  // the parser starts afresh
        return ParseCommandLine(static_cast<int>(words.size()), arguments.data(), config, options);
    }

    void ExpectRun(const std::vector<std::string>& words) {
        EXPECT_EQ(Parse(words), std::nullopt);
        EXPECT_EQ(output.Text() + errors.Text(), "");
        EXPECT_THAT(log.Entries(), IsEmpty());
    }

    RunConfig& config = support::ResetRunConfig();
    DriverOptions options;
    support::SyslogCapture log;
    support::StreamCapture output{std::cout};
    support::StreamCapture errors{std::cerr};
};

TEST_F(CommandLineTest, WithoutOptionsEverythingHasItsDefault) {
    ExpectRun({});
    EXPECT_FALSE(config.verbose || config.parallel || config.randomize || config.interactive ||
                 config.trace || config.invoke);
    EXPECT_EQ(config.method, "");
    EXPECT_THAT(options.selectedPlugins, IsEmpty());
    EXPECT_THAT(options.pluginFlags, IsEmpty());
    EXPECT_THAT(options.runOncePlugins, IsEmpty());
    EXPECT_EQ(options.pluginDirectory, "/usr/libexec/vantor/plugins");
    EXPECT_FALSE(options.init);
    EXPECT_FALSE(options.dump);
    EXPECT_EQ(options.dumpPath, std::nullopt);
}

TEST_F(CommandLineTest, WithoutParallelThereIsOneThread) {
    ExpectRun({});
    EXPECT_EQ(config.threads, 1);
}

TEST_F(CommandLineTest, FlagsAreSet) {
    ExpectRun({"--init", "--trace", "--verbose", "--randomize"});
    EXPECT_TRUE(options.init);
    EXPECT_TRUE(config.trace);
    EXPECT_TRUE(config.verbose);
    EXPECT_TRUE(config.randomize);
}

TEST_F(CommandLineTest, ParallelHas8Threads) {
    ExpectRun({"--parallel"});
    EXPECT_TRUE(config.parallel);
    EXPECT_EQ(config.threads, 8);
}

TEST_F(CommandLineTest, InteractiveAfterParallelIsInteractiveAndSerial) {
    ExpectRun({"--parallel", "--interactive"});
    EXPECT_TRUE(config.interactive);
    EXPECT_FALSE(config.parallel);
    EXPECT_EQ(config.threads, 1);
}

TEST_F(CommandLineTest, ParallelAfterInteractiveIsParallelWith8Threads) {
    ExpectRun({"--interactive", "--parallel"});
    EXPECT_FALSE(config.interactive);
    EXPECT_TRUE(config.parallel);
    EXPECT_EQ(config.threads, 8);
}

TEST_F(CommandLineTest, OnlyTheLastPluginFlagsCount) {
    ExpectRun({"--plugin-flags=a,b", "--plugin-flags=c"});
    EXPECT_THAT(options.pluginFlags, ElementsAre("c"));
}

TEST_F(CommandLineTest, EmptyPluginFlagsClearEarlierOnes) {
    ExpectRun({"--plugin-flags=a,b", "--plugin-flags="});
    EXPECT_THAT(options.pluginFlags, IsEmpty());
}

TEST_F(CommandLineTest, DisabledPluginsAccumulate) {
    ExpectRun({"--disable-plugins=a", "--disable-plugins=b,a"});
    EXPECT_THAT(config.disabledPlugins, ElementsAre("a", "b", "a"));
}

TEST_F(CommandLineTest, SelectedPluginsAccumulateInOrderWithDuplicates) {
    ExpectRun({"--plugin=b,a", "--plugin", "b"});
    EXPECT_THAT(options.selectedPlugins, ElementsAre("b", "a", "b"));
}

TEST_F(CommandLineTest, RunOncePluginsAccumulateAsASet) {
    ExpectRun({"--run-once=b,a", "--run-once=c,b"});
    EXPECT_THAT(options.runOncePlugins, ElementsAre("a", "b", "c"));
}

TEST_F(CommandLineTest, PluginsThatInteractiveModeRequiresAccumulate) {
    ExpectRun({"--interactive-mode-requires=a", "--interactive-mode-requires=b"});
    EXPECT_THAT(config.interactiveModeRequires, ElementsAre("a", "b"));
    EXPECT_FALSE(config.interactive);
}

TEST_F(CommandLineTest, SetsAreSortedByBytes) {
    ExpectRun({"--plugin-flags=b,B,_,a,\xc3\xa9,b"});
    EXPECT_THAT(options.pluginFlags, ElementsAre("B", "_", "a", "b", "\xc3\xa9"));
}

struct ListCase {
    const char* argument;
    std::list<std::string> items;
};

void PrintTo(const ListCase& value, std::ostream* stream) {
    *stream << ::testing::PrintToString(value.argument);
}

class ListArgumentTest : public CommandLineTest, public ::testing::WithParamInterface<ListCase> {};

TEST_P(ListArgumentTest, IsSplitAtCommasAlone) {
    ExpectRun({std::string("--disable-plugins=") + GetParam().argument});
    EXPECT_EQ(config.disabledPlugins, GetParam().items);
}

INSTANTIATE_TEST_SUITE_P(Arguments, ListArgumentTest,
                         ::testing::Values(ListCase{"a,,b", {"a", "b"}},
                                           ListCase{"a, b", {"a", " b"}}, ListCase{",", {}},
                                           ListCase{"", {}}, ListCase{",,a,,", {"a"}},
                                           ListCase{" ", {" "}},
                                           ListCase{"a.b;c:d|e\tf", {"a.b;c:d|e\tf"}},
                                           ListCase{"\"a,b\"", {"\"a", "b\""}}));

TEST_F(CommandLineTest, TheLastMethodCounts) {
    ExpectRun({"--method=start", "--method", "apply_host_profile"});
    EXPECT_EQ(config.method, "apply_host_profile");
}

TEST_F(CommandLineTest, TheLastPluginDirectoryCounts) {
    ExpectRun({"--plugin-directory=/a", "--plugin-directory=b/c"});
    EXPECT_EQ(options.pluginDirectory, "b/c");
}

TEST_F(CommandLineTest, ADumpWithoutAPathHasNone) {
    ExpectRun({"--dump-dependency-tree"});
    EXPECT_TRUE(options.dump);
    EXPECT_EQ(options.dumpPath, std::nullopt);
}

TEST_F(CommandLineTest, TheDumpPathIsTakenInTheAttachedFormOnly) {
    ExpectRun({"--dump-dependency-tree", "/tmp/g.dot"});
    EXPECT_EQ(options.dumpPath, std::nullopt);
    ExpectRun({"--dump-dependency-tree=/tmp/g.dot"});
    EXPECT_EQ(options.dumpPath, "/tmp/g.dot");
}

TEST_F(CommandLineTest, NonOptionArgumentsAreIgnoredWhateverTheEnvironmentAsksOfTheParser) {
    ASSERT_EQ(setenv("POSIXLY_CORRECT", "1", 1), 0);
    ExpectRun({"word", "--trace"});
    ASSERT_EQ(unsetenv("POSIXLY_CORRECT"), 0);
    EXPECT_TRUE(config.trace);
}

TEST_F(CommandLineTest, NonOptionArgumentsAreIgnored) {
    ExpectRun({"one", "--trace", "two", "--", "--verbose"});
    EXPECT_TRUE(config.trace);
    EXPECT_FALSE(config.verbose);
}

struct SeedCase {
    const char* argument;
    std::int32_t seed;
};

void PrintTo(const SeedCase& value, std::ostream* stream) { *stream << value.argument; }

class GoodSeedTest : public CommandLineTest, public ::testing::WithParamInterface<SeedCase> {};

TEST_P(GoodSeedTest, IsTheSeed) {
    ExpectRun({std::string("--randomize=") + GetParam().argument});
    EXPECT_TRUE(config.randomize);
    EXPECT_EQ(config.seed, GetParam().seed);
}

INSTANTIATE_TEST_SUITE_P(Seeds, GoodSeedTest,
                         ::testing::Values(SeedCase{"42", 42}, SeedCase{"-5", -5},
                                           SeedCase{"+7", 7}, SeedCase{"0", 0}, SeedCase{"-0", 0},
                                           SeedCase{"0042", 42}, SeedCase{"2147483647", 2147483647},
                                           SeedCase{"-2147483648", -2147483647 - 1}));

class BadSeedTest : public CommandLineTest, public ::testing::WithParamInterface<std::string> {};

TEST_P(BadSeedTest, RandomizesWithTheSeedOfBeforeAndPrintsNothing) {
    config.seed = 1234567890;
    ExpectRun({std::string("--randomize=") + GetParam()});
    EXPECT_TRUE(config.randomize);
    EXPECT_EQ(config.seed, 1234567890);
}

INSTANTIATE_TEST_SUITE_P(Seeds, BadSeedTest,
                         ::testing::Values("abc", "", " 1", "1 ", "1x", "0x10", "1.0", "1e3",
                                           "2147483648", "-2147483649", "99999999999999999999", "+",
                                           "-", "+-1", "- 1", "1,000"));

TEST_F(CommandLineTest, ABadSeedLeavesTheTimeOfTheConfigurationsCreation) {
    const std::int32_t created = config.seed;
    ExpectRun({"--randomize=abc"});
    EXPECT_TRUE(config.randomize);
    EXPECT_EQ(config.seed, created);
}

TEST_F(CommandLineTest, ABadSeedKeepsAnEarlierGoodOne) {
    ExpectRun({"--randomize=7", "--randomize=abc", "--randomize"});
    EXPECT_EQ(config.seed, 7);
}

TEST_F(CommandLineTest, TheSeedIsTakenInTheAttachedFormOnly) {
    config.seed = 7;
    ExpectRun({"--randomize", "42"});
    EXPECT_TRUE(config.randomize);
    EXPECT_EQ(config.seed, 7);
}

TEST_F(CommandLineTest, HelpPrintsTheUsageAndEndsWith0) {
    EXPECT_EQ(Parse({"--help"}), 0);
    EXPECT_EQ(output.Text(), UsageText());
    EXPECT_EQ(errors.Text(), "");
}

TEST_F(CommandLineTest, HelpFirstEndsWith0EvenWhenOtherOptionsAreBad) {
    EXPECT_EQ(Parse({"-h", "--nonsense", "--method", "--invoke"}), 0);
    EXPECT_EQ(output.Text(), UsageText());
    EXPECT_EQ(errors.Text(), "");
    EXPECT_FALSE(config.invoke);
}

TEST_F(CommandLineTest, InvokeWithMethodAndPluginRuns) {
    ExpectRun({"--invoke", "--method=start", "--plugin=x"});
    EXPECT_TRUE(config.invoke);
}

class IncompleteInvokeTest : public CommandLineTest,
                             public ::testing::WithParamInterface<std::vector<std::string>> {};

TEST_P(IncompleteInvokeTest, EndsWith1AfterTheErrorAndTheUsage) {
    EXPECT_EQ(Parse(GetParam()), 1);
    EXPECT_EQ(errors.Text(), "invoke requires a method and plugin specified.");
    EXPECT_EQ(output.Text(), UsageText());
}

INSTANTIATE_TEST_SUITE_P(
    CommandLines, IncompleteInvokeTest,
    ::testing::Values(std::vector<std::string>{"--invoke", "--method=start"},
                      std::vector<std::string>{"--invoke", "--plugin=x"},
                      std::vector<std::string>{"--invoke"},
                      std::vector<std::string>{"--invoke", "--method=", "--plugin=x"},
                      std::vector<std::string>{"--invoke", "--method=start", "--plugin=,"}));

TEST_F(CommandLineTest, AMethodWithoutInvokeNeedsNoPlugin) {
    ExpectRun({"--method=start"});
    EXPECT_EQ(config.method, "start");
}

// The C library writes its own words past the C++ streams.
class BadOptionTest : public CommandLineTest,
                      public ::testing::WithParamInterface<std::vector<std::string>> {};

TEST_P(BadOptionTest, EndsWith1AfterTheLibrarysDiagnosticAndOurs) {
    ::testing::internal::CaptureStderr();
    EXPECT_EQ(Parse(GetParam()), 1);
    EXPECT_THAT(::testing::internal::GetCapturedStderr(), ::testing::StartsWith("vantor: "));
    EXPECT_EQ(errors.Text(), "usage: vantor --help for usage information\n");
    EXPECT_EQ(output.Text(), "");
}

INSTANTIATE_TEST_SUITE_P(
    CommandLines, BadOptionTest,
    ::testing::Values(std::vector<std::string>{"--nonsense"}, std::vector<std::string>{"-x"},
                      std::vector<std::string>{"--method"}, std::vector<std::string>{"--plugin"},
                      std::vector<std::string>{"--trace=yes"},
                      std::vector<std::string>{"--trace", "--nonsense", "--help"}));

}  // namespace
}  // namespace vantor
