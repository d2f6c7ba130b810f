// White space and comments, and the "/" that is neither.

#include <gtest/gtest.h>

#include <istream>
#include <sstream>

#include "json/JsonReader.h"
#include "json/JsonText.h"
#include "json/TestBuffers.h"

namespace vantor {

namespace {

using support::Accepted;
using support::BlanksOf;
using support::CountingBuffer;
using support::Failed;
using support::ObjectOf;
using support::StateOf;
using support::ValueOf;

TEST(JsonBlanksTest, EveryWhiteSpaceByteIsSkipped) {
    EXPECT_EQ(BlanksOf(" \t\n\v\f\r x"), Accepted("", "x"));
}

TEST(JsonBlanksTest, NothingIsSkippedWhereNoneStands) {
    EXPECT_EQ(BlanksOf("x "), Accepted("", "x "));
}

TEST(JsonBlanksTest, OtherControlBytesAndHighBytesAreNotWhiteSpace) {
    for (const char byte : {'\0', '\x01', '\x08', '\x0e', '\x1f', '\x7f', '\x85', '\xa0', '\xff'}) {
        const std::string rest(1, byte);
        EXPECT_EQ(BlanksOf(" " + rest), Accepted("", rest));
    }
}

TEST(JsonBlanksTest, EndOfInputAfterBlanksIsNoFailure) {
    for (const std::string text : {"", " \n", "/* c */", "// c\n"}) {
        std::istringstream stream(text);
        SkipBlanks(stream);
        EXPECT_EQ(StateOf(stream), "read") << text;
        EXPECT_TRUE(stream.eof()) << text;
    }
}

TEST(JsonBlanksTest, BlockCommentEndsAtTheFirstStarSlash) {
    EXPECT_EQ(BlanksOf("/* a */x */"), Accepted("", "x */"));
    EXPECT_EQ(BlanksOf("/**/x"), Accepted("", "x"));
    EXPECT_EQ(BlanksOf("/***/x"), Accepted("", "x"));
    EXPECT_EQ(BlanksOf("/* ** / * /\n**/x"), Accepted("", "x"));
}

TEST(JsonBlanksTest, BlockCommentsDoNotNest) {
    EXPECT_EQ(BlanksOf("/* /* */x */"), Accepted("", "x */"));
    EXPECT_EQ(BlanksOf("/* // */x\n"), Accepted("", "x\n"));
}

// The star that opens a block comment is the first byte of it that may end it.
TEST(JsonBlanksTest, SlashStarSlashIsAWholeComment) {
    EXPECT_EQ(BlanksOf("/*/x"), Accepted("", "x"));
    EXPECT_EQ(BlanksOf("/*/ /**/x"), Accepted("", "x"));
    EXPECT_EQ(ValueOf("[1/*/, 2]"), Accepted("[1, 2]"));
}

TEST(JsonBlanksTest, UnendedBlockCommentFails) {
    EXPECT_EQ(BlanksOf("/*"), Failed(""));
    EXPECT_EQ(BlanksOf("/* a"), Failed(""));
    EXPECT_EQ(BlanksOf("/* a *"), Failed(""));
    EXPECT_EQ(BlanksOf("/* a * /"), Failed(""));
}

TEST(JsonBlanksTest, LineCommentEndsWithItsLineFeed) {
    EXPECT_EQ(BlanksOf("// a\nx"), Accepted("", "x"));
    EXPECT_EQ(BlanksOf("//\nx"), Accepted("", "x"));
    EXPECT_EQ(BlanksOf("/// */ /* a\nx"), Accepted("", "x"));
}

TEST(JsonBlanksTest, CarriageReturnEndsNoLineComment) {
    EXPECT_EQ(BlanksOf("// a\rb\r\nx"), Accepted("", "x"));
}

TEST(JsonBlanksTest, LineCommentWithoutLineFeedFails) {
    EXPECT_EQ(BlanksOf("//"), Failed(""));
    EXPECT_EQ(BlanksOf("// a"), Failed(""));
}

TEST(JsonBlanksTest, CommentsAndWhiteSpaceMixFreely) {
    EXPECT_EQ(BlanksOf(" /* a *//* b */\n\t// c\n // d\n/**/ x"), Accepted("", "x"));
}

TEST(JsonBlanksTest, CommentsHoldAnyByte) {
    const std::string odd("\0\x01\x80\xff\"\\[{", 8);
    EXPECT_EQ(BlanksOf("/*" + odd + "*///" + odd + "\nx"), Accepted("", "x"));
}

TEST(JsonBlanksTest, BlanksMayStandAroundEveryToken) {
    EXPECT_EQ(
        ValueOf("/*a*/ { /*b*/ \"k\" /*c*/ : /*d*/ [ /*e*/ 1 /*f*/ , /*g*/ 2 /*h*/ ] //i\n }j"),
        Accepted("{\"k\": [1, 2]}", "j"));
}

TEST(JsonBlanksTest, BlockAndLineCommentBetweenMembers) {
    EXPECT_EQ(ValueOf("{\"a\": 1 /* c */ , // c\n\"b\": true}"),
              Accepted("{\"a\": 1, \"b\": true}"));
}

TEST(JsonBlanksTest, CommentSignsInsideAStringAreText) {
    EXPECT_EQ(ValueOf(R"(["// a", "/* b */"])"), Accepted(R"(["// a", "/* b */"])"));
}

TEST(JsonBlanksTest, CommentMayFollowANumberAtOnce) {
    EXPECT_EQ(ValueOf("[1/**/,2// two\n]"), Accepted("[1, 2]"));
}

TEST(JsonBlanksTest, NoCommentMaySplitALiteral) {
    EXPECT_EQ(ValueOf("[nu/**/ll]"), Failed("none", "*/ll]"));
}

TEST(JsonBlanksTest, UnendedCommentInsideAnObjectKeepsWhatWasRead) {
    EXPECT_EQ(ObjectOf("{\"a\": 1, /* b"), Failed("{\"a\": 1}"));
    EXPECT_EQ(ObjectOf("{\"a\" // b"), Failed("{}"));
}

// A "/" that begins no comment is taken and put back without end: only what the buffer does ends
// the read.
class JsonLoneSlashTest : public ::testing::TestWithParam<const char*> {};

TEST_P(JsonLoneSlashTest, IsMetAgainAndAgain) {
    constexpr std::uint64_t limit = 10000;
    const std::string text = GetParam();
    const std::size_t slash = text.find('/');
    CountingBuffer buffer(text, limit);
    std::istream stream(&buffer);
    JsonValue value;
    ReadValue(stream, value);

    EXPECT_EQ(buffer.Operations(), limit);
    EXPECT_EQ(StateOf(stream), "bad");
    EXPECT_EQ(value.kind, JsonKind::None);
    EXPECT_GE(buffer.Position(), slash);
    EXPECT_LE(buffer.Position(), slash + 1);
}

INSTANTIATE_TEST_SUITE_P(WhereBlanksMayStand, JsonLoneSlashTest,
                         ::testing::Values("/", " / 1", "/x", "[/]", "[1 / 2]", "{/}",
                                           "{\"a\" / 1}", "{\"a\": / 1}", "{\"a\": 1 / }",
                                           "[1, / * */ 2]"));

TEST(JsonBlanksTest, SlashWhereNoBlankMayStandIsAnOrdinaryByte) {
    EXPECT_EQ(ValueOf("[tru/]"), Failed("none"));
    EXPECT_EQ(ValueOf("[nul/]"), Failed("none", "]"));
    EXPECT_EQ(ValueOf("[\"/\"]"), Accepted("[\"/\"]"));
    EXPECT_EQ(ValueOf("[]/"), Accepted("[]", "/"));
}

}  // namespace

}  // namespace vantor
