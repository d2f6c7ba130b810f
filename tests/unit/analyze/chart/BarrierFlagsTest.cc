#include "chart/BarrierFlags.h"

#include <gtest/gtest.h>

#include <random>
#include <vector>

namespace vantor::analyze {
namespace {

Flag MakeFlag(double x, double width, bool first = false) {
    Flag flag;
    flag.x = x;
    flag.width = width;
    flag.first = first;
    return flag;
}

std::vector<int> Levels(std::vector<Flag> flags, int levels = 3, double right = 1000) {
    PlaceFlags(flags, levels, right);
    std::vector<int> placed;
    for (const Flag& flag : flags) {
        placed.push_back(flag.level);
    }
    return placed;
}

TEST(PlaceFlagsTest, PutsFlagsWithRoomOnTheHighestLevel) {
    EXPECT_EQ(Levels({MakeFlag(0, 50), MakeFlag(60, 50)}), (std::vector<int>{2, 2}));
}

TEST(PlaceFlagsTest, PutsAFlagBeneathTheOneThatItWouldReach) {
    EXPECT_EQ(Levels({MakeFlag(0, 50), MakeFlag(20, 50), MakeFlag(40, 50)}),
              (std::vector<int>{2, 1, 0}));
}

TEST(PlaceFlagsTest, LeavesOutWhatHasNoRoom) {
    EXPECT_EQ(Levels({MakeFlag(0, 50), MakeFlag(20, 50)}, 1), (std::vector<int>{0, Flag::noLevel}));
    EXPECT_EQ(Levels({MakeFlag(980, 50)}), (std::vector<int>{Flag::noLevel}));
}

TEST(PlaceFlagsTest, PlacesTheFirstOnesFirst) {
    EXPECT_EQ(Levels({MakeFlag(0, 50), MakeFlag(20, 50, true)}, 1),
              (std::vector<int>{Flag::noLevel, 0}));
}

// Whatever is given: labels of a level do not overlap, and no pole goes through a label below it.
TEST(PlaceFlagsTest, NeverLetsLabelsOrPolesMeet) {
    std::mt19937 random(7);
    std::uniform_real_distribution<double> place(0, 900);
    std::uniform_real_distribution<double> length(10, 150);
    std::vector<Flag> flags;
    for (int i = 0; i < 300; ++i) {
        flags.push_back(MakeFlag(place(random), length(random), i % 10 == 0));
    }
    PlaceFlags(flags, 3, 1000);
    int placed = 0;
    for (const Flag& one : flags) {
        placed += one.level == Flag::noLevel ? 0 : 1;
        for (const Flag& other : flags) {
            if (&one == &other || one.level == Flag::noLevel || other.level == Flag::noLevel) {
                continue;
            }
            const bool within = one.x > other.x && one.x < other.x + other.width;
            EXPECT_FALSE(one.level >= other.level && within);
        }
    }
    EXPECT_GE(placed, 10);
}

}  // namespace
}  // namespace vantor::analyze
