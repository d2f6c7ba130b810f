#include "chart/TimeAxis.h"

#include <gtest/gtest.h>

#include <limits>
#include <string>
#include <vector>

namespace vantor::analyze {
namespace {

std::vector<std::string> Labels(Microseconds first, Microseconds last) {
    std::vector<std::string> labels;
    for (const Tick& tick : TimeAxis(first, last, 0, 100).Ticks(7)) {
        labels.push_back(tick.label);
    }
    return labels;
}

TEST(TimeAxisTest, MapsMomentsToThePlaceBetweenItsEnds) {
    const TimeAxis axis(0, 200, 10, 110);
    EXPECT_DOUBLE_EQ(axis.X(0), 10);
    EXPECT_DOUBLE_EQ(axis.X(50), 35);
    EXPECT_DOUBLE_EQ(axis.X(200), 110);
}

TEST(TimeAxisTest, DrawsMomentsBeyondItsEndsAtThem) {
    const TimeAxis axis(0, 200, 10, 110);
    EXPECT_DOUBLE_EQ(axis.X(-5), 10);
    EXPECT_DOUBLE_EQ(axis.X(std::numeric_limits<Microseconds>::max()), 110);
    EXPECT_TRUE(axis.IsBeyond(201));
    EXPECT_FALSE(axis.IsBeyond(200));
}

TEST(TimeAxisTest, MapsEverythingToItsLeftEndWhenItHasNoLength) {
    const TimeAxis axis(5, 5, 10, 110);
    EXPECT_DOUBLE_EQ(axis.X(5), 10);
    EXPECT_DOUBLE_EQ(axis.X(99), 10);
    EXPECT_EQ(axis.Ticks(7).size(), 1U);
}

TEST(TimeAxisTest, ShowsARunWithoutLength) {
    const Span span = TimeAxis(0, 200, 10, 110).Between(50, 50, 1.5);
    EXPECT_DOUBLE_EQ(span.x, 35);
    EXPECT_DOUBLE_EQ(span.width, 1.5);
}

TEST(TimeAxisTest, KeepsARunAtItsEndInside) {
    const Span span = TimeAxis(0, 200, 10, 110).Between(200, 200, 1.5);
    EXPECT_DOUBLE_EQ(span.x + span.width, 110);
    EXPECT_DOUBLE_EQ(span.width, 1.5);
}

TEST(TimeAxisTest, GivesTheWrongWayRoundNoNegativeWidth) {
    const Span span = TimeAxis(0, 200, 10, 110).Between(150, 20, 1.5);
    EXPECT_DOUBLE_EQ(span.x, 85);
    EXPECT_DOUBLE_EQ(span.width, 1.5);
}

TEST(TimeAxisTest, HasTicksAtRoundTimes) {
    using Texts = std::vector<std::string>;
    EXPECT_EQ(Labels(0, 23), (Texts{"0", "5 µs", "10 µs", "15 µs", "20 µs"}));
    EXPECT_EQ(Labels(0, 60000), (Texts{"0", "10 ms", "20 ms", "30 ms", "40 ms", "50 ms", "60 ms"}));
    EXPECT_EQ(Labels(7100000, 7350000),
              (Texts{"7100 ms", "7150 ms", "7200 ms", "7250 ms", "7300 ms", "7350 ms"}));
    EXPECT_EQ(Labels(0, 95000000), (Texts{"0", "20 s", "40 s", "60 s", "80 s"}));
    EXPECT_EQ(Labels(-3600000000, 7200000000),
              (Texts{"-60 min", "-30 min", "0", "30 min", "60 min", "90 min", "120 min"}));
}

TEST(TimeAxisTest, HasFewTicksInsideItselfHoweverLongItIs) {
    for (Microseconds length = 1; length < std::numeric_limits<Microseconds>::max() / 7;
         length *= 7) {
        for (const Microseconds first : {Microseconds{0}, -length, length}) {
            const TimeAxis axis(first, first + length, 10, 110);
            const std::vector<Tick> ticks = axis.Ticks(7);
            EXPECT_LE(ticks.size(), 7U) << length;
            for (const Tick& tick : ticks) {
                EXPECT_GE(tick.x, 10 - 1e-6);
                EXPECT_LE(tick.x, 110 + 1e-6);
            }
        }
    }
}

}  // namespace
}  // namespace vantor::analyze
