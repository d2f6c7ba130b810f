#include "basekit/BoundedText.h"

#include <gtest/gtest.h>

namespace BaseKit::impl {

namespace {

TEST(BoundedTextTest, KeepsAllUpToBothLimits) {
    BoundedText text(3, 4);
    text.Append("abcdefg");
    EXPECT_EQ(text.Text(), "abcdefg");
    EXPECT_EQ(text.LeftOut(), 0U);
}

TEST(BoundedTextTest, LeavesOutTheMiddleOfMore) {
    BoundedText text(3, 4);
    text.Append("abcdefgh");
    EXPECT_EQ(text.Text(), "abc\n[1 bytes left out]\nefgh");
    EXPECT_EQ(text.LeftOut(), 1U);
}

// The same text in pieces of every size is the same text.
TEST(BoundedTextTest, TheSizeOfThePiecesDoesNotMatter) {
    const std::string whole = "abcdefghijklmnopqrstuvwxyz";
    for (std::size_t piece = 1; piece <= whole.size(); ++piece) {
        BoundedText text(3, 4);
        for (std::size_t at = 0; at < whole.size(); at += piece) {
            text.Append(std::string_view(whole).substr(at, piece));
        }
        EXPECT_EQ(text.Text(), "abc\n[19 bytes left out]\nwxyz") << "pieces of " << piece;
        EXPECT_EQ(text.LeftOut(), 19U) << "pieces of " << piece;
    }
}

TEST(BoundedTextTest, WithoutATailKeepsOnlyTheBeginning) {
    BoundedText text(3, 0);
    text.Append("ab");
    text.Append("cd");
    text.Append("e");
    EXPECT_EQ(text.Text(), "abc\n[2 bytes left out]\n");
    EXPECT_EQ(text.LeftOut(), 2U);
}

}  // namespace

}  // namespace BaseKit::impl
