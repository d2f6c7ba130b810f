#include "model/NearestName.h"

#include <gtest/gtest.h>

#include <string>
#include <vector>

namespace vantor::analyze {
namespace {

std::string Nearest(const std::vector<std::string>& names, const std::string& unknown) {
    return NearestName(names).Find(unknown);
}

TEST(TypingDistanceTest, CountsSlips) {
    EXPECT_EQ(TypingDistance("storage", "storage", 3), 0U);
    EXPECT_EQ(TypingDistance("storag", "storage", 3), 1U);
    EXPECT_EQ(TypingDistance("sttorage", "storage", 3), 1U);
    EXPECT_EQ(TypingDistance("starage", "storage", 3), 1U);
    EXPECT_EQ(TypingDistance("sotrage", "storage", 3), 1U);
    EXPECT_EQ(TypingDistance("sotrag", "storage", 3), 2U);
    EXPECT_EQ(TypingDistance("", "abc", 3), 3U);
}

TEST(TypingDistanceTest, EndsAboveTheLimit) {
    EXPECT_EQ(TypingDistance("abcdefgh", "12345678", 3), 4U);
    EXPECT_EQ(TypingDistance("", "abcdef", 2), 3U);
}

TEST(NearestNameTest, FindsWhatWasMeant) {
    EXPECT_EQ(Nearest({"network", "storage"}, "storag"), "storage");
    EXPECT_EQ(Nearest({"network", "storage"}, "netwrok"), "network");
    EXPECT_EQ(Nearest({"nics", "storage"}, "nisc"), "nics");
}

TEST(NearestNameTest, TakesCaseForNoSlip) {
    EXPECT_EQ(Nearest({"storages", "storage"}, "STORAGE"), "storage");
    EXPECT_EQ(Nearest({"IO"}, "io"), "IO");
}

TEST(NearestNameTest, FindsNothingThatIsFar) {
    EXPECT_EQ(Nearest({"network"}, "storage"), "");
    EXPECT_EQ(Nearest({"b"}, "a"), "");
    EXPECT_EQ(Nearest({"cat"}, "dog"), "");
    EXPECT_EQ(Nearest({}, "storage"), "");
}

TEST(NearestNameTest, FindsNothingForAKnownName) {
    EXPECT_EQ(Nearest({"storage", "storages"}, "storage"), "");
}

TEST(NearestNameTest, TheFirstOfSeveralThatAreEquallyNear) {
    EXPECT_EQ(Nearest({"disk3", "disk1", "disk2"}, "disk4"), "disk1");
}

TEST(NearestNameTest, FindsNothingMoreOnceItsComparisonsAreUsedUp) {
    NearestName names({"storage", "network"}, 100);
    EXPECT_EQ(names.Find("storag"), "storage");
    EXPECT_EQ(names.Find("networ"), "");
}

TEST(NearestNameTest, LeavesLongNamesAlone) {
    EXPECT_EQ(Nearest({std::string(64, 'a')}, std::string(65, 'a')), std::string(64, 'a'));
    EXPECT_EQ(Nearest({std::string(65, 'a')}, std::string(64, 'a')), "");
}

}  // namespace
}  // namespace vantor::analyze
