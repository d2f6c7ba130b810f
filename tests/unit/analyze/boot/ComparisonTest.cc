// What differs between two sets of boots, and what is noise.

#include "boot/Comparison.h"

#include <gmock/gmock.h>
#include <gtest/gtest.h>

#include <cmath>

#include "analyze/boot/BootText.h"

namespace vantor::analyze {
namespace {

using support::BootText;
using testing::ElementsAre;
using testing::IsEmpty;

constexpr NoiseRule rule{5, 0.1};

std::vector<std::string> NamesOf(const std::vector<PluginChange>& changes) {
    std::vector<std::string> names;
    for (const PluginChange& change : changes) {
        names.push_back(change.name);
    }
    return names;
}

Comparison Compare(const BootText& before, const BootText& after) {
    return CompareBoots({before.log}, {after.log}, rule);
}

TEST(ComparisonTest, WithOneValueASideTheMarginIsNoise) {
    EXPECT_FALSE(CompareValues({1000}, {1100}, rule).IsSlower());
    EXPECT_TRUE(CompareValues({1000}, {1101}, rule).IsSlower());
    EXPECT_FALSE(CompareValues({1000}, {900}, rule).IsFaster());
    EXPECT_TRUE(CompareValues({1000}, {899}, rule).IsFaster());
}

TEST(ComparisonTest, TheLeastDifferenceIsNoiseHoweverSmallTheValues) {
    EXPECT_FALSE(CompareValues({1}, {6}, rule).IsSlower());
    EXPECT_TRUE(CompareValues({1}, {7}, rule).IsSlower());
}

TEST(ComparisonTest, WithSeveralValuesTheGreaterSpreadIsNoise) {
    const Change change = CompareValues({100, 110, 105}, {150, 120, 130}, rule);
    EXPECT_EQ(change.before, 105);
    EXPECT_EQ(change.after, 130);
    EXPECT_EQ(change.beforeSpread, 10);
    EXPECT_EQ(change.afterSpread, 30);
    EXPECT_EQ(change.noise, 30);
    EXPECT_FALSE(change.IsSlower());
    EXPECT_TRUE(CompareValues({100, 110, 105}, {150, 140, 145}, rule).IsSlower());
}

TEST(ComparisonTest, WithSeveralValuesTheMarginIsNone) {
    EXPECT_TRUE(CompareValues({1000, 1000}, {1006, 1006}, rule).IsSlower());
}

TEST(ComparisonTest, OneOutlierDoesNotMoveTheMedian) {
    EXPECT_EQ(CompareValues({10, 10, 9000}, {10, 10, 10}, rule).before, 10);
    EXPECT_EQ(CompareValues({10, 20}, {10, 10}, rule).before, 15);
}

TEST(ComparisonTest, GrowthIsInPartsOfTheOldValue) {
    EXPECT_DOUBLE_EQ(CompareValues({100}, {150}, rule).Growth(), 0.5);
    EXPECT_DOUBLE_EQ(CompareValues({0}, {0}, rule).Growth(), 0.0);
    EXPECT_TRUE(std::isinf(CompareValues({0}, {1}, rule).Growth()));
}

TEST(ComparisonTest, ChangesStandWithTheGreatestFirst) {
    const Comparison comparison =
        Compare(BootText({"a 0 100", "b 0 100", "c 0 100", "d 0 100", "same 0 100"}),
                BootText({"a 0 120", "b 0 200", "c 0 60", "d 0 20", "same 0 105"}));
    EXPECT_THAT(NamesOf(comparison.slower), ElementsAre("b", "a"));
    EXPECT_THAT(NamesOf(comparison.faster), ElementsAre("d", "c"));
    EXPECT_EQ(comparison.unchanged, 1U);
}

TEST(ComparisonTest, PluginsOfOneSideAloneAreAddedOrRemoved) {
    const Comparison comparison =
        Compare(BootText({"old 0 1", "both 0 1"}), BootText({"both 0 1", "new 0 1"}));
    EXPECT_THAT(comparison.added, ElementsAre("new"));
    EXPECT_THAT(comparison.removed, ElementsAre("old"));
    EXPECT_THAT(comparison.nowRun, IsEmpty());
    EXPECT_THAT(comparison.noLongerRun, IsEmpty());
}

TEST(ComparisonTest, WhatIsListedWithoutARunIsNeitherAddedNorRemoved) {
    const Comparison comparison =
        Compare(BootText({"a idle", "b 0 1", "c idle"}), BootText({"a 0 1", "b idle", "c idle"}));
    EXPECT_THAT(comparison.nowRun, ElementsAre("a"));
    EXPECT_THAT(comparison.noLongerRun, ElementsAre("b"));
    EXPECT_THAT(comparison.added, IsEmpty());
    EXPECT_THAT(comparison.removed, IsEmpty());
}

TEST(ComparisonTest, WhatCameOrWentWithoutARunIsAddedOrRemovedToo) {
    const Comparison comparison =
        Compare(BootText({"a 0 1", "old idle"}), BootText({"a 0 1", "new idle"}));
    EXPECT_THAT(comparison.added, ElementsAre("new"));
    EXPECT_THAT(comparison.removed, ElementsAre("old"));
}

TEST(ComparisonTest, TwinsAreComparedInTheirOrder) {
    const Comparison comparison =
        Compare(BootText({"t 0 10", "t 0 100"}), BootText({"t 0 10", "t 0 500"}));
    EXPECT_THAT(NamesOf(comparison.slower), ElementsAre("t (2)"));
}

TEST(ComparisonTest, TheTotalIsThatOfTheWholeRun) {
    const Comparison comparison = Compare(BootText({"a 40 100"}), BootText({"a 70 130"}));
    EXPECT_EQ(comparison.total.before, 100);
    EXPECT_EQ(comparison.total.after, 130);
    EXPECT_TRUE(comparison.total.IsSlower());
    EXPECT_EQ(comparison.unchanged, 1U);
}

TEST(ComparisonTest, TheMedianBootIsTheOneOfTheMedianTotal) {
    const BootLog small = BootText({"a 0 10"}).log;
    const BootLog middle = BootText({"a 0 20"}).log;
    const BootLog large = BootText({"a 0 30"}).log;
    EXPECT_EQ(MedianBoot({large, small, middle}), 2U);
    EXPECT_EQ(MedianBoot({large, small}), 1U);
    EXPECT_EQ(MedianBoot({large}), 0U);
}

}  // namespace
}  // namespace vantor::analyze
