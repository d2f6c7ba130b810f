#include "driver/RunConfig.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <ctime>
#include <list>
#include <string>
#include <thread>
#include <vector>

namespace vantor {
namespace {

using ::testing::IsEmpty;

// The one instance as its first caller finds it, looked at before any test can change it.
struct Initial {
    std::time_t before = std::time(nullptr);
    bool verbose = RunConfig::Instance().verbose;
    bool parallel = RunConfig::Instance().parallel;
    bool randomize = RunConfig::Instance().randomize;
    bool interactive = RunConfig::Instance().interactive;
    bool trace = RunConfig::Instance().trace;
    std::int32_t threads = RunConfig::Instance().threads;
    std::int32_t seed = RunConfig::Instance().seed;
    std::string pluginDirectory = RunConfig::Instance().pluginDirectory.string();
    std::list<std::string> disabledPlugins = RunConfig::Instance().disabledPlugins;
    std::list<std::string> interactiveModeRequires = RunConfig::Instance().interactiveModeRequires;
    std::string method = RunConfig::Instance().method;
    bool invoke = RunConfig::Instance().invoke;
    std::time_t after = std::time(nullptr);
};
const Initial initial;

TEST(RunConfigTest, EveryFlagIsOffAtFirst) {
    EXPECT_FALSE(initial.verbose);
    EXPECT_FALSE(initial.parallel);
    EXPECT_FALSE(initial.randomize);
    EXPECT_FALSE(initial.interactive);
    EXPECT_FALSE(initial.trace);
    EXPECT_FALSE(initial.invoke);
}

TEST(RunConfigTest, EveryTextAndListIsEmptyAtFirst) {
    EXPECT_EQ(initial.pluginDirectory, "");
    EXPECT_EQ(initial.method, "");
    EXPECT_THAT(initial.disabledPlugins, IsEmpty());
    EXPECT_THAT(initial.interactiveModeRequires, IsEmpty());
}

TEST(RunConfigTest, ThereAre8ThreadsAtFirst) { EXPECT_EQ(initial.threads, 8); }

TEST(RunConfigTest, TheSeedIsTheTimeOfTheCreation) {
    EXPECT_GE(initial.seed, static_cast<std::int32_t>(initial.before));
    EXPECT_LE(initial.seed, static_cast<std::int32_t>(initial.after));
}

TEST(RunConfigTest, EveryCallerHasTheSameInstance) {
    RunConfig* const instance = &RunConfig::Instance();
    std::vector<const RunConfig*> seen(8);
    std::vector<std::thread> callers;
    for (const RunConfig*& found : seen) {
        callers.emplace_back([&found] { found = &RunConfig::Instance(); });
    }
    for (std::thread& caller : callers) {
        caller.join();
    }
    EXPECT_THAT(seen, ::testing::Each(instance));
}

}  // namespace
}  // namespace vantor
