#include "plugins/Plugin.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include "graph/InitBarrier.h"
#include "plugins/FakePlugin.h"
#include "plugins/TestObjects.h"
#include "support/HostCalls.h"
#include "support/RunConfigReset.h"

namespace vantor {
namespace {

using support::FakePlugin;
using support::NamesOf;
using ::testing::ElementsAre;
using ::testing::IsEmpty;

class PluginTest : public ::testing::Test {
protected:
    PluginTest() { support::ResetRunConfig(); }

    // Runs the plugin from `begin` to `end` and returns how long it believes to have run.
    std::int64_t ElapsedBetween(const timeval& begin, const timeval& end) {
        calls.times = {begin, end};
        plugin.Run();
        return plugin.ElapsedMicroseconds();
    }

    support::HostCalls calls;
    FakePlugin plugin{"disk"};
};

TEST_F(PluginTest, HasTheNameThatItWasGiven) { EXPECT_EQ(plugin.Name(), "disk"); }

TEST_F(PluginTest, ApiVersionIsMinusOneUntilItsKindSetsIt) { EXPECT_EQ(plugin.ApiVersion(), -1); }

TEST_F(PluginTest, DescriptionIsEmptyAtFirst) {
    EXPECT_FALSE(plugin.RunOnce());
    EXPECT_EQ(plugin.PluginVersion(), "");
    EXPECT_THAT(plugin.RequiredFlags(), IsEmpty());
    EXPECT_THAT(plugin.DisablingFlags(), IsEmpty());
}

TEST_F(PluginTest, IsIdleAndWithoutEdgesAtFirst) {
    EXPECT_EQ(plugin.State(), NodeState::Idle);
    EXPECT_THAT(NamesOf(plugin.Dependencies()), IsEmpty());
    EXPECT_THAT(NamesOf(plugin.Dependents()), IsEmpty());
}

TEST_F(PluginTest, DotAttributesAreEmpty) { EXPECT_EQ(plugin.DotAttributes(), ""); }

TEST_F(PluginTest, NeverRunHasZeroTimesAndNoElapsedTime) {
    EXPECT_EQ(plugin.StartTime().tv_sec, 0);
    EXPECT_EQ(plugin.StartTime().tv_usec, 0);
    EXPECT_EQ(plugin.EndTime().tv_sec, 0);
    EXPECT_EQ(plugin.EndTime().tv_usec, 0);
    EXPECT_EQ(plugin.ElapsedMicroseconds(), 0);
}

TEST_F(PluginTest, ProvidesBarriersInOrder) {
    plugin.Provide({"plugin-give-b", "plugin-give-a"});
    EXPECT_THAT(NamesOf(plugin.Dependents()), ElementsAre("plugin-give-b", "plugin-give-a"));
    EXPECT_THAT(NamesOf(InitBarrier::Get("plugin-give-a")->Dependencies()), ElementsAre("disk"));
}

TEST_F(PluginTest, RequiresBarriersInOrder) {
    plugin.Require({"plugin-need-b", "plugin-need-a"});
    EXPECT_THAT(NamesOf(plugin.Dependencies()), ElementsAre("plugin-need-b", "plugin-need-a"));
    EXPECT_THAT(NamesOf(InitBarrier::Get("plugin-need-b")->Dependents()), ElementsAre("disk"));
}

TEST_F(PluginTest, ABarrierNamedTwiceIsLinkedTwice) {
    plugin.Require({"plugin-twice", "plugin-twice"});
    EXPECT_THAT(NamesOf(plugin.Dependencies()), ElementsAre("plugin-twice", "plugin-twice"));
}

TEST_F(PluginTest, ElapsedTimeCountsMicroseconds) {
    EXPECT_EQ(ElapsedBetween({100, 250}, {101, 251}), 1000001);
}

TEST_F(PluginTest, ElapsedTimeBorrowsFromTheSeconds) {
    EXPECT_EQ(ElapsedBetween({100, 999999}, {101, 1}), 2);
}

TEST_F(PluginTest, ElapsedTimeIsNegativeWhenTheClockWasSetBack) {
    EXPECT_EQ(ElapsedBetween({100, 0}, {99, 500000}), -500000);
}

TEST_F(PluginTest, ElapsedTimeReachesTheLargestSigned32BitNumber) {
    EXPECT_EQ(ElapsedBetween({1700000000, 0}, {1700002147, 483647}), 2147483647);
}

TEST_F(PluginTest, ElapsedTimeWrapsOneMicrosecondLater) {
    EXPECT_EQ(ElapsedBetween({1700000000, 0}, {1700002147, 483648}), -2147483648LL);
}

TEST_F(PluginTest, ElapsedTimeOfAnHourHasWrapped) {
    EXPECT_EQ(ElapsedBetween({1700000000, 0}, {1700003600, 0}), 3600000000LL - 4294967296LL);
}

}  // namespace
}  // namespace vantor
