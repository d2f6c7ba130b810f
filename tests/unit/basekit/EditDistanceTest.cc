#include "basekit/EditDistance.h"

#include <gtest/gtest.h>

#include <string>

namespace BaseKit::impl {

namespace {

struct Pair {
    const char* from;
    const char* to;
    std::size_t distance;
};

TEST(EditDistanceTest, CountsWhatIsPutInTakenOutAndReplaced) {
    const Pair pairs[] = {
        {"", "", 0},
        {"", "abc", 3},
        {"abc", "", 3},
        {"set", "set", 0},
        {"set", "get", 1},
        {"set", "sets", 1},
        {"reset", "set", 2},
        {"refresh", "refersh", 2},
        {"network set", "netwrk get", 2},
        {"kitten", "sitting", 3},
    };
    for (const Pair& pair : pairs) {
        EXPECT_EQ(EditDistance(pair.from, pair.to), pair.distance) << pair.from << " " << pair.to;
        EXPECT_EQ(EditDistance(pair.to, pair.from), pair.distance) << pair.to << " " << pair.from;
    }
}

// A command line of any length must not make the search for the nearest command long.
TEST(EditDistanceTest, LooksAtNoMoreThan256Characters) {
    EXPECT_EQ(EditDistance(std::string(256, 'a'), std::string(10000000, 'a')), 0U);
    EXPECT_EQ(EditDistance(std::string(10000000, 'a'), ""), 256U);
}

}  // namespace

}  // namespace BaseKit::impl
